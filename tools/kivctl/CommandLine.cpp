#include "CommandLine.h"

#include "Completion.h"
#include "Layout.h"
#include "Manual.h"
#include "Nearest.h"
#include "VerbOptions.h"

#include <CLI/CLI.hpp>

#include <unistd.h>

#include <algorithm>
#include <cctype>
#include <cstring>
#include <sstream>
#include <utility>

namespace
{

constexpr char kAbout[] =
    "Ask the device what an agent asks, send what an agent sends, run a client service, and change the simulated "
    "device.";

/// What --help says below everything else.
std::string Footer()
{
    std::string text = "Exit codes:\n";
    for (const ExitMeaning& exit : kExitMeanings)
    {
        const std::string code = std::to_string(static_cast<int>(exit.code));
        text += std::string(4 - code.size(), ' ') + code + "  " + exit.meaning + "\n";
    }
    text += "\nEnvironment:";
    for (const Variable& variable : kEnvironment)
        text.append("\n  ").append(variable.name).append(26 - std::strlen(variable.name), ' ').append(variable.meaning);
    return text;
}

constexpr char kVerbFooter[] = R"(Options of every verb: --json, --profile NAME|FILE, --color WHEN
Options of every query: --fields NAME,NAME, --terse
kivctl --help describes these, the exit codes and the environment.)";

OptionManual Describe(const CLI::Option& option, const CLI::Formatter& formatter)
{
    OptionManual manual;
    manual.names =
        option.get_positional() ? std::vector{option.get_name(true)} : CLI::detail::split(option.get_name(false, true), ',');
    manual.value = CLI::detail::trim_copy(formatter.make_option_opts(&option));
    const std::string type = option.get_type_name();
    if (type.find(kOr) != type.npos && std::islower(static_cast<unsigned char>(type.front())))
        manual.words = CLI::detail::split(type, *kOr);
    manual.help = option.get_description();
    manual.isRepeated = option.get_items_expected_max() > option.get_items_expected_min();
    return manual;
}

VerbManual Describe(const CLI::App& app, const std::string& path, const CLI::Formatter& formatter)
{
    VerbManual manual;
    manual.path = path;
    manual.usage = formatter.make_usage(&app, path.empty() ? app.get_name() : path);
    manual.usage = CLI::detail::trim_copy(manual.usage.substr(manual.usage.find(' ')));
    manual.help = app.get_description();
    for (const CLI::Option* option : app.get_options())
        manual.options.push_back(Describe(*option, formatter));
    for (const CLI::App* verb : app.get_subcommands([](const CLI::App* candidate) { return !candidate->get_group().empty(); }))
        manual.verbs.push_back(Describe(*verb, path + (path.empty() ? "" : " ") + verb->get_name(), formatter));
    return manual;
}

/// Adds what describes the command line itself: the completion of a shell, and for the build the manual page.
void AddDescriptions(CLI::App& app, Command& command, const CLI::Formatter& formatter)
{
    const auto print = [&command](const std::string& text)
    {
        command.deviceUse = DeviceUse::Leaves;
        command.prints = Prints::Events;
        command.verb = [text]
        {
            Write(text);
            return Exit::Done;
        };
    };
    CLI::App* completion =
        app.add_subcommand("completion", "Print the completion of this command line for a shell")->group("Verbs");
    const auto shell = std::make_shared<std::string>();
    Restrict(completion->add_option("SHELL", *shell, "Shell that reads it")->required(), CompletionShells());
    completion->callback([print, shell] { print(CompletionScript(*shell)); });
    app.add_subcommand("print-man-page")
        ->group("")
        ->callback([print, &app, &formatter] { print(ManPage(Describe(app, "", formatter))); });
}

std::vector<std::string> FieldNames(const std::string& text)
{
    std::vector<std::string> names = CLI::detail::split(text, ',');
    for (std::string& name : names)
        std::replace(name.begin(), name.end(), '-', '_');
    return names;
}

void AddGlobalOptions(CLI::App& app, Command& command)
{
    app.set_help_flag("-h,--help", "Show this help and end");
    app.set_version_flag("-V,--version", "kivctl " KIV_VERSION)->description("Show the version and end");
    Form& form = command.form;
    CLI::Option* const json = app.add_flag_callback(
        "-j,--json", [&form] { form.notation = Form::Notation::Json; }, "Print JSON, one object per line for events");
    app.add_flag_callback(
           "-t,--terse", [&form] { form.notation = Form::Notation::Terse; },
           "Print values only, one record per line, with \":\" between values, and \"\\\" before \":\" and \"\\\"; for queries")
        ->excludes(json);
    app.add_option_function<std::string>(
           "--fields", [&form](const std::string& text) { form.fields = FieldNames(text); },
           "Print these fields only, in this order, by their names in JSON; for queries")
        ->type_name("NAME,NAME");
    CLI::Option* const colour = app.add_option_function<std::string>(
        "--color",
        [&form](const std::string& when) {
            form.colour = when == "auto" ? Form::Colour::Auto : when == "always" ? Form::Colour::Always : Form::Colour::Never;
        },
        "When to use colour (default: auto, on a terminal)");
    Restrict(colour, {"auto", "always", "never"});
    app.add_option("-p,--profile", command.profile, "The device: a file, or the name of a profile (kivctl profiles)")
        ->type_name("NAME|FILE");
}

