#include "support/Peer.h"

namespace kiv::test
{

namespace
{

/// Guards the state of all peers. It is global, because GLib passes a peer's objects to the reading thread, and ThreadSanitizer
/// does not see GLib's locks.
std::mutex mutex;

std::string Describe(GDBusMessage* message)
{
    GVariant* const body = g_dbus_message_get_body(message);
    g_autofree gchar* values = body == nullptr ? g_strdup("()") : g_variant_print(body, FALSE);
    return std::string(g_dbus_message_get_path(message)) + ' ' + g_dbus_message_get_interface(message) + '.' +
           g_dbus_message_get_member(message) + " (" + g_dbus_message_get_signature(message) + ") " + values;
}

} // namespace

struct Peer::State
{
    Answer answer;
    std::vector<std::string> calls;
    bool forgetful = false;
    std::atomic<int> busy{0}; ///< answers in progress
};

Peer::Peer(const PrivateBus& bus, const std::string& name, Answer answer) : connection_(bus.Connect())
{
    // The thread that reads the connection may enter the filter after the peer is gone, so the filter's data stays.
    static auto& states = *new std::list<State>;
    {
        const std::lock_guard lock(mutex);
        state_ = &states.emplace_back();
    }
    Set(std::move(answer));
    g_dbus_connection_add_filter(connection_.get(), Filter, state_, nullptr);
    name_ = g_dbus_connection_get_unique_name(connection_.get());
    if (!name.empty())
        Own(name);
}

void Peer::Own(const std::string& name)
{
    name_ = name;
    constexpr guint kReplacesAndIsReplacedForGood = 1 | 2 | 4;
    g_autoptr(GVariant) reply = g_dbus_connection_call_sync(connection_.get(), "org.freedesktop.DBus", "/org/freedesktop/DBus",
        "org.freedesktop.DBus", "RequestName", g_variant_new("(su)", name.c_str(), kReplacesAndIsReplacedForGood), nullptr,
        G_DBUS_CALL_FLAGS_NONE, 10'000, nullptr, nullptr);
    EXPECT_NE(nullptr, reply);
}

Peer::~Peer()
{
    Close();
}

GDBusMessage* Peer::Filter(GDBusConnection* connection, GDBusMessage* message, gboolean incoming, gpointer data)
{
    if (!incoming || g_dbus_message_get_message_type(message) != G_DBUS_MESSAGE_TYPE_METHOD_CALL)
        return message;
    const Message call(message);
    auto& state = *static_cast<State*>(data);
    std::unique_lock lock(mutex);
    Answer answer = state.answer;
    if (g_strcmp0(g_dbus_message_get_interface(message), "org.freedesktop.DBus.Properties") == 0)
        answer = Reply("(@a{sv} {},)"); // every new proxy calls GetAll
    else if (!state.forgetful)
        state.calls.push_back(Describe(message));
    ++state.busy;
    lock.unlock();

    if (const Message reply{answer ? answer(message) : g_dbus_message_new_method_reply(message)})
        g_dbus_connection_send_message(connection, reply.get(), G_DBUS_SEND_MESSAGE_FLAGS_NONE, nullptr, nullptr);

    --state.busy;
    return nullptr;
}

Peer::Answer Peer::Reply(const char* body)
{
    return [body](GDBusMessage* call)
    {
        GDBusMessage* const reply = g_dbus_message_new_method_reply(call);
        g_autoptr(GVariant) values = g_variant_parse(nullptr, body, nullptr, nullptr, nullptr);
        g_dbus_message_set_body(reply, values);
        return reply;
    };
}

Peer::Answer Peer::Refuse()
{
    return [](GDBusMessage* call) { return g_dbus_message_new_method_error_literal(call, "org.example.Refused", "not today"); };
}

Peer::Answer Peer::InsteadDo(std::function<void()> action)
{
    return [action = std::move(action)](GDBusMessage*)
    {
        action();
        return nullptr;
    };
}

Peer::Answer Peer::Leave()
{
    return InsteadDo([this] { g_dbus_connection_close(connection_.get(), nullptr, nullptr, nullptr); });
}

void Peer::Set(Answer answer)
{
    const std::lock_guard lock(mutex);
    state_->answer = std::move(answer);
}

std::vector<std::string> Peer::Calls() const
{
    const std::lock_guard lock(mutex);
    return state_->calls;
}

void Peer::Forget()
{
    const std::lock_guard lock(mutex);
    state_->forgetful = true;
}

void Peer::Close()
{
    g_dbus_connection_close_sync(connection_.get(), nullptr, nullptr);
    while (state_->busy > 0)
        std::this_thread::yield();
}

} // namespace kiv::test
