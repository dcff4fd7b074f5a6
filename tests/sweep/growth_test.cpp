// What operations leave behind: those that end with the call in a thread without a main loop, pushes in one with a loop.
#include "sweep/Operations.h"

#include <DADBusManager.h>

#include <malloc.h>

namespace
{

using namespace kiv::test;

TEST(Growth, OfEachOperationIsNextToNothing)
{
    ASSERT_STREQ("glibc.malloc.tcache_count=0", g_getenv("GLIBC_TUNABLES")) << "the allocator's cache would look like growth";
    World world;
    const auto measure = [&](const Operation& operation)
    {
        constexpr std::size_t kMostBytes = 64; // a call
        const bool isPush = operation.kind == Kind::Push;
        int error = 0; // held in the short form, since to connect for each call takes ten times as long
        const Connection connection(IsLong() || isPush ? nullptr : DADBusManager::GetInstance()->InitDbusConnection(&error));
        const int calls = IsLong() || isPush ? 5000 : operation.kind == Kind::Bus ? 300 : 1000;
        std::size_t before = 0;
        for (int i = -calls / 10; i < calls; ++i) // a tenth more first, which make what stays: the connection, GLib's types
        {
            if (i == 0)
                before = mallinfo2().uordblks;
            Session session;
            ASSERT_EQ(operation.good[0], operation.run(session)) << operation.name;
            if (isPush && (i + 1) % 50 == 0)
                world.deliveries.Settle();
        }
        EXPECT_LT(mallinfo2().uordblks, before + kMostBytes * static_cast<std::size_t>(calls)) << operation.name;
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
