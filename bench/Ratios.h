#ifndef KIV_BENCH_RATIOS_H
#define KIV_BENCH_RATIOS_H

#include "Table.h"

#include <benchmark/benchmark.h>

#include <functional>
#include <string>
#include <vector>

namespace kiv::bench
{

/// The highest allowed cost of the library: factor times the cost without it, plus some slack.
struct Goal
{
    double factor;
    double slackNs = 0;
};

/// Returns nanoseconds since an arbitrary moment.
using Clock = std::function<double()>;

double CpuNs();  ///< processor time of this process, for computations
double WallNs(); ///< wall-clock time, for threads that run in parallel

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
    double calls; ///< calls per batch, by which its time is divided
    Side library; ///< through the library
    Side bare;    ///< the same, bare or naive
    double roundSeconds = 0.1;
    std::string series = {}; ///< curve of the plot that this is a point of
    int subscribers = 0;
};

constexpr int kRounds = 11;

/// Returns the value that so many quarters of the values do not exceed.
double Quantile(std::vector<double> values, std::size_t quarters);

/// Runs a pair in rounds, with batches of the two sides in turns, and adds the median of the rounds to the table.
void Compare(Table& table, const Pair& pair);

/// Returns a batch of that many calls.
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
