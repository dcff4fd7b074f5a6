#include "BareBus.h"

#include <gio/gio.h>

namespace kiv::bench
{

namespace
{

/// A push in progress.
struct Push
{
    const char* service;
    std::size_t unanswered;
};

void CallDone(GObject* source, GAsyncResult* result, gpointer push)
{
    g_autoptr(GDBusProxy) proxy = G_DBUS_PROXY(source);
    [[maybe_unused]] g_autoptr(GVariant) reply = g_dbus_proxy_call_finish(proxy, result, nullptr);
    --static_cast<Push*>(push)->unanswered;
}

void ProxyDone(GObject*, GAsyncResult* result, gpointer push)
{
    GDBusProxy* const proxy = g_dbus_proxy_new_for_bus_finish(result, nullptr);
    GVariant* const body = g_variant_new("((sssx))", static_cast<Push*>(push)->service, "data", "message", gint64{kPushTime});
    g_dbus_proxy_call(proxy, "push", body, G_DBUS_CALL_FLAGS_NONE, -1, nullptr, CallDone, push);
}

} // namespace

std::vector<std::string> SubscriberPaths(int count)
{
    std::vector<std::string> paths;
    for (int number = 0; number < count; ++number)
        paths.push_back("/org/example/Bench/" + std::to_string(number));
    return paths;
}

void NotifyBare(const std::vector<std::string>& paths, int serviceId)
{
    for (const std::string& path : paths)
    {
        g_autoptr(GError) error = nullptr;
        g_autoptr(GDBusProxy) proxy = g_dbus_proxy_new_for_bus_sync(
            G_BUS_TYPE_SYSTEM, G_DBUS_PROXY_FLAGS_NONE, nullptr, kServiceName, path.c_str(), kServiceName, nullptr, &error);
        g_autoptr(GVariant) reply = g_dbus_proxy_call_sync(
            proxy, "status", g_variant_new("((sis))", kImsi, serviceId, "on"), G_DBUS_CALL_FLAGS_NONE, G_MAXINT, nullptr, &error);
        if (reply == nullptr)
            g_error("no answer: %s", error->message);
    }
}

void PushBare(const std::vector<std::string>& paths, const char* service)
{
    Push push{service, paths.size()};
    for (const std::string& path : paths)
        g_dbus_proxy_new_for_bus(G_BUS_TYPE_SYSTEM, G_DBUS_PROXY_FLAGS_NONE, nullptr, kServiceName, path.c_str(), kServiceName,
            nullptr, ProxyDone, &push);
    while (push.unanswered > 0)
        g_main_context_iteration(nullptr, TRUE);
}

void Drain()
{
    while (g_main_context_iteration(nullptr, FALSE))
    {
    }
}

} // namespace kiv::bench
