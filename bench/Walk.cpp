#include "Walk.h"

#include "BareBus.h"

namespace kiv::bench
{

void CompareWalk(Table& table, const PrivateSystemBus& bus, const Walk& walk)
{
    constexpr double kRoundSeconds = 1;
    const std::string key = std::to_string(walk.subscribers), name = walk.name + " to " + key;
    const auto work = [&] { return bus.WorkNs(); };
    Subscribe(walk.kind, walk.subscribers);

    Compare(table, {name + ", a subscriber, against bare", walk.goal, work, static_cast<double>(walk.subscribers),
                       {walk.library, Drain}, {walk.bare, Drain}, kRoundSeconds, walk.name, walk.subscribers});
    CompareMessages(table, bus, name + ", messages on the bus", walk.order, walk.library, walk.bare);
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
