#include "support/Test.h"

#include <DAMutex.h>

namespace
{

TEST(NamedLocks, EqualTextsAreOneLockFromTheirFirstUse)
{
    constexpr int kThreads = 8;
    std::vector<std::atomic<int>> arrived(3000);
    std::vector<int> visits(arrived.size());
    const auto visitAll = [&]
    {
        for (std::size_t i = 0; i < arrived.size(); ++i)
        {
            const std::string name = "first use " + std::to_string(i);
            for (++arrived[i]; arrived[i] < kThreads;)
                std::this_thread::yield();
            DAMutex mutex(name.c_str());
            mutex.Lock();
            const int before = visits[i];
            std::this_thread::yield();
            visits[i] = before + 1;
            mutex.Unlock();
            const DAMutexLock lock(name.c_str());
            ++visits[i];
        }
    };
    std::vector<std::future<void>> threads(kThreads);
    for (std::future<void>& thread : threads)
        thread = std::async(std::launch::async, visitAll);
    threads.clear(); // waits for them
    EXPECT_EQ(std::vector<int>(visits.size(), 2 * kThreads), visits);
}

// If two of its names were the same lock, the thread would wait for itself.
TEST(NamedLocks, DifferentNamesAreDifferentLocksUntilTheProcessEnds)
{
    testing::FLAGS_gtest_death_test_style = "threadsafe"; // a new process, which takes its first lock after atexit()
    const auto holdMany = []
    {
        std::list<DAMutexLock> held;
        for (int i = 0; i < 60; ++i)
            held.emplace_back(i == 0 ? nullptr : ("a name that differs at its end " + std::to_string(i)).c_str());
    };
    std::atexit(holdMany);
    EXPECT_EXIT(holdMany(); std::exit(0), testing::ExitedWithCode(0), "");
}

} // namespace
