#include "CommandLine.h"

#include "Completion.h"
#include "Layout.h"
#include "Manual.h"
#include "Nearest.h"
#include "VerbOptions.h"

#include <CLI/CLI.hpp>
#include <StandardOutput.h>

#include <unistd.h>

#include <algorithm>
#include <cctype>
#include <cstring>
#include <sstream>
#include <utility>

namespace
{

constexpr size_t kHelpColumn = 28; ///< of the descriptions

constexpr char kAbout[] =
    "Query the device as an agent does, send an agent's notifications and push messages, run a client service, and change the "
    "simulated device.";

/// The end of the program's help.
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
        text.append("\n  ")
            .append(variable.name)
            .append(kHelpColumn - 2 - std::strlen(variable.name), ' ')
            .append(variable.meaning);
    return text;
}

constexpr char kVerbFooter[] = "Options of every verb: --json, --color WHEN, --profile NAME|FILE\n"
                               "kivctl --help describes these options, the exit codes and the environment.";

/// Describes options and operands as this program's help does.
class HelpFormatter : public CLI::Formatter
{
public:
    HelpFormatter()
    {
        column_width(kHelpColumn);
        label("SUBCOMMAND", "VERB");
        label("Positionals", "Operands");
    }

    std::string make_option_name(const CLI::Option* option, bool isOperand) const override
    {
        return CLI::detail::find_and_replace(Formatter::make_option_name(option, isOperand), ",", ", ");
    }

    std::string make_option_opts(const CLI::Option* option) const override
    {
        std::string text;
        const bool isOperand = option->get_positional(); // the usage shows whether it may be left out
        const bool isNamedAfterValue = isOperand && option->get_type_name() == "TEXT";
        for (int i = 0; i < option->get_items_expected_min() && option->get_type_size() != 0 && !isNamedAfterValue; ++i)
            text += " " + option->get_type_name();
        if (option->get_items_expected_max() > option->get_items_expected_min())
            text += " ...";
        return text + (option->get_required() && !isOperand ? " (required)" : "");
    }
};

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

VerbManual Describe(const CLI::App& app, const std::string& path, const Command& command, const CLI::Formatter& formatter)
{
    VerbManual manual;
    manual.path = path;
    manual.usage = formatter.make_usage(&app, path.empty() ? app.get_name() : path);
    manual.usage = CLI::detail::trim_copy(manual.usage.substr(manual.usage.find(' ')));
    manual.help = app.get_description();
    if (const auto fields = command.fields.find(&app); fields != command.fields.end())
        manual.fields = fields->second;
    for (const CLI::Option* option : app.get_options())
        manual.options.push_back(Describe(*option, formatter));
    for (const CLI::App* verb : app.get_subcommands([](const CLI::App* candidate) { return !candidate->get_group().empty(); }))
        manual.verbs.push_back(Describe(*verb, path + (path.empty() ? "" : " ") + verb->get_name(), command, formatter));
    return manual;
}

/// Adds the verbs that describe the command line itself: the shells' completion scripts and, for the build, the manual page.
void AddDescriptions(CLI::App& app, Command& command, const CLI::Formatter& formatter)
{
    const auto print = [&command](const std::string& text)
    {
        command.deviceUse = DeviceUse::Leaves;
        command.verb = [text]
        {
            kiv::StandardOutput::Write(text);
            return Exit::Done;
        };
    };
    CLI::App* completion = app.add_subcommand("completion", "Print the completion script for a shell")->group("Verbs");
    const auto shell = std::make_shared<std::string>();
    Restrict(completion->add_option("SHELL", *shell, "Name of the shell")->required(), CompletionShells());
    completion->callback([print, shell] { print(CompletionScript(*shell)); });
    app.add_subcommand("print-man-page")
        ->group("")
        ->callback([print, &app, &command, &formatter] { print(ManPage(Describe(app, "", command, formatter))); });
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
    app.set_help_flag("-h,--help", "Show this help and exit");
    app.set_version_flag("-V,--version", "kivctl " KIV_VERSION)->description("Show the version and exit");
    Form& form = command.form;
    CLI::Option* const json = app.add_flag_callback(
        "-j,--json", [&form] { form.notation = Form::Notation::Json; }, "Print JSON; for events, one object per line");
    app.add_flag_callback(
           "-t,--terse", [&form] { form.notation = Form::Notation::Terse; },
           "In queries, print only values, one record per line, separated by \":\" (\":\" in a value becomes \"\\:\"); not with "
           "--json")
        ->excludes(json);
    app.add_option_function<std::string>(
           "--fields", [&form](const std::string& text) { form.fields = FieldNames(text); },
           "In queries, print only these fields, in this order; the help of each query lists its fields")
        ->type_name("NAME,NAME");
    CLI::Option* const colour = app.add_option_function<std::string>(
        "--color",
        [&form](const std::string& when) {
            form.colour = when == "auto" ? Form::Colour::Auto : when == "always" ? Form::Colour::Always : Form::Colour::Never;
        },
        "Use colour always, never, or on a terminal only (default: auto)");
    Restrict(colour, {"auto", "always", "never"});
    app.add_option("-p,--profile", command.profile, "Device to use: a device file, or a name that kivctl profiles lists")
        ->type_name("NAME|FILE");
}

