#include "CallLimit.h"

#include <map>
#include <memory>
#include <mutex>
#include <string>

namespace kiv
{
namespace
{

/// The waiting calls on all connections of the process. Never destroyed, since the threads that read the connections may outlive
/// it.
struct Waiting
{
    std::mutex mutex;
    std::map<std::string, unsigned> calls; ///< number by the caller's unique name; without zeros
};

Waiting& AllWaiting()
{
    static Waiting* const waiting = new Waiting;
    return *waiting;
}

void GiveUpPlace(gpointer sender)
{
    const std::unique_ptr<char, decltype(&g_free)> owner(static_cast<char*>(sender), g_free);
    Waiting& waiting = AllWaiting();
    const std::lock_guard<std::mutex> lock(waiting.mutex);
    const auto count = waiting.calls.find(owner.get());
    if (--count->second == 0)
        waiting.calls.erase(count);
}

/// Counts the call while its message lives, which is until the call is answered.
bool TakePlace(GDBusMessage* call)
{
    const char* const sender = g_dbus_message_get_sender(call);
    Waiting& waiting = AllWaiting();
    const std::lock_guard<std::mutex> lock(waiting.mutex);
    unsigned& count = waiting.calls[sender];
    if (count == CallLimit::kMostWaiting)
        return false;
    ++count;
    g_object_set_data_full(G_OBJECT(call), "kiv-place", g_strdup(sender), GiveUpPlace);
    return true;
}

void Refuse(GDBusConnection* connection, GDBusMessage* call, const char* reason)
{
    if ((g_dbus_message_get_flags(call) & G_DBUS_MESSAGE_FLAGS_NO_REPLY_EXPECTED) != 0)
        return;
    g_autoptr(GDBusMessage) reply =
        g_dbus_message_new_method_error_literal(call, "org.freedesktop.DBus.Error.LimitsExceeded", reason);
    g_dbus_connection_send_message(connection, reply, G_DBUS_SEND_MESSAGE_FLAGS_NONE, nullptr, nullptr);
}

/// Runs in the thread that reads the connection.
GDBusMessage* Filter(GDBusConnection* connection, GDBusMessage* message, gboolean isIncoming, gpointer)
{
    if (isIncoming == FALSE || g_dbus_message_get_message_type(message) != G_DBUS_MESSAGE_TYPE_METHOD_CALL)
        return message;
    GVariant* const body = g_dbus_message_get_body(message);
    if (body != nullptr && g_variant_get_size(body) > CallLimit::kMostBytes)
        Refuse(connection, message, "the arguments are too long");
    else if (!TakePlace(message))
        Refuse(connection, message, "too many calls of this caller are waiting");
    else
        return message;
    g_object_unref(message);
    return nullptr;
}

} // namespace

CallLimit::CallLimit(GDBusConnection* connection)
    : connection_(connection), filter_(g_dbus_connection_add_filter(connection, Filter, nullptr, nullptr))
{
}

CallLimit::~CallLimit()
{
    g_dbus_connection_remove_filter(connection_, filter_);
}

} // namespace kiv
