#include "support/BusMonitor.h"

#include <chrono>
#include <condition_variable>
#include <stdexcept>

namespace kiv::test
{

namespace
{

constexpr char kMarker[] = "org.example.Marker";

/// The messages that the monitor saw. It is global, since GLib's thread may still be in the filter when the monitor is gone.
struct
{
    std::mutex mutex;
    std::condition_variable changed;
    std::list<std::string> lines;
} seen;

/// Takes the next message, as a line.
std::string Next()
{
    std::unique_lock<std::mutex> lock(seen.mutex);
    if (!seen.changed.wait_for(lock, std::chrono::seconds(30), [] { return !seen.lines.empty(); }))
        throw std::runtime_error("the monitor sees no more messages");
    const std::string line = seen.lines.front();
    seen.lines.pop_front();
    return line;
}

std::string Line(GDBusMessage* message)
{
    std::string line =
        std::to_string(g_dbus_message_get_message_type(message)) + ' ' + std::to_string(g_dbus_message_get_flags(message));
    for (const char* const field :
        {g_dbus_message_get_sender(message), g_dbus_message_get_destination(message), g_dbus_message_get_path(message),
            g_dbus_message_get_interface(message), g_dbus_message_get_member(message), g_dbus_message_get_error_name(message)})
        line.append(" ").append(field == nullptr ? "-" : field);
    if (GVariant* const body = g_dbus_message_get_body(message))
    {
        const g_autofree char* text = g_variant_print(body, TRUE);
        line.append(" ").append(text);
    }
    return line;
}

} // namespace

BusMonitor::BusMonitor(const PrivateBus& bus, GDBusConnection* shared) : shared_(shared), watching_(bus.Connect())
{
    g_dbus_connection_add_filter(watching_.get(), Filter, nullptr, nullptr);
    g_autoptr(GError) error = nullptr;
    g_autoptr(GVariant) reply = g_dbus_connection_call_sync(watching_.get(), "org.freedesktop.DBus", "/org/freedesktop/DBus",
        "org.freedesktop.DBus.Monitoring", "BecomeMonitor", g_variant_new("(asu)", nullptr, 0U), nullptr, G_DBUS_CALL_FLAGS_NONE,
        -1, nullptr, &error);
    if (reply == nullptr)
        throw std::runtime_error(error->message);
    During([] {}); // forgets what another monitor saw
}

BusMonitor::~BusMonitor()
{
    g_dbus_connection_close_sync(watching_.get(), nullptr, nullptr);
}

/// Runs on the thread that reads the connection. A monitor must not answer messages, so GDBus receives only the reply to its own
/// call.
GDBusMessage* BusMonitor::Filter(GDBusConnection* connection, GDBusMessage* message, gboolean incoming, gpointer)
{
    const char* const destination = g_dbus_message_get_destination(message);
    if (incoming == FALSE || g_strcmp0(destination, g_dbus_connection_get_unique_name(connection)) == 0)
        return message;
    const std::lock_guard<std::mutex> lock(seen.mutex);
    seen.lines.push_back(Line(message));
    seen.changed.notify_all();
    g_object_unref(message);
    return nullptr;
}

std::vector<std::string> BusMonitor::Until(const std::string& text)
{
    std::vector<std::string> lines;
    for (std::string line = Next(); line.find(text) == line.npos; line = Next())
        lines.push_back(line);
    return lines;
}

std::vector<std::string> BusMonitor::During(const std::function<void()>& operation)
{
    const auto mark = [this] // when the monitor sees the marker, it has seen everything sent before
    {
        g_dbus_connection_emit_signal(shared_, nullptr, "/", kMarker, "Marker", nullptr, nullptr);
        return Until(kMarker);
    };
    mark();
    operation();
    return mark();
}

} // namespace kiv::test
