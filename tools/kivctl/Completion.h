#ifndef COMPLETION_H
#define COMPLETION_H

#include "Manual.h"

#include <string>
#include <vector>

/// The first word behind "kivctl" when a shell asks what may follow; the words of the command line are behind it.
inline constexpr char kCompletionVerb[] = "complete-words";

/// The shells for which there is a script.
std::vector<std::string> CompletionShells();

/// What one of those shells reads to complete kivctl's command line; it asks kivctl on each completion.
std::string CompletionScript(const std::string& shell);

/// What may follow, one candidate per line, with a tab and its description where there is one; ":files" where a file may.
/// @param words  those behind "kivctl"; the last one is to be completed, and may be empty
std::string Completions(const VerbManual& program, const std::vector<std::string>& words);

#endif
