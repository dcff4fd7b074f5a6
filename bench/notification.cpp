#include "BareBus.h"
#include "Items.h"
#include "Walk.h"

#include <DASystem.h>

namespace kiv::bench
{

void MeasureNotifications(Table& table, const PrivateSystemBus& bus)
{
    for (const int count : {1, 10, 100, 1000})
    {
        const auto library = [count] {
            DASystem::GetInstance()->SendNotiToServiceManager(
                KIV_NOTI_TYPE_STATUS_ON, kImsi, count, nullptr, nullptr, nullptr, nullptr);
        };
        const auto bare = [count, paths = SubscriberPaths(count)] { NotifyBare(paths, count); };
        CompareWalk(table, bus, {"notification", "status", count, {count == 1 ? 1.03 : 1.02}, library, bare});
    }
}

} // namespace kiv::bench
