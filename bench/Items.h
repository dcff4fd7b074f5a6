#ifndef KIV_BENCH_ITEMS_H
#define KIV_BENCH_ITEMS_H

namespace kiv::bench
{

/// Each registers its pairs.
void AddLookups();
void AddSimQueries();
void AddDeviceQueries();
void AddNotifications();
void AddPushes();

} // namespace kiv::bench

#endif
