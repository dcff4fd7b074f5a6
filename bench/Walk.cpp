#include "Walk.h"

#include "BareBus.h"
#include "BusMonitor.h"

#include <algorithm>

namespace kiv::bench
{

namespace
{

/// Adds to the table whether the library causes the same messages as the bare loop.
void CompareMessages(Table& table, const PrivateSystemBus& bus, const std::string& item, const Walk& walk)
{
    if (!table.Wants(item))
        return;
    BusMonitor monitor(bus);
    std::vector<std::string> ours = monitor.During(walk.library), theirs = monitor.During(walk.bare);
    if (walk.order == Order::Any)
    {
        std::sort(ours.begin(), ours.end());
        std::sort(theirs.begin(), theirs.end());
    }
    const auto [left, right] = std::mismatch(ours.begin(), ours.end(), theirs.begin(), theirs.end());
    const bool isEqual = left == ours.end() && right == theirs.end();
    std::string remark = "bare " + std::to_string(theirs.size());
    if (!isEqual)
        remark += "; first difference: " + (left == ours.end() ? "nothing" : *left) + " | " +
                  (right == theirs.end() ? "nothing" : *right);
    const auto count = static_cast<double>(ours.size());
    table.Add({item, "equal", isEqual ? Outcome::Met : Outcome::Missed, count, count, count, " msgs", remark});
}

} // namespace

void CompareWalk(Table& table, const PrivateSystemBus& bus, const Walk& walk)
{
    constexpr double kRoundSeconds = 1;
    const std::string key = std::to_string(walk.subscribers), name = walk.name + " to " + key;
    const auto work = [&] { return bus.WorkNs(); };
    Subscribe(walk.kind, walk.subscribers);

    Compare(table, {name + ", a subscriber, against bare", walk.goal, work, static_cast<double>(walk.subscribers),
                       {walk.library, Drain}, {walk.bare, Drain}, kRoundSeconds, walk.name, walk.subscribers});
    CompareMessages(table, bus, name + ", messages on the bus", walk);
    if (walk.subscribers == 1)
    {
        const auto findAndBare = [&]
        {
            Find(walk.kind, key.c_str());
            walk.bare();
        };
        Compare(table, {name + ", against a store lookup and bare", walk.goal, work, 1, {walk.library, Drain}, {findAndBare, Drain},
                           kRoundSeconds});
    }
    Drain();
}

} // namespace kiv::bench
