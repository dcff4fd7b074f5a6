#include "BareBus.h"
#include "BusMonitor.h"
#include "Items.h"
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

constexpr double kRoundSeconds = 1;

void CompareFor(Table& table, const PrivateSystemBus& bus, int count)
{
    Subscribe("push", count);
    const std::string number = std::to_string(count);
    const auto library = [&] { PushByLibrary(number, count); };
    const auto bare = [&, paths = SubscriberPaths(count)] { PushBare(paths, number.c_str()); };

    Compare(table, {"push to " + number + ", a subscriber, against bare", {1.05}, [&] { return bus.WorkNs(); },
                       static_cast<double>(count), {library, Drain}, {bare, Drain}, kRoundSeconds, "push", count});
    CompareMessages(table, bus, "push to " + number + ", messages on the bus", Order::Any, library, bare);
}

} // namespace

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
        CompareFor(table, bus, count);
}

} // namespace kiv::bench
