#include "CommandLine.h"

#include "Manual.h"
#include "Nearest.h"
#include "Verbs.h"

#include <CLI/CLI.hpp>
#include <DASubscriberStore.h>

#include <algorithm>
#include <cstring>
#include <utility>

namespace
{

constexpr char kAbout[] = R"(An agent in miniature: asks the device what an agent asks, tells what an agent has to tell, plays a
client service, and changes the simulated device.)";

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

constexpr char kVerbFooter[] = R"(Options of every verb: --json, --profile NAME|FILE
kivctl --help tells of these, of the exit codes and of the environment.)";

/// A check of an option's text. @return what is wrong with it, empty when nothing is
std::string IsZeroOrMore(const std::string& text)
{
    double number = -1;
    const bool isRight = CLI::detail::lexical_cast(text, number) && number >= 0;
    return isRight ? "" : '"' + text + "\" is wrong; a number from 0 up would be right";
}

/// Between two words of a choice, in the help.
constexpr char kOr[] = "|";

/// Has the option take nothing but these words, "-" and "_" being one.
void Restrict(CLI::Option* option, const std::vector<std::string>& words)
{
    const auto check = [words](std::string& typed) -> std::string
    {
        const auto same = [](char one, char other)
        { return one == other || (one == '-' && other == '_') || (one == '_' && other == '-'); };
        for (const std::string& word : words)
        {
            if (std::equal(typed.begin(), typed.end(), word.begin(), word.end(), same))
            {
                typed = word;
                return "";
            }
        }
        return '"' + typed + "\" is wrong" + DidYouMean(typed, words) + "; right are " + Joined(words, ", ");
    };
    option->type_name(Joined(words, kOr))->transform(CLI::Validator(check, ""));
}

/// An option of a verb means nothing to the verb below it that runs.
void RefuseOptions(const CLI::App& verb, const std::string& below)
{
    const std::string whole = verb.get_name() + " " + below;
    const std::string rest = " belongs to \"" + verb.get_name() + "\" alone; \"" + whole +
                             "\" takes its own options behind it: kivctl " + whole + " --help";
    for (const CLI::Option* option : verb.get_options())
    {
        if (option->count() > 0)
            throw Failure(Exit::Usage, option->get_name() + rest);
    }
}

CLI::App* AddToHelp(CLI::App& app, const char* name, const char* help)
{
    return app.add_subcommand(name, help)->group("Verbs");
}

/// Adds a verb that runs with options of its own, which live as long as the command.
/// @return its command line, and the options to bind it to
template <typename Options>
std::pair<CLI::App*, std::shared_ptr<Options>> AddVerb(CLI::App& app, Command& command, const char* name, const char* help,
    Exit (*run)(const Options&, const Command&), DeviceUse deviceUse = DeviceUse::Asks)
{
    const auto options = std::make_shared<Options>();
    CLI::App* verb = AddToHelp(app, name, help);
    verb->callback(
        [=, &command]
        {
            if (!verb->get_subcommands().empty())
                return RefuseOptions(*verb, verb->get_subcommands().front()->get_name());
            command.deviceUse = deviceUse;
            command.verb = [options, run, &command] { return run(*options, command); };
        });
    return {verb, options};
}

/// The same for a verb without options.
void AddVerb(CLI::App& app, Command& command, const char* name, const char* help, Exit (*run)(const Command&),
    DeviceUse deviceUse = DeviceUse::Asks)
{
    AddToHelp(app, name, help)
        ->callback(
            [=, &command]
            {
                command.deviceUse = deviceUse;
                command.verb = [run, &command] { return run(command); };
            });
}

void AddShowIds(CLI::App* verb, Command& command, const char* help)
{
    verb->add_flag_callback(
        "--show-ids", [&command] { command.identifiers = Identifiers::Shown; }, help);
}

void AddCountry(CLI::App& app, Command& command)
{
    const auto [verb, options] = AddVerb(app, command, "country", "Everything known about a country", ShowCountry);
    verb->add_option("KEY", options->key, "MCC (450), alpha-2 code (kr), calling code (82 or +82) or service country code (ko_KR)")
        ->required();
    Restrict(verb->add_option("--by", options->kind, "What KEY is; guessed without"), CountryKeyKinds());
}

