// The subscription service, started by a bus: it ends when idle, is killed, and has many clients.
// With KIV_TEST_LONG=1, 100 clients come and leave for 30 seconds.
#include "services/Client.h"

#include <DADBusManager.h>

#include <csignal>
#include <random>

namespace kiv::test
{
namespace
{

namespace fs = std::filesystem;
using std::chrono::steady_clock;
using testing::Contains;

bool IsLong()
{
    return g_strcmp0(g_getenv("KIV_TEST_LONG"), "1") == 0;
}

/// Writes the files of a bus that starts the service on demand. @return its configuration
std::string Configure(const fs::path& folder, const std::string& idleSeconds)
{
    // The service inherits the bus's output, a pipe that is not read.
    std::ofstream(folder / "org.kiv.Subscriptions.service")
        << "[D-BUS Service]\nName=org.kiv.Subscriptions\nExec=/bin/sh -c 'exec " KIV_SUBSCRIPTION_SERVICE " --idle " << idleSeconds
        << " >/dev/null'\n";
    std::ofstream(folder / "bus.conf")
        << "<busconfig><type>system</type><listen>unix:tmpdir=/tmp</listen><auth>EXTERNAL</auth><servicedir>" << folder.string()
        << "</servicedir><policy context='default'><allow user='*'/><allow own='*'/><allow send_destination='*'/>"
           "<allow receive_sender='*'/></policy></busconfig>";
    return folder / "bus.conf";
}

struct OnDemand
{
    explicit OnDemand(const std::string& idleSeconds) : bus(Configure(folder.path, idleSeconds)), client(bus) { client.Own(kMail); }
    ~OnDemand()
    {
        if (const pid_t service = Process(); service > 0)
            kill(service, SIGKILL);
    }

    /// The service's process; 0 when the name has no owner.
    pid_t Process() const
    {
        g_autoptr(GVariant) reply = g_dbus_connection_call_sync(client.Bus(), "org.freedesktop.DBus", "/org/freedesktop/DBus",
            "org.freedesktop.DBus", "GetConnectionUnixProcessID", g_variant_new("(s)", "org.kiv.Subscriptions"), nullptr,
            G_DBUS_CALL_FLAGS_NONE, -1, nullptr, nullptr);
        guint32 process = 0;
        if (reply != nullptr)
            g_variant_get(reply, "(u)", &process);
        return static_cast<pid_t>(process);
    }

