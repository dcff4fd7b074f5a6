// Memory that operations leave behind: pushes in a thread with a main loop, all others in a thread without one.
#include "sweep/Operations.h"

#include <DADBusManager.h>

#include <malloc.h>

namespace
{

/// Returns the heap memory in use.
std::atomic<long> blocks{0}, bytes{0};

void* Count(void* block)
{
    blocks += block != nullptr ? 1 : 0;
    bytes += static_cast<long>(malloc_usable_size(block));
    return block;
}

void Discount(void* block)
{
    blocks -= block != nullptr ? 1 : 0;
    bytes -= static_cast<long>(malloc_usable_size(block));
}

} // namespace

// Replaces the allocator of the process: counts, and lets the C library do the work.
extern "C"
{
    void* __libc_malloc(std::size_t size);
    void* __libc_calloc(std::size_t count, std::size_t size);
    void* __libc_realloc(void* block, std::size_t size);
    void __libc_free(void* block);

    void* malloc(std::size_t size)
    {
        return Count(__libc_malloc(size));
    }
    void* calloc(std::size_t count, std::size_t size)
    {
        return Count(__libc_calloc(count, size));
    }
    void* realloc(void* block, std::size_t size)
    {
        Discount(block);
        return Count(__libc_realloc(block, size));
    }
    void free(void* block)
    {
        Discount(block);
        __libc_free(block);
    }
}

namespace
{

using namespace kiv::test;

/// Returns the memory in use after GDBus's own thread has cleaned up, when the number of blocks stays the same for a while.
std::pair<long, long> InUse()
{
    for (long last = -1, same = 0; same < 10; same = last == blocks ? same + 1 : 0)
    {
        last = blocks;
        g_usleep(100);
    }
    return {blocks, bytes};
}

/// Whether at most half a block and 64 bytes per call remain; GDBus's thread has ten seconds to clean up.
testing::AssertionResult HasGrownLittle(const std::pair<long, long>& before, int calls)
{
    const gint64 deadline = g_get_monotonic_time() + 10 * G_TIME_SPAN_SECOND;
    long moreBlocks = 0, moreBytes = 0;
    do
    {
        const auto [nowBlocks, nowBytes] = InUse();
        moreBlocks = nowBlocks - before.first;
        moreBytes = nowBytes - before.second;
        if (moreBlocks <= calls / 2 && moreBytes <= calls * 64L)
            return testing::AssertionSuccess();
    } while (g_get_monotonic_time() < deadline);
    return testing::AssertionFailure() << moreBlocks << " blocks, " << moreBytes << " bytes remain after " << calls << " calls";
}

TEST(Growth, IsBelowOneBlockPerCall)
{
    World world;
    int error = 0; // held in the short form, since connecting for each call takes longer
    const Connection connection(IsLong() ? nullptr : DADBusManager::GetInstance()->InitDbusConnection(&error));
    const auto measure = [&](const Operation& operation)
    {
        const int calls = IsLong() ? 5000 : operation.kind == Kind::Bus ? 50 : 500;
        std::pair<long, long> before;
        for (int i = -calls / 10; i < calls; ++i) // the first calls make what stays, like GLib's types
        {
            if (i == 0)
                before = InUse();
            Session session;
            ASSERT_EQ(operation.good[0], operation.run(session)) << operation.name;
            if (operation.kind == Kind::Push && (i + 1) % 50 == 0)
                world.deliveries.Settle();
        }
        EXPECT_TRUE(HasGrownLittle(before, calls)) << operation.name;
    };
    for (const Operation& operation : Operations())
    {
        if (operation.kind == Kind::Push)
            measure(operation);
        else
            std::thread(measure, operation).join();
    }
    world.deliveries.Settle();
}

} // namespace
