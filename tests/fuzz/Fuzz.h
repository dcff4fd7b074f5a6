/// @file
/// Shared code of the fuzz targets. Their inputs are lines of text, so that people can read and write them.
#ifndef KIV_TESTS_FUZZ_H
#define KIV_TESTS_FUZZ_H

#include <cstdlib>
#include <string>
#include <string_view>
#include <vector>

namespace kiv::fuzz
{

/// Ends the run and keeps the input if the condition is false.
void Require(bool isTrue, const char* what);

/// Counts what the library received; the end of the run prints the sum.
inline std::size_t fed = 0;
inline void Feed(std::size_t records)
{
    fed += records;
}

/// Returns the pieces between separators, followed by empty ones up to `least`.
std::vector<std::string> Split(std::string_view text, char separator, std::size_t least = 1);

/// Returns the number as std::strtoll() reads it, wrapped.
inline int Number(const std::string& text)
{
    return static_cast<int>(std::strtoll(text.c_str(), nullptr, 10));
}

} // namespace kiv::fuzz

/// Each target defines it.
void Try(std::string_view input);

#endif
