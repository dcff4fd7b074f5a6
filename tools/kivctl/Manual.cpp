#include "Manual.h"

#include "Kivctl.h"
#include "Nearest.h"
#include "Verbs.h"

#include <algorithm>

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

/// The verb as it is typed.
std::string Typed(const VerbManual& verb)
{
    return verb.path.empty() ? "kivctl" : "kivctl " + verb.path;
}

/// What is worth completing though other values are right too, by the name of the option or operand.
std::vector<std::string> Suggestions(const OptionManual& option)
{
    if (option.names.back() == "--profile")
        return ProfileNames();
    if (option.names.back() != "GROUP.KEY=VALUE")
        return option.words;
    std::vector<std::string> words = DeviceFileKeys();
    std::transform(words.begin(), words.end(), words.begin(), [](const std::string& key) { return key + "="; });
    return words;
}

/// Rows of the two tables that the completion looks into: the words that may follow a verb, and the values of an option.
std::string Rows(const VerbManual& verb, const std::vector<std::string>& everywhere)
{
    std::vector<std::string> words;
    std::string values;
    for (const VerbManual& below : verb.verbs)
        words.push_back(below.path.substr(below.path.rfind(' ') + 1));
    for (const OptionManual& option : verb.options)
    {
        const std::vector<std::string> suggested = Suggestions(option);
        if (option.names.back().rfind('-', 0) != 0)
            words.insert(words.end(), suggested.begin(), suggested.end());
        else if (!verb.path.empty() && !IsHelp(option))
            words.insert(words.end(), option.names.begin(), option.names.end());
        for (const std::string& name : option.names)
        {
            if (!option.value.empty() && name.rfind('-', 0) == 0)
                values += "    [\"" + Typed(verb) + " " + name + "\"]=\"" + Joined(suggested, " ") + "\"\n";
        }
    }
    words.insert(words.end(), everywhere.begin(), everywhere.end());
    std::string text = "    [\"" + Typed(verb) + "\"]=\"" + Joined(words, " ") + "\"\n" + values;
    for (const VerbManual& below : verb.verbs)
        text += Rows(below, everywhere);
    return text;
}

constexpr char kCompletionHead[] = R"(# Completion of kivctl's command line for bash; made from what kivctl --help tells.

# The words that may follow, by "kivctl" and the verbs; the values of an option, by those and the option.
declare -A _kivctl_words=(
)";

constexpr char kCompletionTail[] = R"()

_kivctl()
{
    local word verb=kivctl current=${COMP_WORDS[COMP_CWORD]} previous=${COMP_WORDS[COMP_CWORD - 1]}
    for word in "${COMP_WORDS[@]:1:COMP_CWORD-1}"; do
        [[ $word != -* && -v _kivctl_words["$verb $word"] ]] && verb+=" $word"
    done
    if [[ $previous == --profile ]]; then
        mapfile -t COMPREPLY < <(compgen -W "${_kivctl_words["kivctl --profile"]}" -- "$current"; compgen -f -- "$current")
    elif [[ $previous == -* && -v _kivctl_words["$verb $previous"] ]]; then
        mapfile -t COMPREPLY < <(compgen -W "${_kivctl_words["$verb $previous"]}" -- "$current")
    else
        mapfile -t COMPREPLY < <(compgen -W "${_kivctl_words["$verb"]}" -- "$current")
    fi
    if [[ ${COMPREPLY[0]-} == *= ]]; then
        compopt -o nospace
    fi
}

complete -F _kivctl kivctl
)";

} // namespace

std::string ManPage(const VerbManual& program)
{
    std::string text = ".TH KIVCTL 1 \"\" \"kivctl " KIV_VERSION "\" \"User Commands\"\n.nh\n"
                       ".SH NAME\nkivctl \\- the agent, its client services and the simulated device on the command line\n"
                       ".SH SYNOPSIS\n" +
                       Escaped(program.usage) + "\n.SH DESCRIPTION\n" + Escaped(program.help) +
                       "\n.PP\nData go to standard output, everything else to standard error.\n"
                       ".SH OPTIONS\nThese belong to every verb, before or behind it.\n" +
                       Entries(program) + ".SH VERBS\n" + VerbSections(program) + ".SH EXIT STATUS\n";
    for (const ExitMeaning& exit : kExitMeanings)
        text += Entry(std::to_string(static_cast<int>(exit.code)), exit.meaning);
    text += ".SH ENVIRONMENT\n";
    for (const Variable& variable : kEnvironment)
        text += Entry(variable.name, variable.meaning);
    return text;
}

std::string BashCompletion(const VerbManual& program)
{
    std::vector<std::string> everywhere;
    for (const OptionManual& option : program.options)
        everywhere.insert(everywhere.end(), option.names.begin(), option.names.end());
    return kCompletionHead + Rows(program, everywhere) + kCompletionTail;
}
