#include "Items.h"
#include "PrivateSystemBus.h"
#include "Ratios.h"

#include <DASystem.h>

namespace kiv::bench
{

namespace
{

constexpr char kImsi[] = "450050123456789";

/// The same proxies and calls, one after the other, in the loop that one would write first.
void NotifyBare(const std::vector<std::string>& paths)
{
    for (const std::string& path : paths)
    {
        g_autoptr(GError) error = nullptr;
        g_autoptr(GDBusProxy) proxy = g_dbus_proxy_new_for_bus_sync(
            G_BUS_TYPE_SYSTEM, G_DBUS_PROXY_FLAGS_NONE, nullptr, kServiceName, path.c_str(), kServiceName, nullptr, &error);
        g_autoptr(GVariant) reply =
            g_dbus_proxy_call_sync(proxy, "status", g_variant_new("((sis))", kImsi, static_cast<int>(paths.size()), "on"),
                G_DBUS_CALL_FLAGS_NONE, G_MAXINT, nullptr, &error);
        if (reply == nullptr)
            g_error("no answer: %s", error->message);
    }
}

void CompareFor(int count)
{
    // On both sides the agent holds the shared connection: without it the bare loop would connect anew for each proxy, and the
    // library for each notification.
    const auto library = [count](benchmark::State& state)
    {
        Subscribe("status", count);
        [[maybe_unused]] g_autoptr(GDBusConnection) connection = g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr);
        for (auto _ : state)
            DASystem::GetInstance()->SendNotiToServiceManager(
                KIV_NOTI_TYPE_STATUS_ON, kImsi, count, nullptr, nullptr, nullptr, nullptr);
    };
    const auto bare = [count](benchmark::State& state)
    {
        std::vector<std::string> paths;
        paths.reserve(static_cast<std::size_t>(count));
        for (int number = 0; number < count; ++number)
            paths.push_back(SubscriberPath(number));
        [[maybe_unused]] g_autoptr(GDBusConnection) connection = g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr);
        for (auto _ : state)
            NotifyBare(paths);
    };
    Compare("notification, subscribers: " + std::to_string(count) + ", against bare", {1.03}, Clock::Wall, library, bare);
}

} // namespace

void AddNotifications()
{
    for (const int count : {1, 10, 100, 1000})
        CompareFor(count);
}

} // namespace kiv::bench
