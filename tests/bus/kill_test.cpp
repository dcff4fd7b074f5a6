// A bus that is killed at random moments of every operation that uses it. For more rounds, or to repeat an earlier run:
//   KIV_KILL_ROUNDS=1000 KIV_KILL_SEED=7 bus_kill_test
#include "bus/BusTest.h"

#include <random>

namespace
{

using namespace kiv::test;
using testing::AnyOf;
using testing::AnyOfArray;
using testing::IsEmpty;

unsigned long Wish(const char* variable, unsigned long otherwise)
{
    const char* const value = g_getenv(variable);
    return value == nullptr ? otherwise : std::strtoul(value, nullptr, 10);
}

struct Kill : BusTest
{
    int AskForSerial()
    {
        const char* id = nullptr;
        const int code = manager.GetDeviceUniqueID(id);
        EXPECT_EQ(code == 0, id != nullptr);
        g_free(const_cast<char*>(id));
        return code;
    }

    int NotifyOfTwo()
    {
        int ids[] = {1, 2};
        char on[] = "on";
        char* statuses[] = {on, on};
        return facade.SendMultiOnOffNotiToServiceManager(imsi, 2, ids, statuses);
    }

    void RunAll()
    {
        for (const auto& [name, run, codes] : operations)
            EXPECT_EQ(0, run()) << name;
    }

    /// Each with its name and its result without a bus.
    const std::vector<std::tuple<const char*, std::function<int()>, std::vector<int>>> operations = {
        {"serial", [this] { return AskForSerial(); }, {1, 2}},
        {"service manager", [this] { return NotifyServiceManager(KIV_NOTI_TYPE_POLICY); }, {1, 2, 5}},
        {"walk", [this] { return NotifySubscribers(KIV_NOTI_TYPE_NUMBER_CHANGED); }, {0}},
        {"several", [this] { return NotifyOfTwo(); }, {0}},
        {"push", [this] { return manager.DeliverPushMessage("7", "data", "message", 1); }, {0}},
    };
};

TEST_F(Kill, AtAnyMomentDoesNotEndTheProcess)
{
    const unsigned long rounds = Wish("KIV_KILL_ROUNDS", Wish("KIV_TEST_LONG", 0) != 0 ? 2000 : 50),
                        seed = Wish("KIV_KILL_SEED", std::random_device{}());
    std::printf("%lu rounds, seed %lu\n", rounds, seed);
    // GDBus prints it after "Error while sending AddMatch()" or "GetNameOwner()" when the bus dies while a proxy is being made.
    PrivateBus::Tolerate(" message: The connection is closed");
    std::mt19937 random(static_cast<std::mt19937::result_type>(seed));
    for (unsigned long round = 0; round < rounds && !HasFailure(); ++round)
    {
        const auto& [name, run, codes] = operations[random() % operations.size()];
        SCOPED_TRACE(name + (", round " + std::to_string(round)));
        const gulong delayUs = random() % 3000;
        {
            Peer first(bus), second(bus), daemon(bus, kBoardDaemon, Peer::Reply("('KIV1',)")), serviceManager(bus, kServiceManager);
            store.records = {Record(first), {"org.example.Nobody", "/", "a.b"}, Record(second)};
            const auto kill = [&]
            {
                g_usleep(delayUs);
                bus.Stop();
            };
            const auto killer = std::async(std::launch::async, kill);
            while (killer.wait_for(std::chrono::seconds(0)) != std::future_status::ready)
            {
                EXPECT_THAT(run(), AnyOf(0, AnyOfArray(codes)));
                g_main_context_iteration(nullptr, FALSE);
            }
            EXPECT_THAT(run(), AnyOfArray(codes));
            Settle();
        }
        bus.Start();
        Peer client(bus), daemon(bus, kBoardDaemon, Peer::Reply("('KIV2',)")), serviceManager(bus, kServiceManager);
        store.records = {Record(client)};
        log.Take();
        RunAll();
        std::thread([this] { RunAll(); }).join();
        Settle();
        EXPECT_THAT(log.TakeErrors(), IsEmpty());
        EXPECT_EQ(8U, client.Calls().size());
    }
    PrivateBus::Tolerate(nullptr);
}

TEST_F(Kill, HasNoEffectOnceTheBusIsBack)
{
    g_autoptr(GMainContext) gone = g_main_context_new(); // not iterated before the end
    for (GMainContext* const maker : {static_cast<GMainContext*>(nullptr), gone})
    {
        SCOPED_TRACE(maker == nullptr ? "made in the main loop's context" : "made in a context that is gone");
        if (maker != nullptr)
            g_main_context_push_thread_default(maker);
        Connection agents(g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr));
        EXPECT_EQ(2, NotifyServiceManager(KIV_NOTI_TYPE_ACTIVATED)) << "there is no service manager";
        if (maker != nullptr)
            g_main_context_pop_thread_default(maker);
        bus.Stop();
        bus.Start();
        Peer client(bus), daemon(bus, kBoardDaemon, Peer::Reply("('KIV',)")), serviceManager(bus, kServiceManager);
        store.records = {Record(client)};
        while (!g_dbus_connection_is_closed(agents.get()))
            g_usleep(1000);
        log.Take();
        RunAll(); // before the loop notices the end
        Settle();
        RunAll(); // afterwards
        std::thread([this] { RunAll(); }).join();
        Settle();
        EXPECT_THAT(log.TakeErrors(), IsEmpty());
        EXPECT_EQ(12U, client.Calls().size());
        agents.reset();
        while (g_main_context_iteration(maker, FALSE))
            continue;
    }
}

} // namespace
