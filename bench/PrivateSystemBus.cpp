#include "PrivateSystemBus.h"

#include "BareBus.h"
#include "Ratios.h"

#include <DASubscriberStore.h>

#include <cstdio>
#include <cstdlib>
#include <ctime>

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

PrivateSystemBus::PrivateSystemBus()
{
    g_setenv("KIV_SUBSCRIBERS", folder_.File("subscribers.db").c_str(), TRUE);
    service_ = StartProgram({"/proc/self/exe", kServe});
    g_autoptr(GError) error = nullptr;
    shared_.reset(g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, &error));
    if (shared_ == nullptr)
        throw std::runtime_error(error->message);
    g_dbus_connection_set_exit_on_close(shared_.get(), FALSE);
}

PrivateSystemBus::~PrivateSystemBus()
{
    Kill(service_.get());
}

double PrivateSystemBus::WorkNs() const
{
    return CpuNs() + ProcessNs(bus_.Daemon()) + ProcessNs(service_.get());
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
