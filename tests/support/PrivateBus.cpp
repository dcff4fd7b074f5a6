#include "support/PrivateBus.h"

#include <csignal>
#include <sys/prctl.h>
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
    g_autoptr(GSubprocessLauncher) launcher = g_subprocess_launcher_new(
        static_cast<GSubprocessFlags>(G_SUBPROCESS_FLAGS_STDOUT_PIPE | G_SUBPROCESS_FLAGS_STDERR_SILENCE));
    g_subprocess_launcher_set_child_setup(
        launcher, [](gpointer) { prctl(PR_SET_PDEATHSIG, SIGKILL); }, nullptr, nullptr);
    daemon_.reset(g_subprocess_launcher_spawn(launcher, nullptr, "dbus-daemon", "--config-file=" KIV_PRIVATE_BUS_CONF, "--nofork",
        "--print-address", ("--address=" + address_).c_str(), nullptr));
    char first = 0;
    ASSERT_TRUE(daemon_ && g_input_stream_read(g_subprocess_get_stdout_pipe(daemon_.get()), &first, 1, nullptr, nullptr) == 1)
        << "dbus-daemon does not start";
}

void PrivateBus::Stop()
{
    const std::lock_guard lock(mutex_);
    if (!daemon_)
        return;
    g_subprocess_force_exit(daemon_.get());
    g_subprocess_wait(daemon_.get(), nullptr, nullptr);
    daemon_.reset();
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
