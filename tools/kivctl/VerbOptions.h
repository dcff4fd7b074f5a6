#ifndef VERBOPTIONS_H
#define VERBOPTIONS_H

#include "Kivctl.h"

namespace CLI
{
class App;
class Option;
} // namespace CLI

/// The separator of the words of a choice in the help.
inline constexpr char kOr[] = "|";

/// Adds the verbs, with the options and operands of each.
void AddVerbs(CLI::App& app, Command& command);

/// Limits the option to these words; "-" and "_" are the same in them.
/// @param meanings  other words that are accepted, and the word that each stands for
void Restrict(CLI::Option* option, const std::vector<std::string>& words, std::map<std::string, std::string> meanings = {});

#endif
