/// @file
/// Texts that the library returns, and texts written independently of its tables.
#ifndef KIV_TESTS_TEXTS_H
#define KIV_TESTS_TEXTS_H

#include "support/Test.h"

namespace kiv::test
{

/// Takes over the value of a text out-parameter: the text, "null" or "untouched".
template <class Operation>
std::string Out(Operation operation, void (*release)(void*) = std::free)
{
    static char before[] = "untouched";
    char* out = before;
    operation(&out);
    const std::string text = out == nullptr ? "null" : out;
    if (out != before)
        release(out);
    return text;
}

/// Returns the content of a file.
inline std::string Contents(const std::string& path)
{
    return (std::ostringstream() << std::ifstream(path, std::ios::binary).rdbuf()).str();
}

using Rows = std::vector<std::vector<std::string>>;

inline Rows Read(const char* file)
{
    Rows rows;
    std::ifstream in(std::string(KIV_TEST_DATA "/") + file);
    for (std::string line; std::getline(in, line);)
    {
        std::istringstream cells(line);
        rows.emplace_back();
        for (std::string cell; std::getline(cells, cell, '\t');)
            rows.back().push_back(cell);
    }
    return rows;
}

using Column = std::map<std::string, std::string>;

/// Maps the cells of one column to those of another. The first row with a key counts; "-" is neither key nor cell.
inline Column Find(const Rows& rows, std::size_t key, std::size_t result)
{
    Column found;
    for (const auto& row : rows)
    {
        if (row[key] != "-" && row[result] != "-")
            found.emplace(row[key], row[result]);
    }
    return found;
}

} // namespace kiv::test

#endif
