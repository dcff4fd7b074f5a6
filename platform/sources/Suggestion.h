/// @file
/// Suggests the word that was probably meant.
#ifndef KIV_SOURCES_SUGGESTION_H
#define KIV_SOURCES_SUGGESTION_H

#include <string>
#include <vector>

#pragma GCC visibility push(default)

namespace kiv::platform
{

/// A question about the nearest of the words, to follow an error message: ` (did you mean "single"?)`; empty when none is near.
std::string DidYouMean(const std::string& typed, const std::vector<std::string>& words);

} // namespace kiv::platform

#pragma GCC visibility pop

#endif
