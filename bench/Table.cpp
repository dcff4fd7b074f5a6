#include "Table.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <cstdio>
#include <fstream>
#include <utility>

namespace kiv::bench
{

namespace
{

constexpr const char* kOutcomes[] = {"met", "MISSED", "not measured"};

const char* Word(Outcome outcome)
{
    return kOutcomes[static_cast<int>(outcome)];
}

} // namespace

Table::Table(std::string only) : only_(std::move(only))
{
    std::printf("%-64s %-14s %10s  %-19s %-12s %s\n", "item", "goal", "measured", "middle half", "", "per call");
}

void Table::Add(Row row)
{
    char measured[32] = "", spread[48] = "";
    const int digits = row.unit.empty() ? 3 : 0;
    if (row.outcome != Outcome::NotMeasured)
        std::snprintf(measured, sizeof measured, "%.*f%s", digits, row.measured, row.unit.c_str());
    if (row.low != row.high)
        std::snprintf(spread, sizeof spread, "%.*f to %.*f", digits, row.low, digits, row.high);
    std::printf("%-64s %-14s %10s  %-19s %-12s %s\n", row.item.c_str(), row.goal.c_str(), measured, spread, Word(row.outcome),
        row.remark.c_str());
    std::fflush(stdout);
    rows_.push_back(std::move(row));
}

bool Table::WriteJson(const std::string& path) const
{
    nlohmann::json all = nlohmann::json::array();
    for (const Row& row : rows_)
    {
        nlohmann::json line = {{"item", row.item}, {"goal", row.goal}, {"outcome", Word(row.outcome)}, {"remark", row.remark}};
        if (row.outcome != Outcome::NotMeasured)
            line.update({{"measured", row.measured}, {"low", row.low}, {"high", row.high}, {"unit", row.unit}});
        if (row.bareNs > 0)
            line.update({{"library_ns", row.libraryNs}, {"bare_ns", row.bareNs}});
        if (!row.series.empty())
            line.update({{"series", row.series}, {"subscribers", row.subscribers}});
        all.push_back(std::move(line));
    }
    std::ofstream file(path);
    file << all.dump(2) << '\n';
    file.close();
    return !file.fail();
}

bool Table::IsMet() const
{
    return !rows_.empty() &&
           std::none_of(rows_.begin(), rows_.end(), [](const Row& row) { return row.outcome == Outcome::Missed; });
}

} // namespace kiv::bench
