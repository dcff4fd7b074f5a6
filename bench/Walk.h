#ifndef KIV_BENCH_WALK_H
#define KIV_BENCH_WALK_H

#include "PrivateSystemBus.h"
#include "Ratios.h"

namespace kiv::bench
{

/// What is told to a number of subscribers, by the library and by the bare loop.
struct Walk
{
    std::string name;
    const char* kind; ///< under which the subscribers stand in the store, their number being the key
    int subscribers;
    Goal goal;
    Batch library, bare;
};

/// Adds to the table what a subscriber costs, against the bare loop after a lookup in the store.
void CompareWalk(Table& table, const PrivateSystemBus& bus, const Walk& walk);

} // namespace kiv::bench

#endif
