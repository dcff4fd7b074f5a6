// What goes over the bus for a notification and for a push: the messages of the loop that one would write first, and no other.
#include "bus/BusTest.h"

#include <BusMonitor.h>

#include <algorithm>

namespace
{

using namespace kiv::test;

struct Traffic : BusTest
{
    Connection agents{g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr)}; ///< so that both sides send over the same one
    Peer first{bus}, refusing{bus, "", Peer::Refuse()}, last{bus};

    Traffic() { store.records = {Record(first), {"org.example.Nobody", "/a", "a.b"}, Record(refusing), Record(last)}; }

    kiv::bench::BusMonitor monitor{agents.get(), bus.Connect().get()};

    static void Iterate(const std::function<bool()>& isDone)
    {
        IterateUntil(isDone);
        while (g_main_context_iteration(nullptr, FALSE))
        {
        }
    }
};

TEST_F(Traffic, OfANotificationIsThatOfTheBareLoop)
{
    const auto librarys = monitor.During([this] { EXPECT_EQ(0, manager.SendStatusNotification(imsi, 7, "on")); });
    const auto bare = [this]
    {
        for (const auto& record : store.records)
        {
            g_autoptr(GDBusProxy) proxy = g_dbus_proxy_new_for_bus_sync(G_BUS_TYPE_SYSTEM, G_DBUS_PROXY_FLAGS_NONE, nullptr,
                record.busname.c_str(), record.objectpath.c_str(), record.interface.c_str(), nullptr, nullptr);
            [[maybe_unused]] g_autoptr(GVariant) reply = g_dbus_proxy_call_sync(
                proxy, "status", g_variant_new("((sis))", imsi, 7, "on"), G_DBUS_CALL_FLAGS_NONE, G_MAXINT, nullptr, nullptr);
        }
    };
    EXPECT_EQ(monitor.During(bare), librarys);
    EXPECT_GE(librarys.size(), 2 * store.records.size());
}

TEST_F(Traffic, OfAPushIsThatOfTheBareCallbacks)
{
    const auto sorted = [](std::vector<std::string> lines) // the deliveries go on side by side
    {
        std::sort(lines.begin(), lines.end());
        return lines;
    };
    static std::size_t ended;
    ended = 0;
    const auto library = [this]
    {
        EXPECT_EQ(0, manager.DeliverPushMessage("7", "data", "message", 1));
        Iterate(
            [this]
            {
                for (const auto& line : log.Take())
                    ended += line == "I DADBusManager.cpp proxy_call_cb > end";
                return ended == store.records.size();
            });
    };
    const auto librarys = sorted(monitor.During(library));

    ended = 0;
    const auto called = [](GObject* proxy, GAsyncResult* result, gpointer)
    {
        [[maybe_unused]] g_autoptr(GVariant) reply = g_dbus_proxy_call_finish(G_DBUS_PROXY(proxy), result, nullptr);
        g_object_unref(proxy);
        ++ended;
    };
    const auto made = [](GObject*, GAsyncResult* result, gpointer next)
    {
        GDBusProxy* const proxy = g_dbus_proxy_new_for_bus_finish(result, nullptr);
        g_dbus_proxy_call(proxy, "push", g_variant_new("((sssx))", "7", "data", "message", gint64{1}), G_DBUS_CALL_FLAGS_NONE, -1,
            nullptr, reinterpret_cast<GAsyncReadyCallback>(next), nullptr);
    };
    const auto bare = [&]
    {
        GAsyncReadyCallback const next = called;
        for (const auto& record : store.records)
            g_dbus_proxy_new_for_bus(G_BUS_TYPE_SYSTEM, G_DBUS_PROXY_FLAGS_NONE, nullptr, record.busname.c_str(),
                record.objectpath.c_str(), record.interface.c_str(), nullptr, made, reinterpret_cast<gpointer>(next));
        Iterate([this] { return ended == store.records.size(); });
    };
    EXPECT_EQ(sorted(monitor.During(bare)), librarys);
}

} // namespace
