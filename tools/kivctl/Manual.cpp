#include "Manual.h"

#include "Kivctl.h"
#include "Nearest.h"

namespace
{

/// Escapes a text for man: minus signs, and a macro at the beginning.
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
    if (!verb.fields.empty())
        text += ".PP\nFields: " + Escaped(Joined(verb.fields, ", ")) + ".\n";
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
    std::string text =
        ".TH KIVCTL 1 \"\" \"kivctl " KIV_VERSION "\" \"User Commands\"\n.nh\n"
        ".SH NAME\nkivctl \\- query and change the device of kiv\\-agent, and exchange messages with its client services\n"
        ".SH SYNOPSIS\n" +
        Escaped(program.usage) + "\n.SH DESCRIPTION\n" + Escaped(program.help) +
        "\n.PP\nData is printed to standard output, everything else to standard error.\n"
        ".SH OPTIONS\nEvery verb accepts these options, before or after it.\n" +
        Entries(program) + ".SH VERBS\n" + VerbSections(program) + ".SH EXIT STATUS\n";
    for (const ExitMeaning& exit : kExitMeanings)
        text += Entry(std::to_string(static_cast<int>(exit.code)), exit.meaning);
    text += ".SH ENVIRONMENT\n";
    for (const Variable& variable : kEnvironment)
        text += Entry(variable.name, variable.meaning);
    return text;
}
