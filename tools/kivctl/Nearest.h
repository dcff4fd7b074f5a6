#ifndef NEAREST_H
#define NEAREST_H

#include <Suggestion.h>

#include <string>
#include <vector>

using kiv::platform::DidYouMean;

/// Joins words with a separator between them.
std::string Joined(const std::vector<std::string>& words, const char* separator);

#endif
