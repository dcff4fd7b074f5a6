#include "BusDaemon.h"

#include <csignal>
#include <stdexcept>
#include <sys/prctl.h>
#include <unistd.h>
#include <utility>

namespace kiv::bench
{

Process StartProgram(std::vector<const char*> command)
{
    constexpr auto kFlags = static_cast<GSubprocessFlags>(G_SUBPROCESS_FLAGS_STDOUT_PIPE | G_SUBPROCESS_FLAGS_STDERR_SILENCE);
    g_autoptr(GSubprocessLauncher) launcher = g_subprocess_launcher_new(kFlags);
    g_subprocess_launcher_set_child_setup(
        launcher, [](gpointer) { prctl(PR_SET_PDEATHSIG, SIGKILL); }, nullptr, nullptr);
    g_autoptr(GError) error = nullptr;
    command.push_back(nullptr);
    Process process(g_subprocess_launcher_spawnv(launcher, command.data(), &error));
    char ready = 0;
    if (process == nullptr || g_input_stream_read(g_subprocess_get_stdout_pipe(process.get()), &ready, 1, nullptr, &error) != 1)
        throw std::runtime_error(std::string(command[0]) + ": " + (error == nullptr ? "ended" : error->message));
    return process;
}

void Kill(GSubprocess* program)
{
    g_subprocess_force_exit(program);
    g_subprocess_wait(program, nullptr, nullptr);
}

BusDaemon::BusDaemon(std::string configuration)
    : address_("unix:abstract=kiv-bus-" + std::to_string(getpid()) + '-' + std::to_string(g_random_int())),
      configuration_("--config-file=" + (configuration.empty() ? KIV_PRIVATE_BUS_CONF : std::move(configuration)))
{
    g_setenv("DBUS_SYSTEM_BUS_ADDRESS", address_.c_str(), TRUE);
    Start();
}

BusDaemon::~BusDaemon()
{
    Stop();
}

void BusDaemon::Start()
{
    const std::lock_guard lock(mutex_);
    const std::string address = "--address=" + address_;
    daemon_ = StartProgram({"dbus-daemon", configuration_.c_str(), "--nofork", "--print-address", address.c_str()});
}

void BusDaemon::Stop()
{
    const std::lock_guard lock(mutex_);
    if (daemon_)
        Kill(daemon_.get());
    daemon_.reset();
}

Connection BusDaemon::Connect() const
{
    constexpr auto kFlags = static_cast<GDBusConnectionFlags>(
        G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT | G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION);
    g_autoptr(GError) error = nullptr;
    Connection connection(g_dbus_connection_new_for_address_sync(address_.c_str(), kFlags, nullptr, nullptr, &error));
    if (connection == nullptr)
        throw std::runtime_error(error->message);
    return connection;
}

} // namespace kiv::bench
