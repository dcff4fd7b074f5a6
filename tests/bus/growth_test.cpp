// What notifications leave behind in a process that iterates no main loop.
#include "bus/BusTest.h"

#include <malloc.h>
#include <thread>
#include <unistd.h>

namespace
{

using namespace kiv::test;

TEST(Notifications, LeaveNextToNothingBehindInAThreadWithoutAMainLoop)
{
    // The allocator's cache of each thread would look like growth. It is set up before main, so the program starts once more.
    if (g_getenv("GLIBC_TUNABLES") == nullptr)
    {
        setenv("GLIBC_TUNABLES", "glibc.malloc.tcache_count=0", 1);
        execl("/proc/self/exe", "growth_test", static_cast<char*>(nullptr));
    }
    PrivateBus bus;
    Subscribers store;
    Peer client(bus), serviceManager(bus, kServiceManager);
    client.Forget();
    serviceManager.Forget();
    store.records = {BusTest::Record(client)};
    auto& manager = *DADBusManager::GetInstance();

    constexpr int kCalls = 5000, kFirst = -200; // the first ones make what stays: the connection, GLib's types
    char imsi[] = "450";
    std::size_t before = 0, after = 0;
    std::thread(
        [&]
        {
            for (int i = kFirst; i < kCalls; ++i)
            {
                if (i == 0)
                    before = mallinfo2().uordblks;
                ASSERT_EQ(0, i % 2 == 0 ? manager.SendAuthNotification(imsi, 1)
                                        : manager.SendNotiToServiceManager(
                                              KIV_NOTI_TYPE_AUTH_FAIL, imsi, 0, nullptr, nullptr, nullptr, nullptr));
                store.asked.clear();
            }
            after = mallinfo2().uordblks;
        })
        .join();
    const auto growth = static_cast<double>(after) - static_cast<double>(before);
    RecordProperty("bytes_per_call", std::to_string(growth / kCalls));
    EXPECT_LT(growth / kCalls, 64) << "bytes per call";
    client.AwaitCalls((kCalls - kFirst) / 2);
    serviceManager.AwaitCalls((kCalls - kFirst) / 2);
}

} // namespace
