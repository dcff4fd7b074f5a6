// What pushes leave behind in a process that runs a main loop.
#include "bus/BusTest.h"

#include <malloc.h>
#include <unistd.h>

namespace
{

using namespace kiv::test;

TEST(Pushes, LeaveNextToNothingBehind)
{
    // The allocator's cache of each thread would look like growth. It is set up before main, so the program starts once more.
    if (g_getenv("GLIBC_TUNABLES") == nullptr)
    {
        setenv("GLIBC_TUNABLES", "glibc.malloc.tcache_count=0", 1);
        execl("/proc/self/exe", "growth_test", static_cast<char*>(nullptr));
    }
    PrivateBus bus;
    Subscribers store;
    Peer client(bus);
    client.Forget();
    store.records = {BusTest::Record(client)};
    auto& manager = *DADBusManager::GetInstance();
    int ended = 0;
    kiv::sim::SetLogSink([&](const kiv::sim::LogLine& line)
        { ended += line.text.find("proxy_call_cb") != std::string::npos && line.text.find("] end") != std::string::npos ? 1 : 0; });

    constexpr int kPushes = 10'000, kFirst = -500; // the first ones make what stays: the connection, GLib's types
    constexpr int kAtOnce = 50;
    std::size_t before = 0;
    for (int i = kFirst; i < kPushes; ++i)
    {
        if (i == 0)
            before = mallinfo2().uordblks;
        EXPECT_EQ(0, manager.DeliverPushMessage("7", "data", "message", i));
        store.asked.clear();
        while ((i - kFirst) % kAtOnce == kAtOnce - 1 && ended <= i - kFirst)
            g_main_context_iteration(nullptr, TRUE);
    }
    const auto growth = static_cast<double>(mallinfo2().uordblks) - static_cast<double>(before);
    kiv::sim::SetLogSink({});
    RecordProperty("bytes_per_push", std::to_string(growth / kPushes));
    EXPECT_LT(growth / kPushes, 64) << "bytes per push";
    EXPECT_EQ(kPushes - kFirst, ended);
    client.AwaitCalls(kPushes - kFirst);
}

} // namespace
