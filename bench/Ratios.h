#ifndef KIV_BENCH_RATIOS_H
#define KIV_BENCH_RATIOS_H

#include "Table.h"

#include <benchmark/benchmark.h>

#include <functional>
#include <string>
#include <vector>

namespace kiv::bench
{

/// What the library may cost, told by what the same costs without it: factor times that, and a little on top.
struct Goal
{
    double factor;
    double slackNs = 0;
};

/// Nanoseconds since whenever.
using Clock = std::function<double()>;

double CpuNs();  ///< processor time of this process, for what it computes
double WallNs(); ///< for what threads do side by side

/// A few calls in a row, long enough for the clock.
using Batch = std::function<void()>;

struct Side
{
    Batch run;
    Batch prepare = {}; ///< before each run, not timed
};

struct Pair
{
    std::string item;
    Goal goal;
    Clock clock;
    double calls; ///< in a batch, by which its time is divided
    Side library; ///< the library's way
    Side bare;    ///< the bare or naive way to the same
    double roundSeconds = 0.1;
    std::string series = {}; ///< of the picture, for which this is the point at so many subscribers
    int subscribers = 0;
};

constexpr int kRounds = 11;

/// What so many quarters of the values are not above.
double Quantile(std::vector<double> values, std::size_t quarters);

/// Runs a pair in rounds, batches of the two sides in turns within each round, and adds the median of the rounds to the table.
void Compare(Table& table, const Pair& pair);

/// A batch of that many calls.
template <class Call>
Batch Times(int count, Call call)
{
    return [count, call]
    {
        for (int i = 0; i < count; ++i)
            call();
    };
}

} // namespace kiv::bench

#endif
