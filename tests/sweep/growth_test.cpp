// Memory that operations leave behind: pushes in a thread with a main loop, all others in a thread without one.
#include "sweep/Operations.h"

#include <DADBusManager.h>

#include <malloc.h>

namespace
{

/// The heap memory in use.
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
                before = {blocks, bytes};
            Session session;
            ASSERT_EQ(operation.good[0], operation.run(session)) << operation.name;
            if (operation.kind == Kind::Push && (i + 1) % 50 == 0)
                world.deliveries.Settle();
        }
        SCOPED_TRACE(operation.name);
        g_autoptr(GMainContext) unused = g_main_context_new();
        // GDBus's own thread may still clean up.
        IterateUntil([&] { return blocks - before.first <= calls / 2 && bytes - before.second <= calls * 64L; }, unused);
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
