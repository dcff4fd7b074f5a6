/// @file
/// The word that somebody meant.
#ifndef KIV_SOURCES_SUGGESTION_H
#define KIV_SOURCES_SUGGESTION_H

#include <string>
#include <vector>

#pragma GCC visibility push(default)

namespace kiv::platform
{

/// The nearest of the words as a question that follows a complaint: ` (did you mean "single"?)`; empty when none is near.
std::string DidYouMean(const std::string& typed, const std::vector<std::string>& words);

} // namespace kiv::platform

#pragma GCC visibility pop

#endif
