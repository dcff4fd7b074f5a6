#ifndef NEAREST_H
#define NEAREST_H

#include <string>
#include <vector>

/// " (did you mean ...?)" with the word that is nearest to what was typed; empty when none is near.
std::string DidYouMean(const std::string& typed, const std::vector<std::string>& words);

/// The words with a separator between them.
std::string Joined(const std::vector<std::string>& words, const char* separator);

#endif
