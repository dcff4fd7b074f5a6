// A bus that is killed at random moments in every operation that uses it. More rounds, or those of an earlier run once more:
//   KIV_KILL_ROUNDS=1000 KIV_KILL_SEED=7 bus_kill_test
#include "bus/BusTest.h"

#include <random>

namespace
{

using namespace kiv::test;
using testing::AnyOf;
using testing::IsEmpty;

unsigned long Wish(const char* variable, unsigned long otherwise)
{
    const char* const value = g_getenv(variable);
    return value == nullptr ? otherwise : std::strtoul(value, nullptr, 10);
}

constexpr const char* operations[] = {"serial", "service manager", "walk", "several", "push"};

struct Kill : BusTest
{
    /// A bus operation, of which what comes back has to be one of its results.
    void Run(const std::string& name)
    {
        const char* id = nullptr;
        int ids[] = {1, 2};
        char on[] = "on";
        char* statuses[] = {on, on};
        if (name == "serial")
        {
            const int code = manager.GetDeviceUniqueID(id);
            EXPECT_THAT(code, AnyOf(isDead ? 1 : 0, 1, 2));
            EXPECT_EQ(code == 0, id != nullptr);
        }
        else if (name == "service manager")
            EXPECT_THAT(NotifyServiceManager(KIV_NOTI_TYPE_POLICY), AnyOf(isDead ? 1 : 0, 1, 2, 5));
        else if (name == "walk")
            EXPECT_EQ(0, NotifySubscribers(KIV_NOTI_TYPE_NUMBER_CHANGED));
        else if (name == "several")
            EXPECT_EQ(0, facade.SendMultiOnOffNotiToServiceManager(imsi, 2, ids, statuses));
        else
            EXPECT_EQ(0, manager.DeliverPushMessage("7", "data", "message", 1));
        g_free(const_cast<char*>(id));
    }

    /// Counts the deliveries that were started and those whose list was given back.
    void Count()
    {
        for (const std::string& line : log.Take())
        {
            open += line.rfind("I DADBusManager.cpp DeliverPushMessage > busname: ", 0) == 0;
            open -= line.rfind("E DADBusManager.cpp DeliverPushMessage > Unable to create proxy: ", 0) == 0;
            open -= line == "I DADBusManager.cpp free_user_data > end";
        }
    }

    /// Iterates the thread's loop until every delivery has ended.
    void Settle()
    {
        IterateUntil(
            [this]
            {
                Count();
                return open == 0;
            });
        while (g_main_context_iteration(nullptr, FALSE)) // what the proxies left behind holds the connection
        {
        }
    }

    int open = 0;
    bool isDead = false; ///< there certainly is no bus
};

TEST_F(Kill, AtAnyMomentLeavesTheProcessAliveNothingOwnedAndTheNextCallGoesToTheNewBus)
{
    const unsigned long rounds = Wish("KIV_KILL_ROUNDS", 50), seed = Wish("KIV_KILL_SEED", std::random_device{}());
    std::printf("%lu rounds, seed %lu\n", rounds, seed);
    // "Error while sending AddMatch()", and the like, is what GDBus prints when the bus dies while a proxy is being made.
    PrivateBus::Tolerate(" message: The connection is closed");
    std::mt19937 random(static_cast<std::mt19937::result_type>(seed));
    for (unsigned long round = 0; round < rounds && !HasFailure(); ++round)
    {
        const std::string name = operations[random() % std::size(operations)];
        SCOPED_TRACE(name + ", round " + std::to_string(round));
        const gulong delayUs = random() % 3000;
        {
            Peer first(bus), second(bus), daemon(bus, kBoardDaemon, Peer::Reply("('KIV1',)")), serviceManager(bus, kServiceManager);
            store.records = {Record(first), {"org.example.Nobody", "/", "a.b"}, Record(second)};
            std::atomic<bool> killed{false};
            std::thread killer(
                [&]
                {
                    g_usleep(delayUs);
                    bus.Stop();
                    killed = true;
                });
            while (!killed)
            {
                Run(name);
                g_main_context_iteration(nullptr, FALSE);
            }
            killer.join();
            isDead = true;
            Run(name);
            isDead = false;
            Settle();
        }
        bus.Start();
        Peer client(bus), daemon(bus, kBoardDaemon, Peer::Reply("('KIV2',)")), serviceManager(bus, kServiceManager);
        store.records = {Record(client)};
        // What a push asked for may be told of in the loop a moment after its deliveries ended, and until then GDBus goes on
        // failing.
        if (name == "push")
            IterateUntil([this] { return NotifyServiceManager(KIV_NOTI_TYPE_ACTIVATED) == 0; });
        const std::size_t calls = serviceManager.Calls().size();
        log.Take();
        const auto callAll = [this]
        {
            for (const char* const operation : {"serial", "service manager", "walk"})
                Run(operation);
        };
        callAll();
        std::thread(callAll).join();
        EXPECT_THAT(log.TakeErrors(), IsEmpty());
        Run("push");
        Settle();
        EXPECT_EQ(2U, daemon.Calls().size());
        EXPECT_EQ(calls + 2, serviceManager.Calls().size());
        EXPECT_EQ(3U, client.Calls().size());
    }
    PrivateBus::Tolerate(nullptr);
}

TEST_F(Kill, IsFoundByEveryCallAsLongAsTheAgentHoldsTheDeadConnection)
{
    const Connection agents(g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr));
    EXPECT_EQ(2, NotifyServiceManager(KIV_NOTI_TYPE_ACTIVATED)) << "there is no service manager";
    bus.Stop();
    bus.Start();
    Peer client(bus), serviceManager(bus, kServiceManager);
    store.records = {Record(client)};
    while (!g_dbus_connection_is_closed(agents.get()))
        std::this_thread::yield();
    for (const char* const name : operations)
    {
        Run(name);
        EXPECT_THAT(log.TakeErrors(), testing::Not(IsEmpty())) << name;
    }
    EXPECT_EQ(5, NotifyServiceManager(KIV_NOTI_TYPE_ACTIVATED));
    EXPECT_THAT(client.Calls(), IsEmpty());
    EXPECT_THAT(serviceManager.Calls(), IsEmpty());
}

} // namespace
