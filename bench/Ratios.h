#ifndef KIV_BENCH_RATIOS_H
#define KIV_BENCH_RATIOS_H

#include <benchmark/benchmark.h>

#include <functional>
#include <string>

namespace kiv::bench
{

/// What the library may cost, told by what the same costs without it: factor times that, and a little on top.
struct Goal
{
    double factor;
    double slackNs = 0;
};

enum class Clock
{
    Cpu, ///< for what one thread computes
    Wall ///< for what waits for others
};

using Body = std::function<void(benchmark::State&)>;

/// Registers a pair: the library's way, and the bare or naive way, each run nine times in turns.
void Compare(const std::string& item, Goal goal, Clock clock, const Body& library, const Body& bare, int threads = 1);

/// Runs every pair and prints a line each: goal, what was measured, and how far the nine rounds lay apart.
/// @return whether every goal was met
bool RunAll(int argc, char** argv);

} // namespace kiv::bench

#endif
