// Pushes to the client services of a private bus, which go on in the main loop of the caller's thread.
#include "bus/BusTest.h"

#include <limits>

namespace
{

using namespace kiv::test;
using testing::AllOf;
using testing::Each;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::SizeIs;
using testing::StartsWith;

using Lines = std::vector<std::string>;
using LineMatchers = std::vector<testing::Matcher<std::string>>;

struct Push : BusTest
{
    static std::string Info(const std::string& function, const std::string& message)
    {
        return Line(message, "I", function.c_str());
    }
    Lines Begin(const Peer& peer)
    {
        Lines lines{"begin", "busname: " + peer.Name(), "objectpath: /example/client", "interface: org.example.Client", "end"};
        for (std::string& line : lines)
            line = Info("DeliverPushMessage", line);
        lines.push_back(Info("proxy_new_cb", "begin"));
        return lines;
    }
    void Deliver() { EXPECT_EQ(0, manager.DeliverPushMessage("7", "data", "message", 1'700'000'000)); }

    /// Iterates until so many deliveries came to the end of a function. @return what was logged until then
    Lines RunUntilEnded(std::ptrdiff_t count, const std::string& function = "free_user_data", GMainContext* context = nullptr)
    {
        Lines lines;
        const auto isMet = [&]
        {
            const Lines more = log.Take();
            lines.insert(lines.end(), more.begin(), more.end());
            return std::count(lines.begin(), lines.end(), Info(function, "end")) >= count;
        };
        IterateUntil(isMet, context);
        return lines;
    }

    static Lines Errors(Lines lines)
    {
        lines.erase(std::remove_if(lines.begin(), lines.end(), [](const auto& line) { return line[0] != 'E'; }), lines.end());
        return lines;
    }

    const std::string call = "/example/client org.example.Client.push ((sssx)) (('7', 'data', 'message', 1700000000),)";
    const std::string callFailed = Line("g_dbus_proxy_call_finish error (", "E", "proxy_call_cb");
    const std::string error = Line("", "E", "DeliverPushMessage");
};

TEST_F(Push, ReachesEverySubscriberWithTheTextsAndTheTimeThatWereHandedIn)
{
    Peer first(bus), second(bus, "org.example.Second");
    store.records = {Record(first), Record(second)};
    using Time = std::numeric_limits<long long>;
    for (const long long time : {-1LL, 1LL << 32, Time::min(), Time::max()})
    {
        std::string id = "7", data = "{k: 1}", message = "gr\xC3\xBC\xC3\x9F";
        EXPECT_EQ(0, manager.DeliverPushMessage(id.c_str(), data.c_str(), message.c_str(), time));
        for (std::string* const text : {&id, &data, &message})
            text->assign(text->size(), '!'); // as good as freed
        RunUntilEnded(2);
        const std::string values = "(('7', '{k: 1}', 'gr\xC3\xBC\xC3\x9F', " + std::to_string(time) + "),)";
        EXPECT_EQ("/example/client org.example.Client.push ((sssx)) " + values, first.Calls().back());
        EXPECT_EQ(first.Calls(), second.Calls());
    }
    EXPECT_THAT(first.Calls(), SizeIs(4));
    EXPECT_THAT(store.asked, AllOf(SizeIs(4), Each("push 7")));
}

TEST_F(Push, LogsEachStepOfADelivery)
{
    Peer client(bus);
    Deliver();
    EXPECT_THAT(log.Take(), ElementsAre(Info("DeliverPushMessage", "begin"), Info("DeliverPushMessage", "end")));

    Subscribe(client);
    Lines steps = Begin(client);
    steps.insert(steps.end(), {Info("proxy_new_cb", "service_id (7), noti_data (data), noti_msg (message), noti_time (1700000000)"),
                                  Info("proxy_new_cb", "end"), Info("proxy_call_cb", "begin"), Info("free_user_data", "begin"),
                                  Info("free_user_data", "end"), Info("proxy_call_cb", "end")});
    Deliver();
    EXPECT_EQ(steps, RunUntilEnded(1));

    client.Set(Peer::Refuse());
    Deliver();
    steps.insert(steps.begin() + 9, 2, callFailed + "GDBus.Error:org.example.Refused: not today)");
    EXPECT_EQ(steps, RunUntilEnded(1));
}

TEST_F(Push, ReachesTheOthersWhenARecordBetweenThemCanNotBeCalled)
{
    const std::string notMade = error + "Unable to create proxy: ";
    Peer first(bus), third(bus);
    for (const auto& [record, flaw] : kBadRecords)
    {
        store.records = {Record(first), record, Record(third)};
        Deliver();
        EXPECT_THAT(Errors(RunUntilEnded(2)), ElementsAre(error + "Unable to create proxy: " + flaw));
    }
    store.records = {Record(first), {"org.example.Nobody", "/x", "a.b"}, Record(third)};
    Deliver();
    EXPECT_THAT(Errors(RunUntilEnded(3)), AllOf(SizeIs(2), Each(StartsWith(callFailed))));
    EXPECT_THAT(first.Calls(), AllOf(SizeIs(std::size(kBadRecords) + 1), Each(call)));
    EXPECT_EQ(first.Calls(), third.Calls());
}

TEST_F(Push, IsNotStartedWithATextThatCanNotGoOnTheBus)
{
    for (const auto& [bad, flaw] : {std::pair<const char*, std::string>(nullptr, " is null"), {"\xFF", " is not valid UTF-8"}})
    {
        EXPECT_EQ(0, manager.DeliverPushMessage(bad, "data", "message", 1));
        EXPECT_EQ(0, manager.DeliverPushMessage("7", bad, "message", 1));
        EXPECT_EQ(0, manager.DeliverPushMessage("7", "data", bad, 1));
        EXPECT_THAT(
            log.TakeErrors(), ElementsAre(error + "service_id" + flaw, error + "noti_data" + flaw, error + "noti_msg" + flaw));
    }
    EXPECT_EQ(Lines{}, store.asked);
}

TEST_F(Push, WaitsForTheLoopOfTheThreadDefaultContextOfWhoeverStartedIt)
{
    Peer client(bus);
    Subscribe(client);
    const auto deliver = [&]
    {
        g_autoptr(GMainContext) context = g_main_context_new();
        g_autoptr(GSource) idle = g_idle_source_new();
        int ran = 0;
        g_source_set_callback(
            idle, [](gpointer count) -> gboolean { return ++*static_cast<int*>(count) == 0; }, &ran, nullptr);
        g_source_attach(idle, context);
        g_main_context_push_thread_default(context);
        Deliver();
        EXPECT_EQ(
            0, NotifySubscribers(KIV_NOTI_TYPE_AUTH_SUCCESS)); // a synchronous call gets through, and runs nothing of the caller's
        EXPECT_EQ(context, g_main_context_get_thread_default());
        g_main_context_pop_thread_default(context);
        EXPECT_EQ(0, ran);
        EXPECT_THAT(client.Calls().back(), HasSubstr(".auth "));
        RunUntilEnded(1, "free_user_data", context);
        EXPECT_EQ(1, ran);
        while (g_main_context_iteration(context, FALSE)) // GDBus tidies up after the proxy
        {
        }
    };
    deliver();
    std::thread(deliver).join();
    EXPECT_THAT(client.Calls(), ElementsAre(HasSubstr(".auth "), call, HasSubstr(".auth "), call));
}

TEST_F(Push, FailsWhenTheBusDiesAndTheNextOneGoesToTheNewBus)
{
    Peer silent(bus, "", Peer::Silence());
    store.records = {Record(silent), Record(silent)};
    Connection held(g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr));
    g_dbus_connection_set_exit_on_close(held.get(), TRUE); // as GDBus makes it for the agent
    Deliver();
    EXPECT_EQ(Lines{}, Errors(RunUntilEnded(2, "proxy_new_cb")));
    silent.AwaitCalls(2);
    bus.Stop();
    EXPECT_THAT(Errors(RunUntilEnded(2)), AllOf(SizeIs(4), Each(StartsWith(callFailed))));
    IterateUntil([&] { return g_dbus_connection_is_closed(held.get()) != FALSE; });
    Deliver();
    const std::string refused = error + "Unable to create proxy: The connection is closed";
    EXPECT_THAT(log.TakeErrors(), ElementsAre(refused, refused));

    held.reset();
    int code = 0;
    IterateUntil([&] { return Connection(manager.InitDbusConnection(&code)) == nullptr; });
    log.Take();
    store.records.pop_back();
    Deliver();
    const Lines begin = Begin(silent);
    LineMatchers notCreated(begin.begin(), begin.end());
    notCreated.emplace_back(StartsWith(Line("Unable to create proxy: ", "E", "proxy_new_cb")));
    notCreated.insert(notCreated.end(), {Info("free_user_data", "begin"), Info("free_user_data", "end")});
    EXPECT_THAT(RunUntilEnded(1), testing::ElementsAreArray(notCreated));

    bus.Start();
    Peer client(bus);
    store.records = {Record(client)};
    const auto arrives = [&]
    {
        Deliver();
        return Errors(RunUntilEnded(1)).empty();
    };
    IterateUntil(arrives); // GDBus shares what could not connect as well, until it is gone
    EXPECT_THAT(client.Calls(), ElementsAre(call));
}

TEST_F(Push, ThatEndedKeepsNoThreadFromTheNextBusThoughItsContextIsIteratedNoMore)
{
    Peer client(bus);
    Subscribe(client);
    Deliver();
    RunUntilEnded(1, "proxy_call_cb");
    bus.Stop();
    bus.Start();
    Peer serviceManager(bus, kServiceManager);
    std::thread([this] { EXPECT_EQ(0, NotifyServiceManager(KIV_NOTI_TYPE_ACTIVATED)); }).join();
    EXPECT_THAT(serviceManager.Calls(), SizeIs(1));
}

TEST_F(Push, FailsBeyondTheRepliesThatTheBusLetsAConnectionWaitFor)
{
    constexpr std::size_t kPendingReplies = 128; // the bus's own default
    Peer silent(bus, "", Peer::Silence());
    Subscribe(silent);
    for (std::size_t i = 1; i <= kPendingReplies; ++i)
    {
        Deliver();
        EXPECT_EQ(Lines{}, Errors(RunUntilEnded(1, "proxy_new_cb")));
        silent.AwaitCalls(i);
    }
    Deliver();
    EXPECT_THAT(Errors(RunUntilEnded(1)), AllOf(SizeIs(2), Each(AllOf(StartsWith(callFailed), HasSubstr("LimitsExceeded")))));
    silent.Close();
    EXPECT_THAT(Errors(RunUntilEnded(kPendingReplies)), SizeIs(2 * kPendingReplies));
    EXPECT_THAT(silent.Calls(), SizeIs(kPendingReplies));
}

} // namespace
