#ifndef KIV_BENCH_ITEMS_H
#define KIV_BENCH_ITEMS_H

#include "Table.h"

#include <string>

namespace kiv::bench
{

class PrivateSystemBus;

/// Each measures its items and adds them to the table.
void MeasureLookups(Table& table);
void MeasureSimQueries(Table& table);
void MeasureDeviceQueries(Table& table);
void MeasureStore(Table& table);
void MeasureNotifications(Table& table, const PrivateSystemBus& bus);
void MeasurePushes(Table& table, const PrivateSystemBus& bus);
void MeasureMemory(Table& table);

/// Pushes to that many subscribers through the library and iterates the default main context until the last delivery has ended.
void PushByLibrary(const std::string& service, int count);

constexpr char kGrowth[] = "--growth";

/// Prints the bytes per call and the name of the operation that leaves most memory behind. Call it in a separate process.
int PrintGrowth();

} // namespace kiv::bench

#endif
