// What operations leave behind: those that end with the call in a thread without a main loop, pushes in one with a loop.
#include "sweep/Operations.h"

#include <DADBusManager.h>

#include <malloc.h>

namespace
{

using namespace kiv::test;

constexpr double kMostBytes = 64; // a call

/// Runs an operation and a tenth more calls first, which make what stays: the connection, GLib's types.
template <class Run>
double BytesPerCall(int calls, Run run)
{
    std::size_t before = 0;
    for (int i = -calls / 10; i < calls; ++i)
    {
        if (i == 0)
            before = mallinfo2().uordblks;
        run(i);
    }
    return (static_cast<double>(mallinfo2().uordblks) - static_cast<double>(before)) / calls;
}

TEST(Growth, OfEachOperationIsNextToNothing)
{
    ASSERT_STREQ("glibc.malloc.tcache_count=0", g_getenv("GLIBC_TUNABLES")) << "the allocator's cache would look like growth";
    World world;
    const auto measure = [&](const Operation& operation)
    {
        const bool isPush = operation.kind == Kind::kPush;
        int error = 0; // held in the short form, since to connect for each call takes ten times as long
        const Connection connection(IsLong() || isPush ? nullptr : DADBusManager::GetInstance()->InitDbusConnection(&error));
        const int shortly = operation.kind == Kind::kBus ? 300 : 1000;
        const double bytes = BytesPerCall(IsLong() || isPush ? 5000 : shortly,
            [&](int i)
            {
                Session session;
                ASSERT_EQ(operation.good[0], operation.run(session)) << operation.name;
                if (isPush && (i % 50 == 0 || i == -1))
                    world.deliveries.Settle();
            });
        EXPECT_LT(bytes, kMostBytes) << operation.name;
    };
    for (const Operation& operation : Operations())
    {
        if (operation.kind == Kind::kPush)
            measure(operation);
        else
            std::thread(measure, operation).join();
    }
    world.deliveries.Settle();
}

} // namespace
