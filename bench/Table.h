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

/// One row of the table.
struct Row
{
    std::string item;
    std::string goal;
    Outcome outcome = Outcome::NotMeasured;
    double measured = 0;
    double low = 0, high = 0;         ///< the middle half of the rounds is between them; equal without rounds
    std::string unit = {};            ///< empty for a ratio
    std::string remark = {};          ///< what the number was computed from, or why there is none
    double libraryNs = 0, bareNs = 0; ///< whose ratio it is
    std::string series = {};          ///< curve of the plot that this is a point of
    int subscribers = 0;
};

/// The results, printed row by row as they come.
class Table
{
public:
    /// @param only  measure the items whose text contains this
    explicit Table(std::string only);

    bool Wants(const std::string& item) const { return item.find(only_) != std::string::npos; }
    void Add(Row row);

    /// @return whether the file was written
    bool WriteJson(const std::string& path) const;
    /// @return whether something was measured and no goal was missed
    bool IsMet() const;

private:
    std::string only_;
    std::vector<Row> rows_;
};

} // namespace kiv::bench

#endif
