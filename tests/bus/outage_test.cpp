// A bus that is not there, goes away and comes back.
#include "bus/BusTest.h"

#include <chrono>
#include <future>
#include <thread>

namespace
{

using namespace kiv::test;
using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::StartsWith;

/// Each test starts with a bus and no connection of the library's.
struct Outage : BusTest
{
    Outage()
    {
        bus.Stop();
        bus.Start();
    }

    std::string Line(const char* function, const char* message)
    {
        return std::string("E DADBusManager.cpp ") + function + " > " + message;
    }
    int NotifyAuth() { return manager.SendAuthNotification(imsi, 1); }
};

TEST_F(Outage, IsReportedByEveryOperation)
{
    bus.Stop();
    const auto unreachableThen = [&](const std::string& line)
    {
        return ElementsAre(Line("InitDbusConnection", "GDBusConnection is NULL"),
            StartsWith(Line("InitDbusConnection", "g_bus_get_sync() failed:[")),
            Line("InitDbusConnection", "[dbus] DBUS_ERROR_CONNECTION_FAIL"), line);
    };
    const char* id = "stale";
    EXPECT_EQ(1, facade.GetDeviceUniqueID(&id));
    EXPECT_EQ(nullptr, id);
    EXPECT_THAT(log.TakeErrors(), unreachableThen(Line("GetDeviceUniqueID", "dbus error occured")));

    for (const auto type : {KIV_NOTI_TYPE_STATUS_ON, static_cast<_KIV_NOTI_TYPE_E>(9)})
    {
        EXPECT_EQ(1, NotifyServiceManager(type));
        EXPECT_THAT(log.TakeErrors(), unreachableThen(Line("SendNotiToServiceManager", "dbus connection error occured")));
    }

    const _SubscriberInfo record{"org.example.Nobody", "/example/client", "org.example.Client"};
    store.records = {record};
    EXPECT_EQ(0, NotifyAuth());
    EXPECT_THAT(log.TakeErrors(), ElementsAreArray(NoProxyLines("SendAuthNotification", record)));
    bus.Start();
}

TEST_F(Outage, InTheMiddleOfAWalkIsReportedForTheRestAndOverWithTheNextCall)
{
    Peer first(bus), killing(bus, "", Peer::After([this] { bus.Stop(); }, Peer::Silence())), third(bus);
    for (const Peer* peer : {&first, &killing, &third})
        Subscribe(*peer);
    EXPECT_EQ(0, NotifyAuth());

    auto expected = NoProxyLines("SendAuthNotification", store.records[2]);
    expected.insert(expected.begin(), StartsWith(Line("SendAuthNotification", "no call result: ")));
    EXPECT_THAT(log.TakeErrors(), ElementsAreArray(expected));
    EXPECT_EQ(1U, first.Calls().size());
    EXPECT_EQ(0U, third.Calls().size());

    bus.Start();
    Peer again(bus);
    store.records = {Record(again)};
    EXPECT_EQ(0, NotifyAuth());
    EXPECT_EQ(1U, again.Calls().size());
    EXPECT_THAT(log.TakeErrors(), testing::IsEmpty());
}

TEST_F(Outage, ThatIsOverWhileASubscriberIsCalledIsOverForTheRestOfTheWalk)
{
    for (int round = 0; round < 10; ++round)
    {
        const auto restart = [this]
        {
            bus.Stop();
            bus.Start();
        };
        Peer killing(bus, "", Peer::After(restart, Peer::Silence()));
        store.records = {Record(killing), Record(killing), Record(killing)};
        EXPECT_EQ(0, NotifyAuth());
        // The new bus was asked for the other two, whom it does not know.
        EXPECT_THAT(log.TakeErrors(), testing::Each(StartsWith(Line("SendAuthNotification", "no call result: ")))) << round;
    }
}

TEST_F(Outage, AfterAPushIsOverWithTheNextCallOfAThreadWithoutALoopThoughTheContextOfThePushIsIteratedNoMore)
{
    Peer client(bus);
    Subscribe(client);
    EXPECT_EQ(0, manager.DeliverPushMessage("7", "data", "message", 1));
    const auto deadline = std::chrono::steady_clock::now() + std::chrono::seconds(10);
    const std::string ended = "I DADBusManager.cpp proxy_call_cb > end";
    std::vector<std::string> lines = {""};
    while (lines.back() != ended && std::chrono::steady_clock::now() < deadline)
    {
        g_main_context_iteration(nullptr, FALSE);
        for (auto& line : log.Take())
            lines.push_back(std::move(line));
    }
    ASSERT_EQ(ended, lines.back());
    EXPECT_EQ(1U, client.Calls().size());

    bus.Stop();
    bus.Start();
    Peer serviceManager(bus, kServiceManager);
    std::thread([this] { EXPECT_EQ(0, NotifyServiceManager(KIV_NOTI_TYPE_ACTIVATED)); }).join();
    EXPECT_EQ(1U, serviceManager.Calls().size());
    EXPECT_THAT(log.TakeErrors(), testing::IsEmpty());
}

TEST_F(Outage, WhileTheSerialNumberIsAskedForIsAFailedReply)
{
    Peer daemon(bus, kBoardDaemon, Peer::After([this] { bus.Stop(); }, Peer::Silence()));
    const char* id = "stale";
    EXPECT_EQ(2, manager.GetDeviceUniqueID(id));
    EXPECT_EQ(nullptr, id);
    const auto send = [&](const char* message) { return Line("SendDbusMethodNReceiveDID", message); };
    EXPECT_THAT(log.TakeErrors(),
        ElementsAre(send("reply is NULL"), StartsWith(send("g_dbus_connection_send_message_with_reply_sync() failed:[")),
            send("[dbus] CORE_DBUS_ERROR_REPLY_FAIL"), Line("GetDeviceUniqueID", "dbus error occured")));
    bus.Start();
}

TEST_F(Outage, WhileSeveralThreadsAreInCallsEndsThoseAndIsOverWithTheNextCallOfEach)
{
    for (int round = 0; round < 5; ++round)
    {
        constexpr std::size_t kThreads = 4;
        Peer silent(bus, "", Peer::Silence()), silentManager(bus, kServiceManager, Peer::Silence());
        store.records = {Record(silent)};
        std::vector<std::future<int>> toClient, toManager, both;
        for (std::size_t i = 0; i < kThreads / 2; ++i)
        {
            toClient.push_back(std::async(std::launch::async, [this] { return NotifyAuth(); }));
            toManager.push_back(std::async(std::launch::async, [this] { return NotifyServiceManager(KIV_NOTI_TYPE_AUTH_FAIL); }));
        }
        silent.AwaitCalls(kThreads / 2);
        silentManager.AwaitCalls(kThreads / 2);
        bus.Stop();
        for (std::size_t i = 0; i < kThreads / 2; ++i)
            EXPECT_EQ(std::pair(0, 2), std::pair(toClient[i].get(), toManager[i].get()));
        EXPECT_EQ(kThreads, log.TakeErrors().size());

        bus.Start();
        Peer answering(bus), answeringManager(bus, kServiceManager);
        store.records = {Record(answering)};
        for (std::size_t i = 0; i < kThreads; ++i)
            both.push_back(
                std::async(std::launch::async, [this] { return NotifyServiceManager(KIV_NOTI_TYPE_AUTH_FAIL) + NotifyAuth(); }));
        for (auto& result : both)
            EXPECT_EQ(0, result.get());
        EXPECT_EQ(kThreads, answering.Calls().size());
        EXPECT_EQ(kThreads, answeringManager.Calls().size());
        ASSERT_THAT(log.TakeErrors(), testing::IsEmpty());
    }
}

} // namespace
