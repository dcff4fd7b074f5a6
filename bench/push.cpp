#include "BareBus.h"
#include "Items.h"
#include "Walk.h"

#include <DADBusManager.h>
#include <dlog.h>

#include <cstdarg>
#include <cstring>

namespace
{

int endedDeliveries = 0;

} // namespace

/// Replaces the platform's log. The library does not report the end of a delivery, but its last callback ends with a log line.
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

void PushByLibrary(const std::string& service, int count)
{
    endedDeliveries = 0;
    DADBusManager::GetInstance()->DeliverPushMessage(service.c_str(), "data", "message", kPushTime);
    while (endedDeliveries < count)
        g_main_context_iteration(nullptr, TRUE);
}

void MeasurePushes(Table& table, const PrivateSystemBus& bus)
{
    for (const int count : {1, 10, 100})
    {
        const auto library = [count] { PushByLibrary(std::to_string(count), count); };
        const auto bare = [count, paths = SubscriberPaths(count)] { PushBare(paths, std::to_string(count).c_str()); };
        CompareWalk(table, bus, {"push", "push", count, {1.03}, library, bare});
    }
}

} // namespace kiv::bench
