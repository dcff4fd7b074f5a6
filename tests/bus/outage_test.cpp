// A bus that is not there, goes away and comes back.
#include "bus/BusTest.h"

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

    int NotifyAuth() { return manager.SendAuthNotification(imsi, 1); }
};

TEST_F(Outage, InTheMiddleOfAWalkIsReportedForTheRestAndOverWithTheNextCall)
{
    Peer first(bus), killing(bus, "", Peer::InsteadDo([this] { bus.Stop(); })), third(bus);
    for (const Peer* peer : {&first, &killing, &third})
        Subscribe(*peer);
    EXPECT_EQ(0, NotifyAuth());

    auto expected = NoProxyLines("SendAuthNotification", store.records[2]);
    expected.insert(expected.begin(), StartsWith(Line("no call result: ", "E", "SendAuthNotification")));
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
        Peer killing(bus, "", Peer::InsteadDo(restart));
        store.records = {Record(killing), Record(killing), Record(killing)};
        EXPECT_EQ(0, NotifyAuth());
        // The new bus was asked for the other two, whom it does not know.
        EXPECT_THAT(log.TakeErrors(),
            testing::AllOf(testing::SizeIs(3), testing::Each(StartsWith(Line("no call result: ", "E", "SendAuthNotification")))))
            << round;
    }
}

TEST_F(Outage, WhileTheSerialNumberIsAskedForIsAFailedReply)
{
    Peer daemon(bus, kBoardDaemon, Peer::InsteadDo([this] { bus.Stop(); }));
    const char* id = "stale";
    EXPECT_EQ(2, manager.GetDeviceUniqueID(id));
    EXPECT_EQ(nullptr, id);
    const auto send = [&](const char* message) { return Line(message, "E", "SendDbusMethodNReceiveDID"); };
    EXPECT_THAT(log.TakeErrors(),
        ElementsAre(send("reply is NULL"), StartsWith(send("g_dbus_connection_send_message_with_reply_sync() failed:[")),
            send("[dbus] CORE_DBUS_ERROR_REPLY_FAIL"), Line("dbus error occured", "E", "GetDeviceUniqueID")));
    bus.Start();
}

} // namespace