/// The verb that was typed, and the options and verbs that may follow it.
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

/// The parser's message in the words of this program.
std::string Reworded(const CLI::App& verb, const CLI::ParseError& error)
{
    std::string text = error.what();
    if (dynamic_cast<const CLI::ExcludesError*>(&error) != nullptr)
        return CLI::detail::find_and_replace(text, "excludes", "cannot be used with");
    const std::string name = text.substr(0, text.find_first_of(": "));
    if (text.find("disallowed flag override") != text.npos) // names the flag without its dashes
        return (name.size() > 1 ? "--" : "-") + name + " takes no value";
    const CLI::Option* option = nullptr;
    for (const CLI::App* app = &verb; app != nullptr && option == nullptr; app = app->get_parent())
        option = app->get_option_no_throw(name);
    if (option == nullptr || dynamic_cast<const CLI::ArgumentMismatch*>(&error) == nullptr)
        return text;
    const int least = option->get_items_expected_min();
    if (least > 1)
        return name + " needs " + std::to_string(least) + " values, not " + std::to_string(option->count());
    return name + (option->count() == 0 ? " needs a value: " + option->get_type_name() : " is given more than once");
}

/// Says what is wrong with the command line and what is expected. Reports an unknown word first, because it causes other errors.
std::string Explain(const CLI::App& program, const CLI::ParseError& error)
{
    const Place place = FindPlace(program);
    const std::string more = "; see " + place.verb + " --help";
    const std::vector<std::string> unknown = program.remaining(true);
    const auto option =
        std::find_if(unknown.begin(), unknown.end(), [](const std::string& word) { return word.rfind('-', 0) == 0; });
    if (option != unknown.end())
        return "unknown option \"" + *option + "\" of " + place.verb + DidYouMean(*option, place.options) + more;
    if (!unknown.empty() && place.verbs.empty())
        return "unexpected word \"" + unknown.front() + "\" after " + place.verb + more;
    if (!unknown.empty())
        return "unknown verb \"" + unknown.front() + "\" of " + place.verb + DidYouMean(unknown.front(), place.verbs) + more;
    const bool lacksVerb = dynamic_cast<const CLI::RequiredError*>(&error) != nullptr &&
                           place.app->get_require_subcommand_min() > 0 && place.app->get_subcommands().empty();
    return (lacksVerb ? "missing verb; expected one of " + Joined(place.verbs, ", ") : Reworded(*place.app, error)) + more;
}

/// Refuses the wrong fields before the verb runs, because some verbs take long.
void CheckForm(const CLI::App& program, const Command& command)
{
    const Place place = FindPlace(program);
    const auto fields = command.fields.find(place.app);
    const bool isChosen = command.form.notation == Form::Notation::Terse || !command.form.fields.empty();
    if (fields != command.fields.end())
        RequireFields(fields->second, command.form);
    else if (command.verb && isChosen)
        throw Failure(Exit::Usage, "--fields and --terse are for queries, and " + place.verb + " is not a query");
}

} // namespace

void ReadCommandLine(int argc, char** argv, Command& command)
{
    const auto formatter = std::make_shared<HelpFormatter>();
    CLI::App app(kAbout, "kivctl");
    app.formatter(formatter);
    app.footer(kVerbFooter);
    app.fallthrough();
    app.option_defaults()->disable_flag_override();
    app.require_subcommand(1);
    AddGlobalOptions(app, command);
    AddVerbs(app, command);
    AddDescriptions(app, command, *formatter);
    app.footer(Footer()); // the verbs have copied the other one
    if (argc > 1 && std::strcmp(argv[1], kCompletionVerb) == 0)
        return kiv::StandardOutput::Write(Completions(Describe(app, "", command, *formatter), {argv + 2, argv + argc}));
    try
    {
        app.parse(argc, argv);
        CheckForm(app, command);
    }
    catch (const CLI::Success& success)
    {
        std::ostringstream text;
        app.exit(success, text);
        kiv::StandardOutput::Write(WrappedHelp(text.str(), TerminalWidth(STDOUT_FILENO), kHelpColumn));
    }
    catch (const CLI::ParseError& error)
    {
        throw Failure(Exit::Usage, Explain(app, error));
    }
}
