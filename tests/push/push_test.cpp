// Pushes to the client services of a private bus, which go on in the main loop of the caller's thread.
#include "bus/BusTest.h"

#include <algorithm>
#include <cstdlib>
#include <limits>
#include <thread>

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

std::string Info(const std::string& function, const std::string& message)
{
    return "I DADBusManager.cpp " + function + " > " + message;
}

struct Push : BusTest
{
    void Deliver() { EXPECT_EQ(0, manager.DeliverPushMessage("7", "data", "message", 1'700'000'000)); }

    /// Iterates a main context until a condition holds; fails after twenty seconds.
    template <class Condition>
    static void IterateUntil(Condition isMet, GMainContext* context = nullptr)
    {
        const gint64 deadline = g_get_monotonic_time() + 20 * G_TIME_SPAN_SECOND;
        while (!isMet())
        {
            ASSERT_LT(g_get_monotonic_time(), deadline);
            if (!g_main_context_iteration(context, FALSE))
                g_usleep(1000); // for what comes true outside the loop
        }
    }

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
    const std::string callFailed = "E DADBusManager.cpp proxy_call_cb > g_dbus_proxy_call_finish error (";
    const std::string error = "E DADBusManager.cpp DeliverPushMessage > ";
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
    Lines steps = {Info("DeliverPushMessage", "begin"), Info("DeliverPushMessage", "busname: " + client.Name()),
        Info("DeliverPushMessage", "objectpath: /example/client"), Info("DeliverPushMessage", "interface: org.example.Client"),
        Info("DeliverPushMessage", "end"), Info("proxy_new_cb", "begin"),
        Info("proxy_new_cb", "service_id (7), noti_data (data), noti_msg (message), noti_time (1700000000)"),
        Info("proxy_new_cb", "end"), Info("proxy_call_cb", "begin"), Info("free_user_data", "begin"), Info("free_user_data", "end"),
        Info("proxy_call_cb", "end")};
    LineMatchers notCreated(steps.begin(), steps.begin() + 6);
    notCreated.emplace_back(StartsWith("E DADBusManager.cpp proxy_new_cb > Unable to create proxy: "));
    notCreated.insert(notCreated.end(), steps.begin() + 9, steps.begin() + 11);
    Deliver();
    EXPECT_EQ(steps, RunUntilEnded(1));

    client.Set(Peer::Refuse());
    Deliver();
    steps.insert(steps.begin() + 9, 2, callFailed + "GDBus.Error:org.example.Refused: not today)");
    EXPECT_EQ(steps, RunUntilEnded(1));

    bus.Stop();
    int code = 0;
    IterateUntil([&] { return Connection(manager.InitDbusConnection(&code)) == nullptr; });
    log.Take();
    Deliver();
    EXPECT_THAT(RunUntilEnded(1), testing::ElementsAreArray(notCreated));
    bus.Start();
    Peer again(bus);
    store.records = {Record(again)};
    const auto arrives = [&]
    {
        Deliver();
        return Errors(RunUntilEnded(1)).empty();
    };
    IterateUntil(arrives); // GDBus shares what could not connect as well, until it is gone
}

TEST_F(Push, ReachesTheOthersWhenARecordBetweenThemCanNotBeCalled)
{
    const std::string notMade = error + "Unable to create proxy: ";
    const struct
    {
        _SubscriberInfo record;
        int started;
        LineMatchers errors;
    } cases[] = {
        {{"org.example.Nobody", "/x", "a.b"}, 3, {StartsWith(callFailed), StartsWith(callFailed)}},
        {{"no name", "/x", "a.b"}, 2, {notMade + "busname is not a bus name"}},
        {{"a.b", "x", "a.b"}, 2, {notMade + "objectpath is not an object path"}},
        {{"a.b", "/x", "a"}, 2, {notMade + "interface is not an interface name"}},
        {{"a.b", "/org/freedesktop/DBus/Local", "a.b"}, 2, {notMade + "objectpath is reserved"}},
        {{"a.b", "/org/freedesktop/DBus/Locale/x", "a.b"}, 2, {notMade + "objectpath is reserved"}},
        {{"a.b", "/x", "org.freedesktop.DBus.Local"}, 2, {notMade + "interface is reserved"}},
        {{"a.b", "/x", "org.freedesktop.DBus.Locale"}, 2, {notMade + "interface is reserved"}},
    };
    Peer first(bus), third(bus);
    for (const auto& row : cases)
    {
        store.records = {Record(first), row.record, Record(third)};
        Deliver();
        EXPECT_THAT(Errors(RunUntilEnded(row.started)), testing::ElementsAreArray(row.errors));
    }
    EXPECT_THAT(first.Calls(), AllOf(SizeIs(std::size(cases)), Each(call)));
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
        g_main_context_push_thread_default(context);
        Deliver();
        g_main_context_pop_thread_default(context);
        EXPECT_EQ(0, NotifySubscribers(KIV_NOTI_TYPE_AUTH_SUCCESS)); // a synchronous call gets through
        EXPECT_THAT(client.Calls().back(), HasSubstr(".auth "));
        RunUntilEnded(1, "free_user_data", context);
        while (g_main_context_iteration(context, FALSE)) // GDBus tidies up after the proxy
        {
        }
    };
    deliver();
    std::thread(deliver).join();
    EXPECT_THAT(client.Calls(), ElementsAre(HasSubstr(".auth "), call, HasSubstr(".auth "), call));
}

struct PushWhenTheBusDies : Push
{
    /// The bus dies under a call, and comes back.
    /// @param agents  the agent's own hold on the shared connection, or null
    void DieAndComeBack(Connection agents)
    {
        Peer silent(bus, "", Peer::Silence());
        store.records = {Record(silent), Record(silent)};
        Deliver();
        EXPECT_EQ(Lines{}, Errors(RunUntilEnded(2, "proxy_new_cb")));
        silent.AwaitCalls(2);
        Connection held(g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr));
        bus.Stop();
        EXPECT_THAT(Errors(RunUntilEnded(2)), AllOf(SizeIs(4), Each(StartsWith(callFailed))));
        IterateUntil([&] { return g_dbus_connection_is_closed(held.get()) != FALSE; });
        Deliver();
        const std::string refused = error + "Unable to create proxy: The connection is closed";
        EXPECT_THAT(log.TakeErrors(), ElementsAre(refused, refused));
        held.reset();
        agents.reset();
        bus.Start();

        Peer client(bus);
        store.records = {Record(client)};
        const auto isStarted = [&]
        {
            Deliver();
            return log.TakeErrors().empty();
        };
        IterateUntil(isStarted); // GDBus itself holds the dead connection for a moment
        EXPECT_EQ(Lines{}, Errors(RunUntilEnded(1)));
        EXPECT_THAT(client.Calls(), ElementsAre(call));
    }
};

TEST_F(PushWhenTheBusDies, LeavesTheProcessAliveAndTheNextOneGoesToTheNewBusWhoeverMadeTheConnection)
{
    GTEST_FLAG_SET(death_test_style, "threadsafe"); // a new process, which has no connection yet
    const auto die = [&](bool isAgents)
    {
        for (int i = 0; i < 3; ++i)
            DieAndComeBack(Connection(isAgents ? g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr) : nullptr));
        std::_Exit(HasFailure() ? 1 : 0);
    };
    EXPECT_EXIT(die(false), testing::ExitedWithCode(0), "");
    EXPECT_EXIT(die(true), testing::ExitedWithCode(0), "");
    DieAndComeBack(nullptr); // in this process, where leaks are looked for
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
