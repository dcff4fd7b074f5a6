#ifndef COMPLETION_H
#define COMPLETION_H

#include "Manual.h"

#include <string>
#include <vector>

/// The first word after "kivctl" when a shell asks for completions; the words of the command line follow it.
inline constexpr char kCompletionVerb[] = "complete-words";

/// The shells for which there is a script.
std::vector<std::string> CompletionShells();

/// The completion script of one of those shells. The script asks kivctl on each completion.
std::string CompletionScript(const std::string& shell);

/// The possible next words, one per line, each with a tab and a description if it has one; ":files" where a file is possible.
/// @param words  the words after "kivctl"; the last one, possibly empty, is to be completed
std::string Completions(const VerbManual& program, const std::vector<std::string>& words);

#endif
