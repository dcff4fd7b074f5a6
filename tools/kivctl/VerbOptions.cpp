#include "VerbOptions.h"

#include "Nearest.h"
#include "Verbs.h"

#include <CLI/CLI.hpp>
#include <DASubscriberStore.h>
#include <gio/gio.h>

#include <algorithm>
#include <charconv>
#include <cmath>
#include <limits>
#include <type_traits>
#include <utility>

namespace
{

/// Limits an option to numbers, in decimal notation.
/// @param expected  describes them
template <typename Number>
CLI::Validator Numbers(Number least, const std::string& expected)
{
    const auto check = [least, expected](std::string& text) -> std::string
    {
        Number number{};
        const char* const end = text.data() + text.size();
        const auto [stop, error] = std::from_chars(text.data(), end, number);
        if (error != std::errc() || stop != end || !std::isfinite(static_cast<double>(number)) || number < least)
            return '"' + text + "\" is invalid; expected " + expected;
        if constexpr (std::is_integral_v<Number>)
            text = std::to_string(number); // the parser reads leading zeros as octal notation
        return "";
    };
    return CLI::Validator(check, "");
}

std::string IsUtf8(const std::string& text)
{
    return g_utf8_validate(text.c_str(), -1, nullptr) ? "" : '"' + text + "\" is invalid; expected UTF-8";
}

std::string IsBusName(const std::string& text)
{
    const bool isName = text.empty() || (g_dbus_is_name(text.c_str()) && !g_dbus_is_unique_name(text.c_str()));
    return isName ? "" : '"' + text + "\" is invalid; expected elements joined by dots, such as org.example.Client";
}

/// Refuses options of a verb when a verb below it runs, which ignores them.
void RefuseOptions(const CLI::App& verb, const std::string& below)
{
    const std::string whole = verb.get_name() + " " + below;
    const std::string rest =
        " is an option of \"" + verb.get_name() + "\"; those of \"" + whole + "\" go after it (see kivctl " + whole + " --help)";
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

/// Makes the verb a query, which prints records.
/// @param fields  names of the fields that a record may have
void AddFields(CLI::App* verb, Command& command, const std::vector<std::string>& fields)
{
    command.fields[verb] = fields;
    // Printed above the footer of all verbs.
    verb->footer([fields] { return "Fields: " + Joined(fields, ", ") + "\nOptions of every query: --terse, --fields NAME,NAME"; });
}

/// Adds a verb with options, which live as long as the command.
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
CLI::App* AddVerb(CLI::App& app, Command& command, const char* name, const char* help, Exit (*run)(const Command&),
    DeviceUse deviceUse = DeviceUse::Asks)
{
    CLI::App* verb = AddToHelp(app, name, help);
    verb->callback(
        [=, &command]
        {
            if (!verb->get_subcommands().empty())
                return;
            command.deviceUse = deviceUse;
            command.verb = [run, &command] { return run(command); };
        });
    return verb;
}

void AddShowIds(CLI::App* verb, Command& command, const char* help)
{
    verb->add_flag_callback(
        "--show-ids", [&command] { command.identifiers = Identifiers::Shown; }, help);
}

/// Limits the option to the kinds of events; each type of an event means its kind.
void RestrictToKinds(CLI::Option* option)
{
    std::map<std::string, std::string> kinds;
    for (const std::string& type : NotificationTypes())
        kinds[type] = KindOf(type);
    Restrict(option, DASubscriberStore::Kinds(), kinds);
}

void AddCountry(CLI::App& app, Command& command)
{
    const auto [verb, options] = AddVerb(app, command, "country", "Show the data about a country", ShowCountry);
    AddFields(
        verb, command, {"mcc", "name", "alpha2", "alpha3", "calling_code", "service_code", "mo_support", "alpha2_of_calling_code"});
    verb->add_option("KEY", options->key, "MCC (450), alpha-2 code (kr), calling code (82 or +82) or service country code (ko_KR)")
        ->required();
    Restrict(verb->add_option("--by", options->kind, "Type of KEY (default: guessed)"), CountryKeyKinds());
}

void AddDevice(CLI::App& app, Command& command)
{
    const auto [device, options] = AddVerb(app, command, "device", "Show the device's properties and settings", ShowDevice);
    AddFields(device, command,
        {"name", "model", "platform", "platform_version", "platform_device_id", "serial", "imei", "sales_code", "language",
            "language_iso639", "time", "font_size", "flight_mode", "mobile_data", "data_roaming", "storage_needed_mib",
            "storage_suffices", "package", "package_installed", "package_version"});
    AddShowIds(device, command, "Show serial number, IMEI and platform device ID unmasked");
    device->add_option("--package", options->package, "Also show whether this package is installed, and its version")
        ->type_name("ID");
    device
        ->add_option("--storage", options->storageMiB,
            "Check that more than this is free in the internal storage, in mebibytes (default: 100)")
        ->type_name("MIB")
        ->transform(Numbers(std::numeric_limits<double>::lowest(), "a number"));
    AddFields(AddVerb(*device, command, "id", "Read the device unique ID from the device daemon on the bus", ShowDeviceId), command,
        {"device_id"});

    const auto [set, changes] = AddVerb(
        *device, command, "set", "Change values in the device file that --profile names", SetInDeviceFile, DeviceUse::Leaves);
    set->add_option("GROUP.KEY=VALUE", changes->words,
        "Values to change; if one is wrong, nothing changes (kivctl device keys lists the keys)");
    set->add_option("--from", changes->from, "Create the file from this profile (default: from the profile in use)")
        ->type_name("PROFILE");
    const auto [unset, removals] = AddVerb(*device, command, "unset",
        "Reset keys of the device file that --profile names to their defaults", UnsetInDeviceFile, DeviceUse::Leaves);
    unset->add_option("GROUP.KEY", removals->words, "Keys to remove from the file; if one is wrong, nothing changes")->required();
    const auto [get, value] =
        AddVerb(*device, command, "get", "Show the device's values under the keys of a device file", ShowDeviceValues);
    AddFields(get, command, {"key", "value"});
    get->add_option("GROUP.KEY", value->key, "Print only this value, unmasked");
    AddShowIds(get, command, "Show values unmasked that identify a person or a device");
    AddFields(AddVerb(*device, command, "keys", "List the keys of a device file", ShowDeviceKeys, DeviceUse::Leaves), command,
        {"key", "values", "default", "meaning"});

    CLI::App* const profiles =
        AddVerb(app, command, "profiles", "List the names that --profile accepts", ShowProfiles, DeviceUse::Leaves);
    AddFields(profiles, command, {"name", "description"});
    const auto [show, profile] =
        AddVerb(*profiles, command, "show", "Print a profile in the form of a device file", ShowProfile, DeviceUse::Leaves);
    AddFields(show, command, {"key", "value"});
    show->add_option("PROFILE", profile->name, "Name of the profile")->required();
}

void AddSim(CLI::App& app, Command& command)
{
    const auto addSlot = [](CLI::App* verb, SimOptions& options)
    {
        verb->add_option("--slot", options.slot, "Use only this slot, counted from 0")
            ->type_name("N")
            ->transform(Numbers(0, "0 or a positive whole number"));
    };

    const auto [sim, options] = AddVerb(app, command, "sim", "List the SIMs, one row per slot", ShowSims);
    AddFields(sim, command,
        {"slot", "cp_name", "state", "card", "mcc", "country", "mnc", "imsi", "number", "service", "service_type", "roaming", "sms",
            "default_for"});
    addSlot(sim, *options);
    AddShowIds(sim, command, "Show IMSIs and subscriber numbers unmasked");

    const auto [wait, waitOptions] =
        AddVerb(*sim, command, "wait", "Wait until a SIM is usable, checking once per second", WaitForSim);
    AddFields(wait, command, {"usable_slot", "waited_seconds"});
    addSlot(wait, *waitOptions);
    wait->add_option(
            "--timeout", waitOptions->timeout, "Maximum wait in seconds (default: no limit while a SIM can still become usable)")
        ->type_name("SECONDS")
        ->transform(Numbers(0.0, "0 or a positive number"));
}

void AddNetwork(CLI::App& app, Command& command)
{
    const auto [verb, options] =
        AddVerb(app, command, "network", "Show the network connections; exit code 1 when not connected", ShowNetwork);
    AddFields(verb, command, {"cellular", "wifi", "bluetooth", "connected"});
    verb->add_flag("--wifi", options->countsWifi, "Also count Wi-Fi as a connection");
    verb->add_flag("--bluetooth,--bt", options->countsBluetooth, "Also count Bluetooth as a connection");
    AddVerb(
        app, command, "watch", "Print changes of the network and the SIMs until Ctrl-C; the SIMs are read once per second", Watch);
}

void AddNotify(CLI::App& app, Command& command)
{
    const auto [verb, options] =
        AddVerb(app, command, "notify", "Send an event to the subscribers or to the service manager", Notify);
    Restrict(verb->add_option("TYPE", options->types,
                     "Event to send. Several on and off may be given, each with a --service. Kinds are accepted too: status means "
                     "on, auth "
                     "means auth-success")
                 ->required(),
        NotificationTypes(), {{"status", "on"}, {"auth", "auth-success"}});
    Restrict(verb->add_option("--to", options->to, "Receivers of the event (default: subscribers)"), {"subscribers", "manager"});
    verb->add_option("--imsi", options->imsi, "Subscriber that the event is about (default: the first SIM that answers)")
        ->type_name("IMSI");
    verb->add_option("--service", options->services, "Service ID, for on, off and policy; one per TYPE")
        ->type_name("ID")
        ->transform(Numbers(std::numeric_limits<int>::min(), "a 32-bit whole number"));
    verb->add_option("--texts", options->texts,
            "Texts of the event; policy: status, feature, version, document URL; number_changed: any four")
        ->type_name("TEXT")
        ->expected(4);
    verb->add_option("--timeout", options->timeout,
            "Maximum wait for all answers in seconds; exit code 3 when it is over (default: no limit)")
        ->type_name("SECONDS")
        ->transform(Numbers(0.0, "0 or a positive number"));
}

void AddPush(CLI::App& app, Command& command)
{
    const auto [verb, options] =
        AddVerb(app, command, "push", "Deliver a push message to the client services that subscribed to it", Push);
    verb->add_option("SERVICE", options->service, "Name of the service that the message is for")->required();
    verb->add_option("--data", options->data, "Data for the client service")->required();
    verb->add_option("--message", options->message, "Message for the user")->required();
    verb->add_option("--time", options->time, "Time of sending, a 64-bit number (default: now, in seconds since 1970)")
        ->type_name("NUMBER")
        ->transform(Numbers(std::numeric_limits<std::int64_t>::min(), "a 64-bit whole number"));
}

void AddSubscribe(CLI::App& app, Command& command)
{
    const auto [verb, options] =
        AddVerb(app, command, "subscribe", "Run a client service that prints each event until Ctrl-C", Subscribe);
    RestrictToKinds(verb->add_option("--kind", options->kinds,
        "Kind of event to subscribe to; may be repeated. The TYPE words of notify are accepted too: on means status"));
    verb->add_option("--key", options->key, "Service to subscribe to: a number for policy and status, a name for push")
        ->type_name("SERVICE");
    verb->add_option("--push", options->pushes, "Same as --kind push --key SERVICE")->type_name("SERVICE");
    verb->add_option("--name", options->name, "Bus name to own (default: the connection's unique name)")
        ->type_name("BUS_NAME")
        ->check(IsBusName);
    verb->add_option("--store", options->store, "Write the subscriptions to this file instead of using the subscription service")
        ->type_name("FILE");
}

void AddSubscribers(CLI::App& app, Command& command)
{
    CLI::App* subscribers = AddToHelp(app, "subscribers", "Manage the subscriber store")->require_subcommand(1);
    AddFields(AddVerb(*subscribers, command, "list", "List all subscriptions, oldest first", ListSubscribers), command,
        {"kind", "key", "bus_name", "object_path", "interface"});

    const auto addFields = [](CLI::App* verb, SubscriptionOptions& options)
    {
        RestrictToKinds(
            verb->add_option("KIND", options.kind, "Kind of event; the TYPE words of notify are accepted too: on means status")
                ->required());
        verb->add_option("KEY", options.key, "Service ID for policy and status, service name for push, or \"all\"")->required();
        verb->add_option("BUS_NAME", options.busName, "Bus name of the client service, such as org.example.Client")->required();
        verb->add_option("OBJECT_PATH", options.objectPath, "Path of its object, such as /org/example/Client")->required();
        verb->add_option("INTERFACE", options.interface, "Interface of the object, such as org.example.Client")->required();
    };
    const auto [add, added] = AddVerb(*subscribers, command, "add", "Add a subscription", AddSubscriber);
    addFields(add, *added);
    const auto [remove, removed] = AddVerb(*subscribers, command, "remove", "Remove a subscription", RemoveSubscriber);
    addFields(remove, *removed);
}

void AddServices(CLI::App& app, Command& command)
{
    const auto [verb, options] = AddVerb(
        app, command, "services", "Run the device daemon and the service manager, and print each event until Ctrl-C", RunServices);
    verb->add_option(
            "--serial", options->serial, "Serial number that the device daemon returns (default: that of the device in use)")
        ->check(IsUtf8);
}

void AddDoctor(CLI::App& app, Command& command)
{
    AddFields(AddVerb(app, command, "doctor", "Check bus, services, store, device and library, and suggest remedies", Examine,
                  DeviceUse::Leaves),
        command, {"check", "ok", "finding", "remedy"});
}

} // namespace

void Restrict(CLI::Option* option, const std::vector<std::string>& words, std::map<std::string, std::string> meanings)
{
    for (const std::string& word : words)
        meanings[word] = word;
    const auto check = [words, meanings](std::string& typed) -> std::string
    {
        const auto same = [](char one, char other)
        { return one == other || (one == '-' && other == '_') || (one == '_' && other == '-'); };
        std::vector<std::string> accepted;
        for (const auto& [word, meaning] : meanings)
        {
            accepted.push_back(word);
            if (std::equal(typed.begin(), typed.end(), word.begin(), word.end(), same))
            {
                typed = meaning;
                return "";
            }
        }
        return '"' + typed + "\" is invalid" + DidYouMean(typed, accepted) + "; expected one of " + Joined(words, ", ");
    };
    option->type_name(Joined(words, kOr))->transform(CLI::Validator(check, ""));
}

void AddVerbs(CLI::App& app, Command& command)
{
    for (const auto add :
        {AddCountry, AddDevice, AddSim, AddNetwork, AddNotify, AddPush, AddSubscribe, AddSubscribers, AddServices, AddDoctor})
        add(app, command);
}
