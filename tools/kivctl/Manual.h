#ifndef MANUAL_H
#define MANUAL_H

#include <string>
#include <vector>

/// An option, or an operand, as the command line describes it.
struct OptionManual
{
    std::vector<std::string> names; ///< "-h", "--help"; an operand has one, without dashes
    std::string value;              ///< what stands behind it; empty for a flag
    std::vector<std::string> words; ///< what the value may be, where that is a choice of words
    std::string help;
    bool isRepeated = false; ///< there may be several values
};

/// A verb, or the program, with the verbs below it.
struct VerbManual
{
    std::string path; ///< "device set"; empty for the program
    std::string usage;
    std::string help;
    std::vector<OptionManual> options;
    std::vector<VerbManual> verbs;
};

/// kivctl(1), in man's macros.
std::string ManPage(const VerbManual& program);

#endif
