// What goes over the bus for a notification and for a push: the messages of the loop that one would write first, and no other.
#include "bus/BusTest.h"

#include <algorithm>
#include <condition_variable>

namespace
{

using namespace kiv::test;

/// What the monitor saw. The program's own from the start on, because GLib hands the filter to its thread under locks that
/// ThreadSanitizer does not see.
struct
{
    std::mutex mutex;
    std::condition_variable changed;
    std::vector<std::string> lines;
    bool isMarked = false;
} seen;

/// Sees every message on the bus. A mark that is sent over the connection in question tells where its messages end.
class Monitor
{
public:
    Monitor(const PrivateBus& bus, GDBusConnection* marking) : marking_(marking), connection_(bus.Connect())
    {
        g_dbus_connection_add_filter(connection_.get(), See, nullptr, nullptr);
        g_autoptr(GVariant) reply = g_dbus_connection_call_sync(connection_.get(), "org.freedesktop.DBus", "/org/freedesktop/DBus",
            "org.freedesktop.DBus.Monitoring", "BecomeMonitor", g_variant_new_parsed("(@as [], uint32 0)"), nullptr,
            G_DBUS_CALL_FLAGS_NONE, -1, nullptr, nullptr);
        EXPECT_NE(nullptr, reply);
        Take();
    }
    ~Monitor() { g_dbus_connection_close_sync(connection_.get(), nullptr, nullptr); }

    /// What was sent since the last Take, without what differs from one message to its like: the serial numbers.
    std::vector<std::string> Take()
    {
        g_dbus_connection_emit_signal(marking_, nullptr, "/", "a.b", "Mark", nullptr, nullptr);
        std::unique_lock lock(seen.mutex);
        EXPECT_TRUE(seen.changed.wait_for(lock, std::chrono::seconds(10), [] { return seen.isMarked; }));
        seen.isMarked = false;
        return std::exchange(seen.lines, {});
    }

private:
    static GDBusMessage* See(GDBusConnection*, GDBusMessage* message, gboolean incoming, gpointer)
    {
        const auto text = [](const char* value) { return std::string(" ") + (value == nullptr ? "-" : value); };
        GVariant* const body = g_dbus_message_get_body(message);
        g_autofree gchar* values = body == nullptr ? nullptr : g_variant_print(body, TRUE);
        const std::string line = std::to_string(g_dbus_message_get_message_type(message)) +
                                 text(g_dbus_message_get_sender(message)) + text(g_dbus_message_get_destination(message)) +
                                 text(g_dbus_message_get_path(message)) + text(g_dbus_message_get_interface(message)) +
                                 text(g_dbus_message_get_member(message)) + text(values);
        const std::lock_guard lock(seen.mutex);
        if (incoming && g_strcmp0(g_dbus_message_get_member(message), "Mark") == 0)
            seen.isMarked = true;
        else if (incoming)
            seen.lines.push_back(line);
        seen.changed.notify_all();
        if (!incoming || g_dbus_message_get_message_type(message) != G_DBUS_MESSAGE_TYPE_METHOD_CALL)
            return message;
        g_object_unref(message); // who only watches must not answer
        return nullptr;
    }

    GDBusConnection* marking_;
    Connection connection_;
};

struct Traffic : BusTest
{
    Connection agents{g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr)}; ///< so that both sides send over the same one
    Peer first{bus}, refusing{bus, "", Peer::Refuse()}, last{bus};

    Traffic() { store.records = {Record(first), {"org.example.Nobody", "/a", "a.b"}, Record(refusing), Record(last)}; }

    static void Iterate(const std::function<bool()>& isDone)
    {
        const gint64 deadline = g_get_monotonic_time() + 20 * G_TIME_SPAN_SECOND;
        while (!isDone() && g_get_monotonic_time() < deadline)
            g_main_context_iteration(nullptr, FALSE);
        EXPECT_TRUE(isDone());
        while (g_main_context_iteration(nullptr, FALSE))
        {
        }
    }
};

TEST_F(Traffic, OfANotificationIsThatOfTheBareLoop)
{
    Monitor monitor(bus, agents.get());
    EXPECT_EQ(0, manager.SendStatusNotification(imsi, 7, "on"));
    const auto librarys = monitor.Take();
    for (const auto& record : store.records)
    {
        g_autoptr(GDBusProxy) proxy = g_dbus_proxy_new_for_bus_sync(G_BUS_TYPE_SYSTEM, G_DBUS_PROXY_FLAGS_NONE, nullptr,
            record.busname.c_str(), record.objectpath.c_str(), record.interface.c_str(), nullptr, nullptr);
        [[maybe_unused]] g_autoptr(GVariant) reply = g_dbus_proxy_call_sync(
            proxy, "status", g_variant_new("((sis))", imsi, 7, "on"), G_DBUS_CALL_FLAGS_NONE, G_MAXINT, nullptr, nullptr);
    }
    EXPECT_EQ(monitor.Take(), librarys);
    EXPECT_GE(librarys.size(), 2 * store.records.size());
}

TEST_F(Traffic, OfAPushIsThatOfTheBareCallbacks)
{
    const auto sorted = [](std::vector<std::string> lines) // the deliveries go on side by side
    {
        std::sort(lines.begin(), lines.end());
        return lines;
    };
    std::size_t ended = 0;
    Monitor monitor(bus, agents.get());
    EXPECT_EQ(0, manager.DeliverPushMessage("7", "data", "message", 1));
    Iterate(
        [&]
        {
            for (const auto& line : log.Take())
                ended += line == "I DADBusManager.cpp proxy_call_cb > end";
            return ended == store.records.size();
        });
    const auto librarys = sorted(monitor.Take());

    static std::size_t bareEnded;
    bareEnded = 0;
    const auto called = [](GObject* proxy, GAsyncResult* result, gpointer)
    {
        [[maybe_unused]] g_autoptr(GVariant) reply = g_dbus_proxy_call_finish(G_DBUS_PROXY(proxy), result, nullptr);
        g_object_unref(proxy);
        ++bareEnded;
    };
    const auto made = [](GObject*, GAsyncResult* result, gpointer next)
    {
        GDBusProxy* const proxy = g_dbus_proxy_new_for_bus_finish(result, nullptr);
        g_dbus_proxy_call(proxy, "push", g_variant_new("((sssx))", "7", "data", "message", gint64{1}), G_DBUS_CALL_FLAGS_NONE, -1,
            nullptr, reinterpret_cast<GAsyncReadyCallback>(next), nullptr);
    };
    GAsyncReadyCallback const next = called;
    for (const auto& record : store.records)
        g_dbus_proxy_new_for_bus(G_BUS_TYPE_SYSTEM, G_DBUS_PROXY_FLAGS_NONE, nullptr, record.busname.c_str(),
            record.objectpath.c_str(), record.interface.c_str(), nullptr, made, reinterpret_cast<gpointer>(next));
    Iterate([&] { return bareEnded == store.records.size(); });
    EXPECT_EQ(sorted(monitor.Take()), librarys);
}

} // namespace
