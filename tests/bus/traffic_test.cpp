// A notification and a push send the same messages as a straightforward loop.
#include "bus/BusTest.h"
#include "support/BusMonitor.h"

#include <BareBus.h>

namespace
{

using namespace kiv::test;
using namespace kiv::bench;

struct Traffic : BusTest
{
    Traffic()
    {
        for (const std::string& path : paths)
            store.records.push_back({kServiceName, path, kServiceName});
    }

    const std::vector<std::string> paths = SubscriberPaths(3);
    const Connection shared{g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr)}; // held, so that neither side connects
    Peer service{bus, kServiceName};
    // GDBus adds a match rule once for all proxies that exist at the same time. This one always exists, so it does not matter how
    // long the lives of the others overlap.
    const std::unique_ptr<GDBusProxy, Unref> other{g_dbus_proxy_new_sync(
        shared.get(), G_DBUS_PROXY_FLAGS_NONE, nullptr, kServiceName, "/org/example/Other", kServiceName, nullptr, nullptr)};
    BusMonitor monitor{bus, shared.get()};
};

TEST_F(Traffic, OfANotificationEqualsThatOfTheBareLoop)
{
    std::string who = kImsi;
    const auto bare = monitor.During([this] { NotifyBare(paths, 7); });
    const auto ours = monitor.During([&] { manager.SendStatusNotification(who.data(), 7, "on"); });
    EXPECT_GT(ours.size(), paths.size());
    EXPECT_EQ(bare, ours);
}

TEST_F(Traffic, OfAPushEqualsThatOfTheBareLoopInAnyOrder)
{
    const auto bare = monitor.During([this] { PushBare(paths, "7"); });
    const auto push = [this]
    {
        manager.DeliverPushMessage("7", "data", "message", kPushTime);
        Settle();
    };
    const auto ours = monitor.During(push);
    EXPECT_GT(ours.size(), paths.size());
    EXPECT_THAT(ours, testing::UnorderedElementsAreArray(bare));
}

} // namespace
