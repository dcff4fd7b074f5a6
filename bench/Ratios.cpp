#include "Ratios.h"

#include <algorithm>
#include <cstdio>
#include <map>
#include <vector>

namespace kiv::bench
{

namespace
{

constexpr int kRounds = 9;

struct Pair
{
    std::string item;
    Goal goal;
    std::vector<double> libraryNs, bareNs; ///< a call, one value a round
};

std::vector<Pair>& Pairs()
{
    static std::vector<Pair> pairs;
    return pairs;
}

double Median(std::vector<double> values)
{
    std::nth_element(values.begin(), values.begin() + static_cast<long>(values.size() / 2), values.end());
    return values[values.size() / 2];
}

/// Sorts what the benchmark library measured into the pairs.
class Collector : public benchmark::BenchmarkReporter
{
public:
    bool ReportContext(const Context&) override { return true; }

    void ReportRuns(const std::vector<Run>& runs) override
    {
        for (const Run& run : runs)
        {
            if (run.error_occurred)
                std::fprintf(stderr, "%s: %s\n", run.benchmark_name().c_str(), run.error_message.c_str());
            if (run.run_type != Run::RT_Iteration || run.error_occurred)
                continue;
            const std::string& name = run.run_name.function_name;
            const bool isWall = name.find("|wall|") != std::string::npos;
            const double ns = isWall ? run.GetAdjustedRealTime() : run.GetAdjustedCPUTime();
            Pair& pair = Pairs()[std::stoul(name)];
            (name.find("|library") != std::string::npos ? pair.libraryNs : pair.bareNs).push_back(ns);
        }
    }
};

bool Report(const Pair& pair)
{
    if (pair.libraryNs.empty() || pair.libraryNs.size() != pair.bareNs.size())
    {
        std::printf("%-52s not measured\n", pair.item.c_str());
        return false;
    }
    std::vector<double> ratios;
    for (std::size_t i = 0; i < pair.bareNs.size(); ++i)
        ratios.push_back(pair.libraryNs[i] / pair.bareNs[i]);

    const double library = Median(pair.libraryNs);
    const double bare = Median(pair.bareNs);
    const double ratio = Median(ratios);
    const bool isMet = ratio * bare <= pair.goal.factor * bare + pair.goal.slackNs;
    const auto [least, most] = std::minmax_element(ratios.begin(), ratios.end());
    char goal[32];
    std::snprintf(goal, sizeof goal, pair.goal.slackNs > 0 ? "%.2f + %.1f us" : "%.2f", pair.goal.factor, pair.goal.slackNs / 1e3);
    std::printf("%-52s %-14s %6.3f (%.3f to %.3f)  %10.0f ns to %10.0f ns  %s\n", pair.item.c_str(), goal, ratio, *least, *most,
        library, bare, isMet ? "met" : "MISSED");
    return isMet;
}

} // namespace

void Compare(const std::string& item, Goal goal, Clock clock, const Body& library, const Body& bare, int threads)
{
    const std::string prefix = std::to_string(Pairs().size()) + (clock == Clock::Wall ? "|wall|" : "|cpu|");
    Pairs().push_back({item, goal, {}, {}});
    for (const auto& [side, body] : {std::pair(prefix + "library", library), std::pair(prefix + "bare", bare)})
    {
        auto* const registered = benchmark::RegisterBenchmark(side.c_str(), body)->Repetitions(kRounds)->Threads(threads);
        if (clock == Clock::Wall)
            registered->UseRealTime();
    }
}

bool RunAll(int argc, char** argv)
{
    // Rounds of all pairs in a random order, so that what the machine does meanwhile meets both sides alike.
    std::vector<char*> arguments(argv, argv + argc);
    char interleave[] = "--benchmark_enable_random_interleaving=true";
    char shortRounds[] = "--benchmark_min_time=0.1";
    arguments.insert(arguments.begin() + 1, {interleave, shortRounds});
    int count = static_cast<int>(arguments.size());
    benchmark::Initialize(&count, arguments.data());

    Collector collector;
    benchmark::RunSpecifiedBenchmarks(&collector);
    std::printf("%-52s %-14s %-25s %s\n", "item", "goal", "measured (least to most)", "a call, library to bare");
    bool isMet = true;
    for (const Pair& pair : Pairs())
        isMet = Report(pair) && isMet;
    return isMet;
}

} // namespace kiv::bench