void AddDevice(CLI::App& app, Command& command)
{
    const auto [device, options] = AddVerb(app, command, "device", "What the device tells of itself", ShowDevice);
    AddShowIds(device, command, "Show serial number, IMEI and platform device ID whole");
    device->add_option("--package", options->package, "Tell of this package too")->type_name("ID");
    device->add_option("--storage", options->storageMiB, "Ask whether more than this is free in the internal storage")
        ->type_name("MIB")
        ->capture_default_str();
    AddVerb(*device, command, "id", "The device unique ID, asked of the device daemon on the bus", ShowDeviceId);

    const auto [set, assignments] = AddVerb(
        *device, command, "set", "Change values in a device file, which --profile FILE names", SetInDeviceFile, DeviceUse::Leaves);
    set->add_option("GROUP.KEY=VALUE", *assignments, "What to change, all of it or nothing (keys: kivctl device keys)")->required();
    AddVerb(*device, command, "keys", "What a device file may hold", ShowDeviceKeys, DeviceUse::Leaves);
    AddVerb(app, command, "profiles", "The devices that --profile knows by name", ShowProfiles, DeviceUse::Leaves);
}

void AddSim(CLI::App& app, Command& command)
{
    const auto addSlot = [](CLI::App* verb, SimOptions& options)
    { verb->add_option("--slot", options.slot, "Only this slot, counted from 0")->type_name("N")->check(IsZeroOrMore); };

    const auto [sim, options] = AddVerb(app, command, "sim", "The SIMs of the device, one row a slot", ShowSims);
    addSlot(sim, *options);
    AddShowIds(sim, command, "Show IMSIs and subscriber numbers whole");

    const auto [wait, waitOptions] = AddVerb(*sim, command, "wait", "Wait until a SIM is usable, asking once a second", WaitForSim);
    addSlot(wait, *waitOptions);
    wait->add_option("--timeout", waitOptions->timeout, "Seconds to wait at most; without it as long as a card may become usable")
        ->type_name("SECONDS")
        ->check(IsZeroOrMore);
}

void AddNetwork(CLI::App& app, Command& command)
{
    const auto [verb, options] =
        AddVerb(app, command, "network", "The network connections; exit code 0 when connected, 1 when not", ShowNetwork);
    verb->add_flag("--wifi", options->countsWifi, "Count Wi-Fi beside the cellular network");
    verb->add_flag("--bluetooth,--bt", options->countsBluetooth, "Count Bluetooth beside the cellular network");
    AddVerb(app, command, "watch", "Print each change of the network as it comes, until Ctrl-C", Watch);
}

void AddNotify(CLI::App& app, Command& command)
{
    const auto [verb, options] =
        AddVerb(app, command, "notify", "Tell client services, or the service manager, of an event", Notify);
    Restrict(verb->add_option("TYPE", options->types, "What happened; on and off may come several at once, each with its --service")
                 ->required(),
        NotificationTypes());
    Restrict(verb->add_option("--to", options->to, "Whom to tell")->capture_default_str(), {"subscribers", "manager"});
    verb->add_option("--imsi", options->imsi, "Subscriber identity concerned; that of the first SIM that answers without it")
        ->type_name("IMSI");
    verb->add_option("--service", options->services, "Service of on, off and policy, once for each TYPE")->type_name("ID");
    verb->add_option("--texts", options->texts, "policy: status, feature, version, document URL; number-changed: any four")
        ->type_name("TEXT")
        ->expected(4);
}

void AddPush(CLI::App& app, Command& command)
{
    const auto [verb, options] =
        AddVerb(app, command, "push", "Deliver a push message to the client services that subscribed to it", Push);
    verb->add_option("SERVICE", options->service, "Service whose message it is")->required();
    verb->add_option("--data", options->data, "Data for the client service")->required();
    verb->add_option("--message", options->message, "Message for the user")->required();
    verb->add_option("--time", options->time, "When it was sent, a 64-bit number; now, in seconds since 1970, without it")
        ->type_name("NUMBER");
}

