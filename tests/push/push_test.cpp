// Pushes to client services on a private bus. They run in the main loop of the caller's thread.
#include "bus/BusTest.h"

namespace
{

using namespace kiv::test;
using testing::AllOf;
using testing::Each;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::SizeIs;
using testing::StartsWith;

struct Push : BusTest
{
    void Deliver() { EXPECT_EQ(0, manager.DeliverPushMessage("7", "data", "message", 1'700'000'000)); }

    /// Delivers a push and returns what is logged in the loop.
    std::vector<std::string> Steps()
    {
        Deliver();
        log.Take();
        Settle();
        return log.Take();
    }

    const std::string call = "/example/client org.example.Client.push ((sssx)) (('7', 'data', 'message', 1700000000),)";
    const std::string callFailed = Line("g_dbus_proxy_call_finish error (", "E", "proxy_call_cb");
    const std::string error = Line("", "E", "DeliverPushMessage");
};

TEST_F(Push, CarriesItsTextsAndTimeToEverySubscriber)
{
    Peer first(bus), last(bus, "org.example.Last");
    Subscribe(first);
    std::vector<testing::Matcher<std::string>> errors;
    for (const auto& [record, flaw] : kBadRecords)
    {
        store.records.push_back(record);
        errors.emplace_back(error + "Unable to create proxy: " + flaw);
    }
    store.records.push_back({"org.example.Nobody", "/x", "a.b"});
    errors.insert(errors.end(), 2, StartsWith(callFailed));
    Subscribe(last);
    for (const long long time : {-1LL, 1LL << 32})
    {
        std::string id = "7", data = "{k: 1}", message = "gr\xC3\xBC\xC3\x9F";
        EXPECT_EQ(0, manager.DeliverPushMessage(id.c_str(), data.c_str(), message.c_str(), time));
        for (std::string* const text : {&id, &data, &message})
            text->assign(text->size(), '!'); // as if freed
        Settle();
        const std::string values = "(('7', '{k: 1}', 'gr\xC3\xBC\xC3\x9F', " + std::to_string(time) + "),)";
        EXPECT_EQ("/example/client org.example.Client.push ((sssx)) " + values, first.Calls().back());
        EXPECT_EQ(first.Calls(), last.Calls());
        EXPECT_THAT(log.TakeErrors(), testing::ElementsAreArray(errors));
    }
    EXPECT_THAT(first.Calls(), SizeIs(2));
    EXPECT_THAT(store.asked, ElementsAre("push 7", "push 7"));
}

TEST_F(Push, LogsEachStepOfADelivery)
{
    Peer client(bus);
    Subscribe(client);
    std::vector<std::string> expected = {Line("begin", "I", "proxy_new_cb"),
        Line("service_id (7), noti_data (data), noti_msg (message), noti_time (1700000000)", "I", "proxy_new_cb"),
        Line("end", "I", "proxy_new_cb"), Line("begin", "I", "proxy_call_cb"), Line("begin", "I", "free_user_data"),
        Line("end", "I", "free_user_data"), Line("end", "I", "proxy_call_cb")};
    EXPECT_EQ(expected, Steps());

    client.Set(Peer::Refuse());
    expected.insert(expected.begin() + 4, 2, callFailed + "GDBus.Error:org.example.Refused: not today)");
    EXPECT_EQ(expected, Steps());
}

TEST_F(Push, IsNotStartedWithAnInvalidText)
{
    for (const auto& [bad, flaw] : {std::pair<const char*, std::string>(nullptr, " is null"), {"\xFF", " is not valid UTF-8"}})
    {
        EXPECT_EQ(0, manager.DeliverPushMessage(bad, "data", "message", 1));
        EXPECT_EQ(0, manager.DeliverPushMessage("7", bad, "message", 1));
        EXPECT_EQ(0, manager.DeliverPushMessage("7", "data", bad, 1));
        EXPECT_THAT(
            log.TakeErrors(), ElementsAre(error + "service_id" + flaw, error + "noti_data" + flaw, error + "noti_msg" + flaw));
    }
    EXPECT_THAT(store.asked, testing::IsEmpty());
}

TEST_F(Push, RunsInTheThreadDefaultContextOfItsCaller)
{
    Peer client(bus);
    Subscribe(client);
    g_autoptr(GMainContext) context = g_main_context_new();
    bool ran = false;
    g_main_context_invoke(
        context, [](gpointer flag) -> gboolean { return *static_cast<bool*>(flag) = true, G_SOURCE_REMOVE; }, &ran);
    g_main_context_push_thread_default(context);
    Deliver();
    EXPECT_EQ(0, NotifySubscribers(KIV_NOTI_TYPE_AUTH_SUCCESS)); // a synchronous call succeeds
    g_main_context_pop_thread_default(context);
    EXPECT_FALSE(ran) << "and runs nothing of the caller's";
    EXPECT_THAT(client.Calls(), ElementsAre(HasSubstr(".auth ")));
    Settle(context);
    EXPECT_TRUE(ran);
    EXPECT_THAT(client.Calls(), ElementsAre(HasSubstr(".auth "), call));
}

TEST_F(Push, LogsThatTheBusDiedOrIsMissing)
{
    Connection agents(g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr)); // GDBus would end the process when it closes
    Peer silent(bus, "", Peer::InsteadDo([] {}));
    store.records = {Record(silent), Record(silent)};
    Deliver();
    IterateUntil([&] { return silent.Calls().size() == 2; });
    bus.Stop();
    Settle();
    EXPECT_THAT(log.TakeErrors(), AllOf(SizeIs(4), Each(StartsWith(callFailed))));

    agents.reset();
    store.records.pop_back();
    EXPECT_THAT(
        Steps(), ElementsAre(Line("begin", "I", "proxy_new_cb"), StartsWith(Line("Unable to create proxy: ", "E", "proxy_new_cb")),
                     Line("begin", "I", "free_user_data"), Line("end", "I", "free_user_data")));
}

TEST_F(Push, LetsNoConnectionEndTheProcessWhileItConnects)
{
    Peer client(bus);
    const Connection other = bus.Connect();
    const auto staysDeadly = [&]
    {
        g_dbus_connection_set_exit_on_close(other.get(), TRUE);
        g_signal_emit_by_name(other.get(), "closed", FALSE, nullptr);
        return g_dbus_connection_get_exit_on_close(other.get()) != FALSE;
    };
    Deliver();
    EXPECT_TRUE(staysDeadly()) << "without subscribers";
    Subscribe(client);
    Deliver();
    EXPECT_FALSE(staysDeadly());
    Settle();
    EXPECT_TRUE(staysDeadly());
}

} // namespace
