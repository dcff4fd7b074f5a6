#include "Ratios.h"

#include <algorithm>
#include <cstdio>
#include <ctime>
#include <optional>

namespace kiv::bench
{

namespace
{

double Read(clockid_t clock)
{
    timespec now{};
    clock_gettime(clock, &now);
    return static_cast<double>(now.tv_sec) * 1e9 + static_cast<double>(now.tv_nsec);
}

double RunOnce(const Side& side, const Clock& clock)
{
    if (side.prepare)
        side.prepare();
    const double start = clock();
    side.run();
    return clock() - start;
}

/// Runs one round. Other load on the machine affects both sides alike, since they take turns every few milliseconds and neither
/// always goes first.
void Round(benchmark::State& state, const Pair& pair)
{
    double library = 0, bare = 0;
    for (auto _ : state)
    {
        const double before = library + bare;
        library += RunOnce(pair.library, pair.clock);
        bare += RunOnce(pair.bare, pair.clock);
        bare += RunOnce(pair.bare, pair.clock);
        library += RunOnce(pair.library, pair.clock);
        state.SetIterationTime((library + bare - before) / 1e9);
    }
    const double calls = 2 * pair.calls * static_cast<double>(state.iterations());
    state.counters["library"] = library / calls;
    state.counters["bare"] = bare / calls;
    state.counters["ratio"] = library / bare;
}

/// Receives the benchmark library's results of the rounds.
class Summary : public benchmark::BenchmarkReporter
{
public:
    bool ReportContext(const Context&) override { return true; }

    void ReportRuns(const std::vector<Run>& runs) override
    {
        for (const Run& run : runs)
        {
            if (run.run_type == Run::RT_Aggregate)
                aggregates_[run.aggregate_name] = run.counters;
        }
    }

    double Of(const char* aggregate, const char* counter) { return aggregates_[aggregate][counter]; }

private:
    std::map<std::string, benchmark::UserCounters> aggregates_;
};

std::string Text(const Goal& goal)
{
    char text[32];
    std::snprintf(text, sizeof text, goal.slackNs > 0 ? "<= %.2f + %.1fus" : "<= %.2f", goal.factor, goal.slackNs / 1e3);
    return text;
}

} // namespace

double CpuNs()
{
    return Read(CLOCK_PROCESS_CPUTIME_ID);
}

double WallNs()
{
    return Read(CLOCK_MONOTONIC);
}

double Quantile(std::vector<double> values, std::size_t quarters)
{
    const auto at = values.begin() + static_cast<std::ptrdiff_t>((values.size() - 1) * quarters / 4);
    std::nth_element(values.begin(), at, values.end());
    return *at;
}

void Compare(Table& table, const Pair& pair)
{
    if (!table.Wants(pair.item))
        return;
    benchmark::RegisterBenchmark(pair.item.c_str(), [&](benchmark::State& state) { Round(state, pair); })
        ->UseManualTime()
        ->MinTime(pair.roundSeconds)
        ->Repetitions(kRounds)
        ->ComputeStatistics("low", [](const std::vector<double>& all) { return Quantile(all, 1); })
        ->ComputeStatistics("high", [](const std::vector<double>& all) { return Quantile(all, 3); });
    Summary summary;
    benchmark::RunSpecifiedBenchmarks(&summary, ".");
    benchmark::ClearRegisteredBenchmarks();

    const double library = summary.Of("median", "library"), bare = summary.Of("median", "bare");
    const double ratio = summary.Of("median", "ratio");
    const bool isMet = ratio * bare <= pair.goal.factor * bare + pair.goal.slackNs;
    char times[64];
    std::snprintf(times, sizeof times, "%.4g ns to %.4g ns", library, bare);
    table.Add({pair.item, Text(pair.goal), isMet ? Outcome::Met : Outcome::Missed, ratio, summary.Of("low", "ratio"),
        summary.Of("high", "ratio"), {}, times, library, bare, pair.series, pair.subscribers});
}

} // namespace kiv::bench
