#include "Manual.h"

#include "Kivctl.h"
#include "Nearest.h"

namespace
{

/// Text as man takes it: no hyphens for minus signs, no macros at the beginning of a line.
std::string Escaped(const std::string& text)
{
    std::string escaped;
    for (const char letter : text)
    {
        if (letter == '\\')
            escaped += "\\e";
        else if (letter == '-')
            escaped += "\\-";
        else if (letter == '|')
            escaped += "|\\:"; // a line may end here
        else
            escaped += letter;
    }
    return (escaped.find_first_of(".'") == 0 ? "\\&" : "") + escaped;
}

std::string Entry(const std::string& term, const std::string& text)
{
    return ".TP\n\\fB" + Escaped(term) + "\\fR\n" + Escaped(text) + "\n";
}

bool IsHelp(const OptionManual& option)
{
    return option.names.back() == "--help";
}

std::string Entries(const VerbManual& verb)
{
    std::string text;
    for (const OptionManual& option : verb.options)
    {
        if (verb.path.empty() || !IsHelp(option)) // every verb has it
            text += Entry(Joined(option.names, ", ") + (option.value.empty() ? "" : " " + option.value), option.help);
    }
    return text;
}

std::string VerbSections(const VerbManual& verb)
{
    std::string text;
    for (const VerbManual& below : verb.verbs)
        text += ".SS \"" + Escaped(below.usage) + "\"\n" + Escaped(below.help) + ".\n" + Entries(below) + VerbSections(below);
    return text;
}

} // namespace

std::string ManPage(const VerbManual& program)
{
    std::string text = ".TH KIVCTL 1 \"\" \"kivctl " KIV_VERSION "\" \"User Commands\"\n.nh\n"
                       ".SH NAME\nkivctl \\- the agent, its client services and the simulated device on the command line\n"
                       ".SH SYNOPSIS\n" +
                       Escaped(program.usage) + "\n.SH DESCRIPTION\n" + Escaped(program.help) +
                       "\n.PP\nData go to standard output, everything else to standard error.\n"
                       ".SH OPTIONS\nEvery verb takes these, before or behind it; those for queries choose what is printed.\n" +
                       Entries(program) + ".SH VERBS\n" + VerbSections(program) + ".SH EXIT STATUS\n";
    for (const ExitMeaning& exit : kExitMeanings)
        text += Entry(std::to_string(static_cast<int>(exit.code)), exit.meaning);
    text += ".SH ENVIRONMENT\n";
    for (const Variable& variable : kEnvironment)
        text += Entry(variable.name, variable.meaning);
    return text;
}
