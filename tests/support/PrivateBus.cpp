#include "support/PrivateBus.h"

#include <gtest/gtest.h>

#include <csignal>
#include <cstdlib>
#include <fcntl.h>
#include <poll.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

namespace kiv::test
{

namespace
{

const char* tolerated = nullptr;

GLogWriterOutput Complain(GLogLevelFlags level, const GLogField* fields, gsize count, gpointer)
{
    if ((level & G_LOG_LEVEL_MASK) <= G_LOG_LEVEL_MESSAGE)
    {
        g_autofree gchar* text = g_log_writer_format_fields(level, fields, count, FALSE);
        if (tolerated == nullptr || g_strrstr(text, tolerated) == nullptr)
            ADD_FAILURE() << "GLib says: " << text;
    }
    return G_LOG_WRITER_HANDLED;
}

} // namespace

PrivateBus::PrivateBus() : address_("unix:abstract=kiv-test-bus-" + std::to_string(getpid()) + '-' + std::to_string(g_random_int()))
{
    static const bool once = (g_log_set_writer_func(Complain, nullptr, nullptr), true);
    static_cast<void>(once);
    setenv("DBUS_SYSTEM_BUS_ADDRESS", address_.c_str(), 1);
    Start();
}

PrivateBus::~PrivateBus()
{
    Stop();
}

void PrivateBus::Start()
{
    const std::lock_guard lock(mutex_);
    int ready[2];
    ASSERT_EQ(0, pipe(ready));
    const std::string address = "--address=" + address_;
    const std::string print = "--print-address=" + std::to_string(ready[1]);
    const pid_t parent = getpid();
    pid_ = fork();
    if (pid_ == 0)
    {
        prctl(PR_SET_PDEATHSIG, SIGKILL);
        dup2(open("/dev/null", O_WRONLY | O_CLOEXEC), STDERR_FILENO); // where it may not raise its limits it says so, each time
        if (getppid() == parent)
            execlp("dbus-daemon", "dbus-daemon", "--config-file=" KIV_PRIVATE_BUS_CONF, "--nofork", address.c_str(), print.c_str(),
                static_cast<char*>(nullptr));
        _exit(127);
    }
    close(ready[1]);
    pollfd said{ready[0], POLLIN, 0};
    char first = 0;
    const bool answered = poll(&said, 1, 10'000) == 1 && read(ready[0], &first, 1) == 1;
    close(ready[0]);
    ASSERT_TRUE(pid_ > 0 && answered) << "dbus-daemon does not start";
}

void PrivateBus::Stop()
{
    const std::lock_guard lock(mutex_);
    if (pid_ > 0)
    {
        kill(pid_, SIGKILL);
        waitpid(pid_, nullptr, 0);
    }
    pid_ = -1;
}

void PrivateBus::Tolerate(const char* message)
{
    tolerated = message;
}

Connection PrivateBus::Connect() const
{
    constexpr auto kFlags = static_cast<GDBusConnectionFlags>(
        G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT | G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION);
    g_autoptr(GError) error = nullptr;
    Connection connection(g_dbus_connection_new_for_address_sync(address_.c_str(), kFlags, nullptr, nullptr, &error));
    EXPECT_TRUE(connection) << error->message;
    return connection;
}

} // namespace kiv::test
