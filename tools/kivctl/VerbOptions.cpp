#include "VerbOptions.h"

#include "Nearest.h"
#include "Verbs.h"

#include <CLI/CLI.hpp>
#include <DASubscriberStore.h>

#include <algorithm>
#include <cmath>
#include <utility>

namespace
{

/// A check of an option's text. @return what is wrong with it, empty when nothing is
template <typename Number>
std::string Check(const std::string& text, bool mayBeNegative, const char* right)
{
    Number number{};
    const bool isNumber = CLI::detail::lexical_cast(text, number) && std::isfinite(static_cast<double>(number));
    return isNumber && (mayBeNegative || number >= 0) ? "" : '"' + text + "\" is wrong; " + right + " would be right";
}

std::string IsNumber(const std::string& text)
{
    return Check<double>(text, true, "a number");
}

std::string IsZeroOrMore(const std::string& text)
{
    return Check<double>(text, false, "a number from 0 up");
}

std::string IsWhole(const std::string& text)
{
    return Check<std::int64_t>(text, true, "a whole number of 64 bits");
}

std::string IsServiceId(const std::string& text)
{
    return Check<int>(text, true, "a whole number of 32 bits");
}

std::string IsSlot(const std::string& text)
{
    return Check<int>(text, false, "a number from 0 up");
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

/// What is to be known of a verb before it runs.
struct Traits
{
    DeviceUse deviceUse = DeviceUse::Asks;
    Prints prints = Prints::Records;
};
constexpr Traits kWithoutDevice{DeviceUse::Leaves};
constexpr Traits kPrintsEvents{DeviceUse::Asks, Prints::Events};

/// Adds a verb that runs with options of its own, which live as long as the command.
/// @return its command line, and the options to bind it to
template <typename Options>
std::pair<CLI::App*, std::shared_ptr<Options>> AddVerb(CLI::App& app, Command& command, const char* name, const char* help,
    Exit (*run)(const Options&, const Command&), Traits traits = {})
{
    const auto options = std::make_shared<Options>();
    CLI::App* verb = AddToHelp(app, name, help);
    verb->callback(
        [=, &command]
        {
            if (!verb->get_subcommands().empty())
                return RefuseOptions(*verb, verb->get_subcommands().front()->get_name());
            command.deviceUse = traits.deviceUse;
            command.prints = traits.prints;
            command.verb = [options, run, &command] { return run(*options, command); };
        });
    return {verb, options};
}

/// The same for a verb without options.
CLI::App* AddVerb(
    CLI::App& app, Command& command, const char* name, const char* help, Exit (*run)(const Command&), Traits traits = {})
{
    CLI::App* verb = AddToHelp(app, name, help);
    verb->callback(
        [=, &command]
        {
            if (!verb->get_subcommands().empty())
                return;
            command.deviceUse = traits.deviceUse;
            command.prints = traits.prints;
            command.verb = [run, &command] { return run(command); };
        });
    return verb;
}

void AddShowIds(CLI::App* verb, Command& command, const char* help)
{
    verb->add_flag_callback(
        "--show-ids", [&command] { command.identifiers = Identifiers::Shown; }, help);
}

void AddCountry(CLI::App& app, Command& command)
{
    const auto [verb, options] = AddVerb(app, command, "country", "Show what the tables know about a country", ShowCountry);
    verb->add_option("KEY", options->key, "MCC (450), alpha-2 code (kr), calling code (82 or +82) or service country code (ko_KR)")
        ->required();
    Restrict(verb->add_option("--by", options->kind, "Type of KEY (default: guessed)"), CountryKeyKinds());
}

void AddDevice(CLI::App& app, Command& command)
{
    const auto [device, options] = AddVerb(app, command, "device", "Show the device's properties and settings", ShowDevice);
    AddShowIds(device, command, "Show serial number, IMEI and platform device ID unmasked");
    device->add_option("--package", options->package, "Show also whether this package is installed, and its version")
        ->type_name("ID");
    device->add_option("--storage", options->storageMiB, "Show whether more than this is free in the internal storage")
        ->type_name("MIB")
        ->capture_default_str()
        ->check(IsNumber);
    AddVerb(*device, command, "id", "Ask the device daemon on the bus for the device unique ID", ShowDeviceId);

    constexpr Traits kChangesFile{DeviceUse::Leaves, Prints::Events};
    const auto [set, changes] =
        AddVerb(*device, command, "set", "Change values in the device file that --profile names", SetInDeviceFile, kChangesFile);
    set->add_option("GROUP.KEY=VALUE", changes->words, "What to change, all of it or nothing (keys: kivctl device keys)");
    set->add_option("--from", changes->from, "Create the file from this profile (default: from the one in use)")
        ->type_name("PROFILE");
    const auto [unset, removals] = AddVerb(*device, command, "unset",
        "Remove keys from the device file that --profile names, so that they have their defaults", UnsetInDeviceFile, kChangesFile);
    unset->add_option("GROUP.KEY", removals->words, "What to remove, all of it or nothing")->required();
    const auto [get, value] =
        AddVerb(*device, command, "get", "Show the device's values as a device file holds them", ShowDeviceValues);
    get->add_option("GROUP.KEY", value->key, "Print only this value");
    AddShowIds(get, command, "List identifying values unmasked; with GROUP.KEY they always are");
    AddVerb(*device, command, "keys", "List what a device file may contain", ShowDeviceKeys, kWithoutDevice);

    CLI::App* const profiles =
        AddVerb(app, command, "profiles", "List the devices that --profile knows by name", ShowProfiles, kWithoutDevice);
    const auto [show, profile] =
        AddVerb(*profiles, command, "show", "Print a profile in the form of a device file", ShowProfile, kWithoutDevice);
    show->add_option("PROFILE", profile->name, "Name of the profile")->required();
}

void AddSim(CLI::App& app, Command& command)
{
    const auto addSlot = [](CLI::App* verb, SimOptions& options)
    { verb->add_option("--slot", options.slot, "Only this slot, counted from 0")->type_name("N")->check(IsSlot); };

    const auto [sim, options] = AddVerb(app, command, "sim", "List the SIMs, one row per slot", ShowSims);
    addSlot(sim, *options);
    AddShowIds(sim, command, "Show IMSIs and subscriber numbers unmasked");

    const auto [wait, waitOptions] = AddVerb(*sim, command, "wait", "Wait until a SIM is usable, asking once a second", WaitForSim);
    addSlot(wait, *waitOptions);
    wait->add_option("--timeout", waitOptions->timeout, "Longest wait in seconds (default: as long as a card may become usable)")
        ->type_name("SECONDS")
        ->check(IsZeroOrMore);
}

void AddNetwork(CLI::App& app, Command& command)
{
    const auto [verb, options] =
        AddVerb(app, command, "network", "Show the network connections; exit code 0 when connected, 1 when not", ShowNetwork);
    verb->add_flag("--wifi", options->countsWifi, "Count Wi-Fi as well as the cellular network");
    verb->add_flag("--bluetooth,--bt", options->countsBluetooth, "Count Bluetooth as well as the cellular network");
    AddVerb(app, command, "watch",
        "Print network changes as they happen, and SIM changes, for which it asks once a second, until Ctrl-C", Watch,
        kPrintsEvents);
}

void AddNotify(CLI::App& app, Command& command)
{
    const auto [verb, options] =
        AddVerb(app, command, "notify", "Notify the subscribers, or the service manager, of an event", Notify, kPrintsEvents);
    Restrict(verb->add_option("TYPE", options->types,
                     "Event; \"status\" means on, \"auth\" auth-success; on and off may be several, each with its --service")
                 ->required(),
        NotificationTypes());
    Restrict(verb->add_option("--to", options->to, "Whom to notify")->capture_default_str(), {"subscribers", "manager"});
    verb->add_option("--imsi", options->imsi, "Subscriber identity (default: that of the first SIM that answers)")
        ->type_name("IMSI");
    verb->add_option("--service", options->services, "Service of on, off and policy, once for each TYPE")
        ->type_name("ID")
        ->check(IsServiceId);
    verb->add_option("--texts", options->texts, "policy: status, feature, version, document URL; number-changed: any four")
        ->type_name("TEXT")
        ->expected(4);
    verb->add_option("--timeout", options->timeout, "Longest wait for all answers in seconds (default: no limit); exit code 3")
        ->type_name("SECONDS")
        ->check(IsZeroOrMore);
}

void AddPush(CLI::App& app, Command& command)
{
    const auto [verb, options] =
        AddVerb(app, command, "push", "Deliver a push message to the client services that subscribed to it", Push, kPrintsEvents);
    verb->add_option("SERVICE", options->service, "Service that the message is for")->required();
    verb->add_option("--data", options->data, "Data for the client service")->required();
    verb->add_option("--message", options->message, "Message for the user")->required();
    verb->add_option("--time", options->time, "Time of sending, a 64-bit number (default: now, in seconds since 1970)")
        ->type_name("NUMBER")
        ->check(IsWhole);
}

void AddSubscribe(CLI::App& app, Command& command)
{
    const auto [verb, options] = AddVerb(
        app, command, "subscribe", "Run a client service: subscribe, and print each call, until Ctrl-C", Subscribe, kPrintsEvents);
    Restrict(
        verb->add_option("--kind", options->kinds, "Kind of event to subscribe to; may be repeated"), DASubscriberStore::Kinds());
    verb->add_option("--key", options->key, "Service of policy and status (a number) and of push (a name)")->type_name("SERVICE");
    verb->add_option("--push", options->pushes, "Same as --kind push --key SERVICE")->type_name("SERVICE");
    verb->add_option("--name", options->name, "Bus name to own (default: the connection's unique name)")->type_name("BUS_NAME");
    verb->add_option("--store", options->store, "Subscribe in this file, not by the subscription service")->type_name("FILE");
}

void AddSubscribers(CLI::App& app, Command& command)
{
    CLI::App* subscribers = AddToHelp(app, "subscribers", "Manage the subscriber store")->require_subcommand(1);
    AddVerb(*subscribers, command, "list", "List all subscriptions, oldest first", ListSubscribers);

    const auto addFields = [](CLI::App* verb, SubscriptionOptions& options)
    {
        Restrict(verb->add_option("KIND", options.kind, "Kind of event")->required(), DASubscriberStore::Kinds());
        verb->add_option("KEY", options.key, "Service id, service name for push, or \"all\"")->required();
        verb->add_option("BUS_NAME", options.busName, "Such as org.example.Client")->required();
        verb->add_option("OBJECT_PATH", options.objectPath, "Such as /org/example/Client")->required();
        verb->add_option("INTERFACE", options.interface, "Such as org.example.Client")->required();
    };
    const auto [add, added] = AddVerb(*subscribers, command, "add", "Record a subscription", AddSubscriber, kPrintsEvents);
    addFields(add, *added);
    const auto [remove, removed] =
        AddVerb(*subscribers, command, "remove", "Remove a subscription", RemoveSubscriber, kPrintsEvents);
    addFields(remove, *removed);
}

void AddServices(CLI::App& app, Command& command)
{
    const auto [verb, options] = AddVerb(app, command, "services",
        "Run the device daemon and the service manager, and print each call, until Ctrl-C", RunServices, kPrintsEvents);
    verb->add_option("--serial", options->serial, "Serial number that the device daemon returns (default: the device's own)");
}

void AddDoctor(CLI::App& app, Command& command)
{
    AddVerb(
        app, command, "doctor", "Check bus, services, store, device and library, and suggest remedies", Examine, kWithoutDevice);
}

} // namespace

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

void AddVerbs(CLI::App& app, Command& command)
{
    for (const auto add :
        {AddCountry, AddDevice, AddSim, AddNetwork, AddNotify, AddPush, AddSubscribe, AddSubscribers, AddServices, AddDoctor})
        add(app, command);
}
