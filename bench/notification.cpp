#include "BareBus.h"
#include "BusMonitor.h"
#include "Items.h"
#include "Ratios.h"

#include <DASystem.h>

namespace kiv::bench
{

namespace
{

constexpr double kRoundSeconds = 1;

void CompareFor(Table& table, const PrivateSystemBus& bus, int count)
{
    Subscribe("status", count);
    const std::string number = std::to_string(count);
    const auto work = [&] { return bus.WorkNs(); };
    const auto library = [count] {
        DASystem::GetInstance()->SendNotiToServiceManager(
            KIV_NOTI_TYPE_STATUS_ON, kImsi, count, nullptr, nullptr, nullptr, nullptr);
    };
    const auto bare = [count, paths = SubscriberPaths(count)] { NotifyBare(paths, count); };

    Compare(table, {"notification to " + number + ", a subscriber, against bare", {1.03}, work, static_cast<double>(count),
                       {library, Drain}, {bare, Drain}, kRoundSeconds, "notification", count});
    CompareMessages(table, bus, "notification to " + number + ", messages on the bus", Order::Same, library, bare);
    if (count == 1)
    {
        const auto findAndBare = [&]
        {
            Find("status", "1");
            bare();
        };
        Compare(table, {"notification to 1, against a store lookup and bare", {1.03}, work, 1, {library, Drain},
                           {findAndBare, Drain}, kRoundSeconds});
    }
    Drain();
}

} // namespace

void MeasureNotifications(Table& table, const PrivateSystemBus& bus)
{
    for (const int count : {1, 10, 100, 1000})
        CompareFor(table, bus, count);
}

} // namespace kiv::bench
