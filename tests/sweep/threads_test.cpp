// Eight threads on every operation at once, while a ninth changes the listener and what it hears of, the main thread iterates the
// main loop, and other processes change the subscriber store. With the support library's own locks.
#include "sweep/Operations.h"

#include <DASubscriberStore.h>
#include <DASystem.h>

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <algorithm>
#include <cstring>
#include <thread>

namespace
{

using namespace kiv::test;
namespace sim = kiv::sim;

thread_local const Operation* current = nullptr;

/// Subscribes and unsubscribes in another process, once it reads where the store is from a pipe. Started before there are threads.
pid_t ChangeStoreElsewhere(int pathPipe, const char* busname)
{
    using Store = DASubscriberStore;
    const pid_t process = fork();
    if (process != 0)
        return process;
    char path[256] = "";
    bool isRight = read(pathPipe, path, sizeof path) == sizeof path;
    setenv("KIV_SUBSCRIBERS", path, 1);
    const DASubscription subscription{"push", "6", {busname, "/x", "a.b"}};
    std::string reason;
    for (int i = 0; i < 50 && isRight; ++i)
        isRight = Store().Add(subscription, reason) == Store::Outcome::Done &&
                  Store().Remove(subscription, reason) == Store::Outcome::Done;
    _exit(isRight ? 0 : 1);
}

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
    int pathPipe[2];
    ASSERT_EQ(0, pipe(pathPipe));
    const pid_t others[] = {
        ChangeStoreElsewhere(pathPipe[0], "org.example.one"), ChangeStoreElsewhere(pathPipe[0], "org.example.two")};

    World world;
    char path[256] = "";
    world.directory.copy(path, sizeof path - 1);
    std::strcat(path, "/subscribers.db");
    for (int i = 0; i < 2; ++i)
        ASSERT_EQ(static_cast<ssize_t>(sizeof path), write(pathPipe[1], path, sizeof path));
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
    for (const pid_t other : others)
    {
        int status = -1;
        EXPECT_TRUE(waitpid(other, &status, 0) == other && status == 0);
    }
    sim::SetCallHook(nullptr);
    EXPECT_EQ(std::vector<std::string>(), sim::OpenHandles());
    EXPECT_EQ(std::vector<std::string>(), sim::TakeMisuses());
}

} // namespace
