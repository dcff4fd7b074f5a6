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

/// Starts a push to that many subscribers through the library and iterates the default main context until the last one ended.
void PushByLibrary(const std::string& service, int count);

constexpr char kGrowth[] = "--growth";

/// Prints the operation of the library that leaves most behind: bytes a call, and its name. For a process of its own.
int PrintGrowth();

} // namespace kiv::bench

#endif
