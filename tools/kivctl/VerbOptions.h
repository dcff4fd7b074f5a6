#ifndef VERBOPTIONS_H
#define VERBOPTIONS_H

#include "Kivctl.h"

namespace CLI
{
class App;
class Option;
} // namespace CLI

/// Between two words of a choice, in the help.
inline constexpr char kOr[] = "|";

/// Adds the verbs, with the options and operands of each.
void AddVerbs(CLI::App& app, Command& command);

/// Has the option take nothing but these words, "-" and "_" being one.
void Restrict(CLI::Option* option, const std::vector<std::string>& words);

#endif
