#ifndef KIV_BENCH_TABLE_H
#define KIV_BENCH_TABLE_H

#include <string>
#include <vector>

namespace kiv::bench
{

enum class Outcome
{
    Met,
    Missed,
    NotMeasured
};

/// One line of the table.
struct Row
{
    std::string item;
    std::string goal;
    Outcome outcome = Outcome::NotMeasured;
    double measured = 0;
    double low = 0, high = 0;         ///< between which the middle half of the rounds lies; equal when there is nothing to spread
    std::string unit = {};            ///< empty for a ratio
    std::string remark = {};          ///< what the number was made of, or why there is none
    double libraryNs = 0, bareNs = 0; ///< of which it is the ratio
    std::string series = {};          ///< of the picture, for which this is the point at so many subscribers
    int subscribers = 0;
};

/// What was measured, printed row by row as it comes.
class Table
{
public:
    /// @param only  measure the items whose text holds this
    explicit Table(std::string only);

    bool Wants(const std::string& item) const { return item.find(only_) != std::string::npos; }
    void Add(Row row);

    /// @return whether the file could be written
    bool WriteJson(const std::string& path) const;
    /// @return whether something was measured, and no goal was missed
    bool IsMet() const;

private:
    std::string only_;
    std::vector<Row> rows_;
};

} // namespace kiv::bench

#endif
