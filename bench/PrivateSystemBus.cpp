#include "PrivateSystemBus.h"

#include "BareBus.h"
#include "Ratios.h"

#include <DASubscriberStore.h>

#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <sys/prctl.h>
#include <vector>

namespace kiv::bench
{

namespace
{

GDBusMessage* AnswerCall(GDBusConnection* connection, GDBusMessage* message, gboolean incoming, gpointer)
{
    if (incoming == FALSE || g_dbus_message_get_message_type(message) != G_DBUS_MESSAGE_TYPE_METHOD_CALL)
        return message;
    g_autoptr(GDBusMessage) reply = g_dbus_message_new_method_reply(message);
    g_dbus_connection_send_message(connection, reply, G_DBUS_SEND_MESSAGE_FLAGS_NONE, nullptr, nullptr);
    g_object_unref(message);
    return nullptr;
}

/// Starts a process that says in a line when it is ready, and dies with this one.
std::unique_ptr<GSubprocess, Unref> Start(std::vector<const char*> command)
{
    constexpr auto kFlags = static_cast<GSubprocessFlags>(G_SUBPROCESS_FLAGS_STDOUT_PIPE | G_SUBPROCESS_FLAGS_STDERR_SILENCE);
    const std::unique_ptr<GSubprocessLauncher, Unref> launcher(g_subprocess_launcher_new(kFlags));
    g_subprocess_launcher_set_child_setup(
        launcher.get(), [](gpointer) { prctl(PR_SET_PDEATHSIG, SIGKILL); }, nullptr, nullptr);
    g_autoptr(GError) error = nullptr;
    command.push_back(nullptr);
    std::unique_ptr<GSubprocess, Unref> process(g_subprocess_launcher_spawnv(launcher.get(), command.data(), &error));
    char ready = 0;
    if (!process || g_input_stream_read(g_subprocess_get_stdout_pipe(process.get()), &ready, 1, nullptr, &error) != 1)
        throw std::runtime_error(std::string(command[0]) + ": " + (error == nullptr ? "ended" : error->message));
    return process;
}

double ProcessNs(GSubprocess* process)
{
    clockid_t clock{};
    timespec used{};
    clock_getcpuclockid(std::stoi(g_subprocess_get_identifier(process)), &clock);
    clock_gettime(clock, &used);
    return static_cast<double>(used.tv_sec) * 1e9 + static_cast<double>(used.tv_nsec);
}

} // namespace

OneProcessor::OneProcessor() : before_{}
{
    sched_getaffinity(0, sizeof before_, &before_);
    cpu_set_t one;
    CPU_ZERO(&one);
    CPU_SET(static_cast<unsigned>(sched_getcpu()), &one);
    sched_setaffinity(0, sizeof one, &one);
}

OneProcessor::~OneProcessor()
{
    sched_setaffinity(0, sizeof before_, &before_);
}

int Serve()
{
    g_autoptr(GError) error = nullptr;
    g_autoptr(GDBusConnection) connection = g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, &error);
    if (connection == nullptr)
        throw std::runtime_error(error->message);
    g_dbus_connection_add_filter(connection, AnswerCall, nullptr, nullptr);
    for (const char* const name : {kServiceName, "org.tizen.system.deviced"})
    {
        g_autoptr(GVariant) owned =
            g_dbus_connection_call_sync(connection, "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
                "RequestName", g_variant_new("(su)", name, 0U), nullptr, G_DBUS_CALL_FLAGS_NONE, -1, nullptr, &error);
        if (owned == nullptr)
            throw std::runtime_error(error->message);
    }
    std::puts("ready");
    std::fflush(stdout);
    g_main_loop_run(g_main_loop_new(nullptr, FALSE));
    return 0;
}

PrivateSystemBus::PrivateSystemBus() : address_("unix:path=" + folder_.File("bus"))
{
    const std::string address = "--address=" + address_;
    bus_ = Start({"dbus-daemon", "--config-file=" KIV_PRIVATE_BUS_CONF, "--nofork", "--print-address", address.c_str()});
    g_setenv("DBUS_SYSTEM_BUS_ADDRESS", address_.c_str(), TRUE);
    g_setenv("KIV_SUBSCRIBERS", folder_.File("subscribers.db").c_str(), TRUE);

    service_ = Start({"/proc/self/exe", kServe});
    g_autoptr(GError) error = nullptr;
    shared_.reset(g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, &error));
    if (!shared_)
        throw std::runtime_error(error->message);
    g_dbus_connection_set_exit_on_close(shared_.get(), FALSE);
}

PrivateSystemBus::~PrivateSystemBus()
{
    for (GSubprocess* const process : {service_.get(), bus_.get()})
    {
        g_subprocess_force_exit(process);
        g_subprocess_wait(process, nullptr, nullptr);
    }
}

double PrivateSystemBus::WorkNs() const
{
    return CpuNs() + ProcessNs(bus_.get()) + ProcessNs(service_.get());
}

Connection PrivateSystemBus::Connect() const
{
    constexpr auto kFlags = static_cast<GDBusConnectionFlags>(
        G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT | G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION);
    g_autoptr(GError) error = nullptr;
    Connection connection(g_dbus_connection_new_for_address_sync(address_.c_str(), kFlags, nullptr, nullptr, &error));
    if (!connection)
        throw std::runtime_error(error->message);
    return connection;
}

void Find(const char* kind, const char* key)
{
    std::list<_SubscriberInfo> subscribers;
    std::string reason;
    if (DASubscriberStore().Find(kind, key, subscribers, reason) != DASubscriberStore::Outcome::Done || subscribers.empty())
        throw std::runtime_error("nothing is found " + reason);
}

void Subscribe(const char* kind, int count)
{
    DASubscriberStore store;
    for (const std::string& path : SubscriberPaths(count))
    {
        std::string reason;
        const auto outcome = store.Add({kind, std::to_string(count), {kServiceName, path, kServiceName}}, reason);
        if (outcome == DASubscriberStore::Outcome::Refused || outcome == DASubscriberStore::Outcome::Failed)
            throw std::runtime_error(reason);
    }
}

} // namespace kiv::bench
