// The bus in processes made by fork.
#include "bus/BusTest.h"

#include <sys/wait.h>
#include <unistd.h>

namespace
{

using namespace kiv::test;

/// Runs a function in a child. Kills the child after 20 seconds, which is less than GDBus waits for an answer.
pid_t Start(const std::function<bool()>& run)
{
    const pid_t child = fork();
    if (child == 0)
    {
        alarm(20);
        _exit(run() ? 0 : 1);
    }
    return child;
}

/// Waits until all other threads sleep, which is when they hold no lock that a child would inherit.
void AwaitSleepOfOthers()
{
    const auto areAsleep = []
    {
        const std::string self = std::to_string(gettid());
        for (const auto& thread : std::filesystem::directory_iterator("/proc/self/task"))
        {
            std::string stat;
            std::getline(std::ifstream(thread.path() / "stat"), stat);
            if (thread.path().filename() != self && stat.find(") S ") == std::string::npos)
                return false;
        }
        return true;
    };
    IterateUntil([&] { return areAsleep() && areAsleep(); });
}

bool Succeeds(pid_t child)
{
    int status = 1;
    waitpid(child, &status, 0);
    return status == 0;
}

/// Makes the library's calls. @return how many failed
std::size_t CallAll(const std::string& subscriber)
{
    Subscribers store;
    store.records = {{subscriber, "/example/client", "org.example.Client"}};
    Deliveries deliveries;
    LogCapture log;
    char imsi[] = "450";
    const char* id = nullptr;
    DADBusManager& manager = *DADBusManager::GetInstance();
    std::size_t failures = 0;
    failures += manager.GetDeviceUniqueID(id) != 0;
    g_free(const_cast<char*>(id));
    failures += manager.SendNotiToServiceManager(KIV_NOTI_TYPE_ACTIVATED, imsi, 0, "", "", "", "") != 0;
    log.Take();
    manager.SendActivatedNotification(imsi, 1);
    manager.DeliverPushMessage("7", "data", "message", 1);
    deliveries.Settle();
    for (const std::string& line : log.TakeErrors())
        failures += line.find("Unable to create proxy: The bus was used before the process was forked") != std::string::npos;
    return failures;
}

/// A child made before GLib has any thread. It uses the bus after it receives the addresses of bus and subscriber.
struct EarlyChild
{
    EarlyChild()
    {
        EXPECT_EQ(0, pipe(ends));
        const auto run = [this]
        {
            char address[200] = {}, subscriber[200] = {};
            EXPECT_EQ(200, read(ends[0], address, 200));
            EXPECT_EQ(200, read(ends[0], subscriber, 200));
            g_setenv("DBUS_SYSTEM_BUS_ADDRESS", address, TRUE);
            return CallAll(subscriber) == 0;
        };
        child = Start(run);
    }

    void Tell(std::string text) const
    {
        text.resize(200);
        EXPECT_EQ(200, write(ends[1], text.data(), 200));
    }

    int ends[2] = {};
    pid_t child;
} const early;

TEST(Fork, DeniesTheBusOnlyToChildrenOfItsUsers)
{
    const PrivateBus bus;
    const Peer client(bus), daemon(bus, kBoardDaemon, Peer::Reply("('KIV1',)")), serviceManager(bus, kServiceManager);
    early.Tell(g_getenv("DBUS_SYSTEM_BUS_ADDRESS"));
    early.Tell(client.Name());
    EXPECT_TRUE(Succeeds(early.child));
    EXPECT_EQ(2U, client.Calls().size());

    const Connection held(g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr)); // else GDBus is still closing it at the fork
    EXPECT_EQ(0U, CallAll(client.Name()));
    AwaitSleepOfOthers();
    EXPECT_TRUE(Succeeds(Start([&] { return CallAll(client.Name()) == 4; }))) << "fails at once where the parent used the bus";
    EXPECT_EQ(4U, client.Calls().size());
    EXPECT_EQ(0U, CallAll(client.Name())) << "the parent goes on";
}

} // namespace
