#ifndef KIV_BENCH_WALK_H
#define KIV_BENCH_WALK_H

#include "PrivateSystemBus.h"
#include "Ratios.h"

namespace kiv::bench
{

enum class Order
{
    Same,
    Any ///< where it depends on when the replies arrive
};

/// What is told to a number of subscribers, by the library and by the bare loop.
struct Walk
{
    std::string name;
    const char* kind; ///< under which the subscribers stand in the store, their number being the key
    int subscribers;
    Goal goal;
    Order order;
    Batch library, bare;
};

/// Adds to the table what a subscriber costs and whether the messages are the same; for one subscriber also what it costs against
/// a bare loop that looks it up in the store.
void CompareWalk(Table& table, const PrivateSystemBus& bus, const Walk& walk);

} // namespace kiv::bench

#endif
