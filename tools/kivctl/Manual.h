#ifndef MANUAL_H
#define MANUAL_H

#include <string>
#include <vector>

/// The description of an option or operand.
struct OptionManual
{
    std::vector<std::string> names; ///< such as "-h" and "--help"; an operand has one name without dashes
    std::string value;              ///< placeholder for its value; empty for a flag
    std::vector<std::string> words; ///< the possible values, if they are a choice of words
    std::string help;
    bool isRepeated = false; ///< takes several values
};

/// The description of a verb, or of the program, with the verbs below it.
struct VerbManual
{
    std::string path; ///< "device set"; empty for the program
    std::string usage;
    std::string help;
    std::vector<std::string> fields; ///< of the records that it prints; empty for a verb that prints none
    std::vector<OptionManual> options;
    std::vector<VerbManual> verbs;
};

/// The manual page kivctl(1), in man's macros.
std::string ManPage(const VerbManual& program);

#endif
