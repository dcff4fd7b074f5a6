#include "Walk.h"

#include "BareBus.h"

namespace kiv::bench
{

void CompareWalk(Table& table, const PrivateSystemBus& bus, const Walk& walk)
{
    constexpr double kRoundSeconds = 1;
    const std::string key = std::to_string(walk.subscribers);
    const auto work = [&] { return bus.WorkNs(); };
    const auto findAndBare = [&]
    {
        Find(walk.kind, key.c_str());
        walk.bare();
    };
    Subscribe(walk.kind, walk.subscribers);
    Compare(table, {walk.name + " to " + key + ", per subscriber, against store and bare", walk.goal, work,
                       static_cast<double>(walk.subscribers), {walk.library, Drain}, {findAndBare, Drain}, kRoundSeconds, walk.name,
                       walk.subscribers});
    Drain();
}

} // namespace kiv::bench