    const StoreFolder folder;
    const PrivateBus bus;
    Client client;
    std::mt19937 random{std::random_device{}()};
};

TEST(SubscriptionService, LosesNoCallWhenItEndsIdle)
{
    OnDemand on("0.001");
    std::set<pid_t> processes;
    for (int round = 0; round < (IsLong() ? 2000 : 80); ++round)
    {
        const bool isMail = round % 4 < 2;
        Client leaves(on.bus);
        Client& client = isMail ? on.client : leaves;
        ASSERT_EQ("(true,)", client.Change(round % 4 == 1 ? "Unsubscribe" : "Subscribe", isMail ? kMail : "")) << client.reason;
        processes.insert(on.Process());
        leaves.Close();
        if (!isMail)
            AwaitStored({});
    }
    EXPECT_LT(2U, processes.size());
}

TEST(SubscriptionService, KeepsTheStoreCorrectWheneverItIsKilled)
{
    OnDemand on("60");
    Client stays(on.bus);
    while (stays.Change("Subscribe", "") != "(true,)")
        continue;
    for (int round = 0; round < (IsLong() ? 1000 : 30); ++round)
    {
        Client leaves(on.bus);
        const auto victim = on.Process();
        const auto killer = std::async(std::launch::async,
            [victim, delay = on.random() % 8000]
            {
                g_usleep(delay);
                return victim > 0 ? kill(victim, SIGKILL) : 0;
            });
        const char* const method = round % 2 == 0 ? "Subscribe" : "Unsubscribe";
        // If the answer is lost with the service, the change may be done; then the second call finds it done.
        std::string answer;
        while ((answer = on.client.Change(method, kMail)) == "NoReply")
            continue;
        EXPECT_THAT(answer, testing::AnyOf("(true,)", "(false,)")) << on.client.reason;
        while (leaves.Change("Subscribe", "") == "NoReply")
            continue;
        EXPECT_THAT(Stored(), Contains(leaves.UniqueName()));
        killer.wait();
        leaves.Close();
        while ((answer = on.client.Call("List")) == "NoReply")
            continue;
        auto expected = std::vector{stays.UniqueName()};
        if (round % 2 == 0)
            expected.emplace_back(kMail);
        AwaitStored(expected);
    }
}

/// The number of notifications that began, and of those that have ended.
struct Sent
{
    std::atomic<int> begun{0};
    std::atomic<int> ended{0};
};

/// One client after the other subscribes, stays for a notification, and leaves. @return how many clients came
int ComeAndLeave(const PrivateBus& bus, const Sent& sent, steady_clock::time_point end)
{
    int clients = 0;
    for (; steady_clock::now() < end; ++clients)
    {
        Client client(bus);
        const int mayFrom = sent.begun; // the notification may look for its subscribers later
        EXPECT_EQ("(true,)", client.Change("Subscribe", "")) << client.reason;
        const int mustFrom = sent.begun + 1;
        while (sent.ended < mustFrom && steady_clock::now() < end)
            g_usleep(1000);
        const int mustTo = sent.ended;
        if (clients % 2 == 0)
            EXPECT_EQ("(true,)", client.Change("Unsubscribe", "")) << client.reason;
        else
            client.Close();
        const int mayTo = sent.begun;
        while (sent.ended < mayTo && steady_clock::now() < end)
            g_usleep(1000);

        std::map<int, int> heard;
        for (const std::string& call : client.Calls())
            ++heard[std::atoi(call.c_str() + call.find(", ") + 2)];
        for (const auto& [number, times] : heard)
        {
            EXPECT_EQ(1, times) << number;
            EXPECT_LE(mayFrom, number);
            EXPECT_GE(mayTo, number);
        }
        for (int number = mustFrom; number <= mustTo; ++number)
            EXPECT_EQ(1U, heard.count(number)) << number;
    }
    return clients;
}

struct Usage
{
    long memoryKiB;
    std::ptrdiff_t descriptors;
};

Usage UsageOf(pid_t process)
{
    const fs::path folder = "/proc/" + std::to_string(process);
    std::ifstream file(folder / "statm");
    long total = 0, resident = 0;
    file >> total >> resident;
    const fs::directory_iterator open(folder / "fd");
    return {resident * sysconf(_SC_PAGESIZE) / 1024, std::distance(begin(open), end(open))};
}

TEST(SubscriptionService, ServesManyClientsThatComeAndLeave)
{
    const std::size_t clients = IsLong() ? 100 : 20;
    const auto period = std::chrono::milliseconds(IsLong() ? 30'000 : 1'000);
    OnDemand on("60");
    platform::SetLogSink([](const platform::LogLine&) {});
    Sent sent;
    const auto run = [&](std::chrono::milliseconds time)
    {
        const auto end = steady_clock::now() + time;
        std::vector<std::future<int>> comers;
        for (std::size_t i = 0; i < clients; ++i)
            comers.push_back(std::async(std::launch::async, ComeAndLeave, std::cref(on.bus), std::cref(sent), end));
        char imsi[] = "450";
        while (steady_clock::now() < end)
        {
            EXPECT_EQ(0, DADBusManager::GetInstance()->SendAuthNotification(imsi, ++sent.begun));
            ++sent.ended;
        }
        int came = 0;
        for (auto& comer : comers)
            came += comer.get();
        IterateUntil([&] { return on.client.Call("List") == "([],)"; });
        return came;
    };
    run(period / 10);
    const pid_t process = on.Process();
    const Usage before = UsageOf(process);
    const int came = run(period);
    const Usage after = UsageOf(process);
    platform::SetLogSink(nullptr);
    std::printf("%d clients, %d notifications; memory %ld, then %ld KiB; descriptors %td, then %td\n", came, sent.ended.load(),
        before.memoryKiB, after.memoryKiB, before.descriptors, after.descriptors);
    EXPECT_EQ(process, on.Process());
#ifndef KIV_EMULATED
    EXPECT_EQ(before.descriptors, after.descriptors);
#endif
#if !defined(__SANITIZE_ADDRESS__) && !defined(__SANITIZE_THREAD__) && !defined(KIV_EMULATED) // which keep freed memory
    EXPECT_GE(before.memoryKiB + 1024, after.memoryKiB);
#endif
}

} // namespace
} // namespace kiv::test
