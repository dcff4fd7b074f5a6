/// @file
/// Suggests the word that was probably meant.
#ifndef KIV_SOURCES_SUGGESTION_H
#define KIV_SOURCES_SUGGESTION_H

#include <string>
#include <vector>

#pragma GCC visibility push(default)

namespace kiv::platform
{

/// Returns a suggestion of the most similar word, to append to an error message: ` (did you mean "single"?)`; empty when no word
/// is similar.
std::string DidYouMean(const std::string& typed, const std::vector<std::string>& words);

} // namespace kiv::platform

#pragma GCC visibility pop

#endif
