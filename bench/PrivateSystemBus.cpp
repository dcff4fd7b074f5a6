#include "PrivateSystemBus.h"

#include <DASubscriberStore.h>

#include <cstdio>
#include <cstdlib>
#include <filesystem>

namespace kiv::bench
{

namespace
{

[[noreturn]] void GiveUp(const char* what, const std::string& reason)
{
    std::fprintf(stderr, "benchmark: %s: %s\n", what, reason.c_str());
    std::exit(2);
}

GDBusMessage* AnswerCall(GDBusConnection* connection, GDBusMessage* message, gboolean incoming, gpointer)
{
    if (incoming == FALSE || g_dbus_message_get_message_type(message) != G_DBUS_MESSAGE_TYPE_METHOD_CALL)
        return message;
    g_autoptr(GDBusMessage) reply = g_dbus_message_new_method_reply(message);
    g_dbus_connection_send_message(connection, reply, G_DBUS_SEND_MESSAGE_FLAGS_NONE, nullptr, nullptr);
    g_object_unref(message);
    return nullptr;
}

} // namespace

int Serve()
{
    g_autoptr(GError) error = nullptr;
    g_autoptr(GDBusConnection) connection = g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, &error);
    if (connection == nullptr)
        GiveUp("bus", error->message);
    g_dbus_connection_add_filter(connection, AnswerCall, nullptr, nullptr);
    g_autoptr(GVariant) owned =
        g_dbus_connection_call_sync(connection, "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus",
            "RequestName", g_variant_new("(su)", kServiceName, 0U), nullptr, G_DBUS_CALL_FLAGS_NONE, -1, nullptr, &error);
    if (owned == nullptr)
        GiveUp("name", error->message);
    std::puts("ready");
    std::fflush(stdout);
    g_main_loop_run(g_main_loop_new(nullptr, FALSE));
    return 0;
}

PrivateSystemBus::PrivateSystemBus(const char* self) : bus_(g_test_dbus_new(G_TEST_DBUS_NONE))
{
    g_test_dbus_up(bus_);
    g_setenv("DBUS_SYSTEM_BUS_ADDRESS", g_test_dbus_get_bus_address(bus_), TRUE);

    g_autoptr(GError) error = nullptr;
    g_autofree char* folder = g_dir_make_tmp("kiv-bench-XXXXXX", &error);
    if (folder == nullptr)
        GiveUp("store", error->message);
    storeFolder_ = folder;
    g_setenv("KIV_SUBSCRIBERS", (storeFolder_ + "/subscribers.db").c_str(), TRUE);

    service_ = g_subprocess_new(G_SUBPROCESS_FLAGS_STDOUT_PIPE, &error, self, kServe, nullptr);
    char ready = 0;
    if (service_ == nullptr || g_input_stream_read(g_subprocess_get_stdout_pipe(service_), &ready, 1, nullptr, &error) != 1)
        GiveUp("client service", error == nullptr ? "ended" : error->message);
}

PrivateSystemBus::~PrivateSystemBus()
{
    g_subprocess_force_exit(service_);
    g_subprocess_wait(service_, nullptr, nullptr);
    g_object_unref(service_);
    g_test_dbus_stop(bus_);
    g_object_unref(bus_);
    std::filesystem::remove_all(storeFolder_);
}

std::string SubscriberPath(int number)
{
    return "/org/example/Bench/" + std::to_string(number);
}

void Subscribe(const char* kind, int count)
{
    DASubscriberStore store;
    for (int number = 0; number < count; ++number)
    {
        std::string reason;
        const auto outcome = store.Add({kind, std::to_string(count), {kServiceName, SubscriberPath(number), kServiceName}}, reason);
        if (outcome == DASubscriberStore::Outcome::Refused || outcome == DASubscriberStore::Outcome::Failed)
            GiveUp("store", reason);
    }
}

} // namespace kiv::bench
