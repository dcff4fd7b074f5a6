/// @file
/// What the fuzz targets have in common. Their inputs are lines of text, so that one can be read, and written by hand.
#ifndef KIV_TESTS_FUZZ_H
#define KIV_TESTS_FUZZ_H

#include <cstdlib>
#include <string>
#include <string_view>
#include <vector>

namespace kiv::fuzz
{

/// Ends the run, which keeps the input, unless it is true.
void Require(bool isTrue, const char* what);

/// What the library was given so far; the sum is printed at the end of the run.
inline std::size_t fed = 0;
inline void Feed(std::size_t records)
{
    fed += records;
}

/// The pieces between separators, and empty ones behind them up to `least`.
std::vector<std::string> Split(std::string_view text, char separator, std::size_t least = 1);

/// As std::strtoll() reads it, wrapped.
inline int Number(const std::string& text)
{
    return static_cast<int>(std::strtoll(text.c_str(), nullptr, 10));
}

} // namespace kiv::fuzz

/// What each target defines.
void Try(std::string_view input);

#endif