void AddSubscribe(CLI::App& app, Command& command)
{
    const auto [verb, options] =
        AddVerb(app, command, "subscribe", "Be a client service: subscribe and print each call, until Ctrl-C", Subscribe);
    Restrict(verb->add_option("--kind", options->kinds, "Event to hear of; may come several times"), DASubscriberStore::Kinds());
    verb->add_option("--key", options->key, "Service of policy and status (a number) and of push (a name)")->type_name("SERVICE");
    verb->add_option("--push", options->pushes, "The same as --kind push --key SERVICE")->type_name("SERVICE");
    verb->add_option("--name", options->name, "Bus name to own; the connection's unique name without it")->type_name("BUS_NAME");
    verb->add_option("--store", options->store, "Subscribe in this file, not by the subscription service")->type_name("FILE");
}

void AddSubscribers(CLI::App& app, Command& command)
{
    CLI::App* subscribers = AddToHelp(app, "subscribers", "Who is told of which event")->require_subcommand(1);
    AddVerb(*subscribers, command, "list", "All subscriptions, in the order in which they were made", ListSubscribers);

    const auto addFields = [](CLI::App* verb, SubscriptionOptions& options)
    {
        Restrict(verb->add_option("KIND", options.kind, "Event to hear of")->required(), DASubscriberStore::Kinds());
        verb->add_option("KEY", options.key, "Service id, service name for push, or \"all\"")->required();
        verb->add_option("BUS_NAME", options.busName, "Such as org.example.Client")->required();
        verb->add_option("OBJECT_PATH", options.objectPath, "Such as /org/example/Client")->required();
        verb->add_option("INTERFACE", options.interface, "Such as org.example.Client")->required();
    };
    const auto [add, added] = AddVerb(*subscribers, command, "add", "Record a subscription", AddSubscriber);
    addFields(add, *added);
    const auto [remove, removed] = AddVerb(*subscribers, command, "remove", "Take a subscription out", RemoveSubscriber);
    addFields(remove, *removed);
}

void AddServices(CLI::App& app, Command& command)
{
    const auto [verb, options] =
        AddVerb(app, command, "services", "Be device daemon and service manager and print each call, until Ctrl-C", RunServices);
    verb->add_option("--serial", options->serial, "Serial number that the device daemon tells; the device's own without it");
}

void AddDoctor(CLI::App& app, Command& command)
{
    AddVerb(
        app, command, "doctor", "Check bus, services, store, device and library, and say what to do", Examine, DeviceUse::Leaves);
}

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

/// For the build alone: prints what is installed beside the program.
void AddDescribe(CLI::App& app, Command& command, const CLI::Formatter& formatter)
{
    const auto add = [&](const char* name, std::string (*text)(const VerbManual&))
    {
        CLI::App* verb = app.add_subcommand(name)->group("");
        verb->callback(
            [&app, &command, &formatter, text]
            {
                command.deviceUse = DeviceUse::Leaves;
                command.verb = [description = text(Describe(app, "", formatter))]
                {
                    std::fputs(description.c_str(), stdout);
                    return Exit::Done;
                };
            });
    };
    add("print-man-page", ManPage);
    add("print-bash-completion", BashCompletion);
}

void AddGlobalOptions(CLI::App& app, Command& command)
{
    app.set_help_flag("-h,--help", "Show this help and end");
    app.set_version_flag("--version", "kivctl " KIV_VERSION)->description("Show the version and end");
    app.add_flag_callback(
        "--json", [&command] { command.form = Form::Json; }, "Print JSON; what comes over time as one object a line");
    app.add_option("--profile", command.profile, "The device: the name of a profile (kivctl profiles) or a file")
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

/// What was wrong with the command line, and what would be right. An unknown word is told first: what else is wrong comes of it.
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
    return (lacksVerb ? "a verb is needed: " + Joined(place.verbs, ", ") : error.what()) + more;
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
    for (const auto add :
        {AddCountry, AddDevice, AddSim, AddNetwork, AddNotify, AddPush, AddSubscribe, AddSubscribers, AddServices, AddDoctor})
        add(app, command);
    AddDescribe(app, command, *formatter);
    app.footer(Footer()); // the verbs have taken theirs
    try
    {
        app.parse(argc, argv);
    }
    catch (const CLI::Success& success)
    {
        app.exit(success);
    }
    catch (const CLI::ParseError& error)
    {
        throw Failure(Exit::Usage, Explain(app, error));
    }
}
