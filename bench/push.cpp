#include "Items.h"
#include "PrivateSystemBus.h"
#include "Ratios.h"

#include <DADBusManager.h>
#include <dlog.h>

#include <cstdarg>
#include <cstring>

namespace
{

int endedDeliveries = 0;

} // namespace

/// The log, in front of the platform's. The library tells nobody when a delivery has ended, but its last callback ends with a line.
int __dlog_print(log_id_t, int, const char*, const char* fmt, ...)
{
    std::va_list values;
    va_start(values, fmt);
    static_cast<void>(va_arg(values, const char*));
    const char* const function = va_arg(values, const char*);
    va_end(values);
    if (std::strcmp(function, "proxy_call_cb") == 0 && std::strstr(fmt, "] end") != nullptr)
        ++endedDeliveries;
    return 0;
}

namespace kiv::bench
{

namespace
{

constexpr gint64 kTime = 1'700'000'000;

/// Counts the bare deliveries under way.
int underWay = 0;

void BareCallDone(GObject* source, GAsyncResult* result, gpointer)
{
    g_autoptr(GDBusProxy) proxy = G_DBUS_PROXY(source);
    [[maybe_unused]] g_autoptr(GVariant) reply = g_dbus_proxy_call_finish(proxy, result, nullptr);
    --underWay;
}

void BareProxyDone(GObject*, GAsyncResult* result, gpointer)
{
    GDBusProxy* const proxy = g_dbus_proxy_new_for_bus_finish(result, nullptr);
    g_dbus_proxy_call(proxy, "push", g_variant_new("((sssx))", "7", "data", "message", kTime), G_DBUS_CALL_FLAGS_NONE, -1, nullptr,
        BareCallDone, nullptr);
}

void PushBare(const std::vector<std::string>& paths)
{
    for (const std::string& path : paths)
    {
        ++underWay;
        g_dbus_proxy_new_for_bus(G_BUS_TYPE_SYSTEM, G_DBUS_PROXY_FLAGS_NONE, nullptr, kServiceName, path.c_str(), kServiceName,
            nullptr, BareProxyDone, nullptr);
    }
    while (underWay > 0)
        g_main_context_iteration(nullptr, TRUE);
}

void CompareFor(int count)
{
    const auto library = [count](benchmark::State& state)
    {
        Subscribe("push", count);
        [[maybe_unused]] g_autoptr(GDBusConnection) connection = g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr);
        const std::string service = std::to_string(count);
        for (auto _ : state)
        {
            endedDeliveries = 0;
            DADBusManager::GetInstance()->DeliverPushMessage(service.c_str(), "data", "message", kTime);
            while (endedDeliveries < count)
                g_main_context_iteration(nullptr, TRUE);
        }
    };
    const auto bare = [count](benchmark::State& state)
    {
        std::vector<std::string> paths;
        paths.reserve(static_cast<std::size_t>(count));
        for (int number = 0; number < count; ++number)
            paths.push_back(SubscriberPath(number));
        [[maybe_unused]] g_autoptr(GDBusConnection) connection = g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr);
        for (auto _ : state)
            PushBare(paths);
    };
    Compare("push, subscribers: " + std::to_string(count) + ", against bare", {1.05}, Clock::Wall, library, bare);
}

} // namespace

void AddPushes()
{
    for (const int count : {1, 10, 100})
        CompareFor(count);
}

} // namespace kiv::bench
