// Eight threads on every operation at once, while a ninth changes the listener and what it hears of, and the main thread iterates
// the main loop. With the support library's own locks.
#include "sweep/Operations.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <thread>

namespace
{

using namespace kiv::test;
namespace sim = kiv::sim;

thread_local const Operation* current = nullptr;

/// The one lock on SIM access is held by one thread at a time.
std::string CheckSimAccess(Call call, int)
{
    static std::atomic<int> inside{0};
    const Calls reads{Call::telephony_sim_get_state, Call::telephony_sim_get_subscriber_number, Call::tel_get_sim_imsi};
    const bool isRead = std::find(reads.begin(), reads.end(), call) != reads.end();
    if (current == nullptr || (current->lock != SimLock::kWhole && !isRead))
        return "";
    EXPECT_EQ(0, inside.fetch_add(1)) << sim::NameOf(call);
    std::this_thread::yield();
    inside.fetch_sub(1);
    return "";
}

void RunAll(const std::vector<const Operation*>& operations, std::size_t start, int rounds)
{
    for (std::size_t i = 0; i < operations.size() * static_cast<std::size_t>(rounds); ++i)
    {
        const Operation& operation = *operations[(start + i) % operations.size()];
        Session session;
        current = &operation;
        EXPECT_EQ(operation.good[0], operation.run(session)) << operation.name;
        current = nullptr;
    }
}

TEST(Threads, DoNotDisturbEachOther)
{
    World world;
    sim::SetCallHook(CheckSimAccess);

    std::vector<const Operation*> any, listening; // the latter on the thread that the changes arrive on
    for (const Operation& operation : Operations())
        (operation.kind == Kind::kListener ? listening : any).push_back(&operation);
    const int rounds = IsLong() ? 200 : 5;
    std::vector<std::thread> threads;
    std::atomic<int> running{0};
    const auto start = [&](auto work)
    {
        ++running;
        threads.emplace_back(
            [&running, work]
            {
                work();
                --running;
                g_main_context_wakeup(nullptr);
            });
    };
    for (std::size_t i = 0; i < 8; ++i)
        start([&, i] { RunAll(any, i * 16, rounds); });
    start([&] { RunAll(listening, 0, rounds * 20); });
    while (running > 0)
        g_main_context_iteration(nullptr, TRUE);
    for (std::thread& thread : threads)
        thread.join();
    world.FinishPushes();
    sim::SetCallHook(nullptr);
    EXPECT_EQ(std::vector<std::string>(), sim::OpenHandles());
    EXPECT_EQ(std::vector<std::string>(), sim::TakeMisuses());
}

} // namespace
