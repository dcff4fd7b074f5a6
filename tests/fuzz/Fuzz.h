/// @file
/// What the fuzz targets have in common. A target reads its input as lines of text, so that a kept input can be read and written by
/// hand, and checks the answers against what it knows, not only that nothing crashes.
#ifndef KIV_TESTS_FUZZ_H
#define KIV_TESTS_FUZZ_H

#include <cstdint>
#include <string>
#include <string_view>
#include <vector>

namespace kiv::fuzz
{

/// Ends the run, and so keeps the input, unless it is true.
void Require(bool isTrue, const char* what);

/// Counts records given to the library; the sum is printed at the end of the run.
void Feed(std::size_t records);

/// The pieces between separators, at least one.
std::vector<std::string> Split(std::string_view text, char separator);

/// Has every line of the log formatted, which nobody then reads: texts from outside stand in them.
void FormatLog();

} // namespace kiv::fuzz

/// What each target defines.
void Try(std::string_view input);

#endif
