// Eight threads run every operation at once. A ninth exchanges the listener and changes values that it is notified of, and the main
// thread iterates the main loop. Uses the support library's real locks.
#include "sweep/Operations.h"

namespace
{

using namespace kiv::test;
namespace platform = kiv::platform;

void RunAll(const std::vector<const Operation*>& operations, std::size_t start, int rounds)
{
    for (std::size_t i = 0; i < operations.size() * static_cast<std::size_t>(rounds); ++i)
    {
        const Operation& operation = *operations[(start + i) % operations.size()];
        Session session;
        EXPECT_EQ(operation.good[0], operation.run(session)) << operation.name;
    }
}

TEST(Threads, DoNotDisturbEachOther)
{
    World world;
    std::vector<const Operation*> any, listening; // the latter on the thread that the changes arrive on
    for (const Operation& operation : Operations())
        (operation.kind == Kind::Listener ? listening : any).push_back(&operation);
    const int rounds = IsLong() ? 200 : 5;
    std::vector<std::future<void>> threads;
    for (std::size_t i = 0; i < 8; ++i)
        threads.push_back(std::async(std::launch::async, [&, i] { RunAll(any, i * 16, rounds); }));
    threads.push_back(std::async(std::launch::async, [&] { RunAll(listening, 0, rounds * 20); }));
    for (const std::future<void>& thread : threads)
    {
        while (thread.wait_for(std::chrono::milliseconds(1)) != std::future_status::ready)
            while (g_main_context_iteration(nullptr, FALSE))
                continue;
    }
    world.deliveries.Settle();
    EXPECT_EQ(std::vector<std::string>(), platform::OpenHandles());
    EXPECT_EQ(std::vector<std::string>(), platform::TakeMisuses());
}

} // namespace
