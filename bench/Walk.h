#ifndef KIV_BENCH_WALK_H
#define KIV_BENCH_WALK_H

#include "PrivateSystemBus.h"
#include "Ratios.h"

namespace kiv::bench
{

/// A notification or push to a number of subscribers, by the library and by the bare loop.
struct Walk
{
    std::string name;
    const char* kind; ///< kind of the subscribers in the store; their number is the key
    int subscribers;
    Goal goal;
    Batch library, bare;
};

/// Adds the cost per subscriber to the table, compared with a lookup in the store and the bare loop.
void CompareWalk(Table& table, const PrivateSystemBus& bus, const Walk& walk);

} // namespace kiv::bench

#endif