/// The verb that was typed, with those above it; the words that may follow it.
struct Place
{
    const CLI::App* app;
    std::string verb = "kivctl";
    std::vector<std::string> options = {};
    std::vector<std::string> verbs = {};
};

Place FindPlace(const CLI::App& program)
{
    Place place{&program};
    const auto addOptions = [&place]
    {
        for (const CLI::Option* option : place.app->get_options())
            place.options.push_back(option->get_name());
    };
    for (addOptions(); !place.app->get_subcommands().empty(); addOptions())
    {
        place.app = place.app->get_subcommands().back();
        place.verb += " " + place.app->get_name();
    }
    for (const CLI::App* verb :
        place.app->get_subcommands([](const CLI::App* candidate) { return !candidate->get_group().empty(); }))
        place.verbs.push_back(verb->get_name());
    return place;
}

/// The words of the parser for a value that is missing, in plain ones.
std::string Plain(const std::string& text)
{
    const std::string number = " required ", missing = " missing";
    const size_t name = text.find(": "), words = text.find(number);
    if (name == text.npos || words == text.npos || text.rfind(missing) != text.size() - missing.size())
        return text;
    const std::string count = text.substr(name + 2, words - name - 2);
    const size_t type = words + number.size();
    return text.substr(0, name) + (count == "1" ? " needs a value: " : " needs " + count + " values: ") +
           text.substr(type, text.rfind(missing) - type);
}

/// What was wrong with the command line, and what would be right. An unknown word is named first: other faults follow from it.
std::string Explain(const CLI::App& program, const CLI::ParseError& error)
{
    const Place place = FindPlace(program);
    const std::string more = "; " + place.verb + " --help tells more";
    const std::vector<std::string> unknown = program.remaining(true);
    const auto option =
        std::find_if(unknown.begin(), unknown.end(), [](const std::string& word) { return word.rfind('-', 0) == 0; });
    if (option != unknown.end())
        return '"' + *option + "\" is no option of " + place.verb + DidYouMean(*option, place.options) + more;
    if (!unknown.empty() && place.verbs.empty())
        return '"' + unknown.front() + "\" is one word too many for " + place.verb + more;
    if (!unknown.empty())
        return '"' + unknown.front() + "\" is no verb of " + place.verb + DidYouMean(unknown.front(), place.verbs) + more;
    const bool lacksVerb = place.app->get_require_subcommand_min() > 0 && place.app->get_subcommands().empty();
    return (lacksVerb ? "a verb is needed: " + Joined(place.verbs, ", ") : Plain(error.what())) + more;
}

/// The choice of fields is for what has fields.
void CheckForm(const CLI::App& program, const Command& command)
{
    const bool isChosen = command.form.notation == Form::Notation::Terse || !command.form.fields.empty();
    if (command.verb && command.prints == Prints::Events && isChosen)
        throw Failure(Exit::Usage, "--fields and --terse are for queries, and " + FindPlace(program).verb + " is none");
}

} // namespace

void ReadCommandLine(int argc, char** argv, Command& command)
{
    const auto formatter = std::make_shared<CLI::Formatter>();
    formatter->column_width(28);
    formatter->label("REQUIRED", "(required)");
    formatter->label("SUBCOMMAND", "VERB");
    formatter->label("Positionals", "Operands");
    CLI::App app(kAbout, "kivctl");
    app.formatter(formatter);
    app.footer(kVerbFooter);
    app.fallthrough();
    app.require_subcommand(1);
    AddGlobalOptions(app, command);
    AddVerbs(app, command);
    AddDescriptions(app, command, *formatter);
    app.footer(Footer()); // the verbs have taken theirs
    if (argc > 1 && std::strcmp(argv[1], kCompletionVerb) == 0)
        return Write(Completions(Describe(app, "", *formatter), {argv + 2, argv + argc}));
    try
    {
        app.parse(argc, argv);
        CheckForm(app, command);
    }
    catch (const CLI::Success& success)
    {
        std::ostringstream text;
        app.exit(success, text);
        Write(WrappedHelp(text.str(), TerminalWidth(STDOUT_FILENO)));
    }
    catch (const CLI::ParseError& error)
    {
        throw Failure(Exit::Usage, Explain(app, error));
    }
}
