#include "CommandLine.h"

#include "Verbs.h"

#include <CLI/CLI.hpp>

#include <utility>

namespace
{

constexpr char kAbout[] = R"(An agent in miniature: asks the device what an agent asks, tells what an agent has to tell, plays a
client service, and changes the simulated device.)";

constexpr char kFooter[] = R"(Exit codes:
   0  done; the answer is yes
   1  no, not found, not delivered, no reply
   2  wrong usage
   3  time is up
   4  the library refuses an argument
   5  the service can not be addressed
   6  the subscriber store can not be used
   8  the system bus can not be reached
   9  reaching the system bus timed out
  10  the device file is wrong

Environment:
  DBUS_SYSTEM_BUS_ADDRESS  the system bus to use
  KIV_SUBSCRIBERS          file of the subscriber store
  KIV_PROFILE              profile or file of the simulated device (--profile)
  KIV_LOG                  "error" or "info" shows the platform log on standard error)";

/// A check of an option's text. @return what is wrong with it, empty when nothing is
std::string IsZeroOrMore(const std::string& text)
{
    double number = -1;
    const bool isRight = CLI::detail::lexical_cast(text, number) && number >= 0;
    return isRight ? "" : '"' + text + "\" is wrong; a number from 0 up would be right";
}

/// Adds a verb that runs with options of its own, which live as long as the command.
/// @return its command line, and the options to bind it to
template <typename Options>
std::pair<CLI::App*, std::shared_ptr<Options>> AddVerb(CLI::App& app, Command& command, const char* name, const char* help,
    Exit (*run)(const Options&, const Command&), DeviceUse deviceUse = DeviceUse::Asks)
{
    const auto options = std::make_shared<Options>();
    CLI::App* verb = app.add_subcommand(name, help);
    verb->callback(
        [=, &command]
        {
            if (!verb->get_subcommands().empty())
                return;
            command.deviceUse = deviceUse;
            command.verb = [options, run, &command] { return run(*options, command); };
        });
    return {verb, options};
}

/// The same for a verb without options.
void AddVerb(CLI::App& app, Command& command, const char* name, const char* help, Exit (*run)(const Command&),
    DeviceUse deviceUse = DeviceUse::Asks)
{
    app.add_subcommand(name, help)
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
    verb->add_option("--by", options->kind, "What KEY is; guessed without")->check(CLI::IsMember(CountryKeyKinds()));
}

void AddDevice(CLI::App& app, Command& command)
{
    const auto [device, options] = AddVerb(app, command, "device", "Everything that the device tells of itself", ShowDevice);
    AddShowIds(device, command, "Show serial number, IMEI and platform device ID whole");
    device->add_option("--package", options->package, "Tell of this package too")->type_name("ID");
    device->add_option("--storage", options->storageMiB, "Ask whether more than this is free in the internal storage")
        ->type_name("MIB")
        ->capture_default_str();
    AddVerb(*device, command, "id", "The device unique ID, asked of the device daemon on the bus", ShowDeviceId);

    const auto [set, assignments] =
        AddVerb(*device, command, "set", "Change values in the device file (--profile FILE); whoever follows the file hears of it",
            SetInDeviceFile, DeviceUse::Leaves);
    set->add_option("GROUP.KEY=VALUE", *assignments, "What to change, all of it or nothing (keys: kivctl device keys)")->required();
    AddVerb(*device, command, "keys", "What a device file may hold", ShowDeviceKeys, DeviceUse::Leaves);
    AddVerb(app, command, "profiles", "The devices that --profile knows by name", ShowProfiles, DeviceUse::Leaves);
}

void AddSim(CLI::App& app, Command& command)
{
    const auto addSlot = [](CLI::App* verb, SimOptions& options)
    { verb->add_option("--slot", options.slot, "Only this slot, counted from 0")->check(IsZeroOrMore); };

    const auto [sim, options] = AddVerb(app, command, "sim", "The SIMs of the device, one row a slot", ShowSims);
    addSlot(sim, *options);
    AddShowIds(sim, command, "Show IMSIs and subscriber numbers whole");

    const auto [wait, waitOptions] = AddVerb(*sim, command, "wait", "Wait until a SIM is usable, asking once a second", WaitForSim);
    addSlot(wait, *waitOptions);
    wait->add_option("--timeout", waitOptions->timeout, "Seconds to wait at most; without it as long as a card may become usable")
        ->check(IsZeroOrMore);
}

void AddNetwork(CLI::App& app, Command& command)
{
    const auto [verb, options] = AddVerb(
        app, command, "network", "The states of the network connections; exit code 0 when connected, 1 when not", ShowNetwork);
    verb->add_flag("--wifi", options->countsWifi, "Count Wi-Fi beside the cellular network");
    verb->add_flag("--bt", options->countsBluetooth, "Count Bluetooth beside the cellular network");
    AddVerb(app, command, "watch", "Print each change of the network situation as it comes, until Ctrl-C", Watch);
}

void AddNotify(CLI::App& app, Command& command)
{
    const auto [verb, options] =
        AddVerb(app, command, "notify", "Tell subscribed client services, or the service manager, of an event", Notify);
    verb->add_option("TYPE", options->types, "What happened; \"on\" and \"off\" may come several at once, each with its --service")
        ->required()
        ->check(CLI::IsMember(NotificationTypes()));
    verb->add_option("--to", options->to, "Whom to tell")->check(CLI::IsMember({"subscribers", "manager"}))->capture_default_str();
    verb->add_option("--imsi", options->imsi, "Subscriber identity concerned; that of the first SIM that answers without it");
    verb->add_option("--service", options->services, "Service id of on, off and policy");
    verb->add_option("--texts", options->texts, "policy: status, feature, version, document URL; number-changed: any four")
        ->expected(4);
}

void AddPush(CLI::App& app, Command& command)
{
    const auto [verb, options] =
        AddVerb(app, command, "push", "Deliver a push message to the client services that subscribed to a service's pushes", Push);
    verb->add_option("SERVICE", options->service, "Service whose message it is")->required();
    verb->add_option("--data", options->data, "Data for the client service")->required();
    verb->add_option("--message", options->message, "Message for the user")->required();
    verb->add_option("--time", options->time, "When it was sent, a 64-bit number; now, in seconds since 1970, without it");
}

void AddSubscribe(CLI::App& app, Command& command)
{
    const auto [verb, options] = AddVerb(app, command, "subscribe",
        "Be a client service: subscribe, print each call as it arrives, unsubscribe at the end (Ctrl-C)", Subscribe);
    verb->add_option("--kind", options->kinds, "Event to hear of; may come several times")
        ->check(CLI::IsMember(SubscriptionKinds()));
    verb->add_option("--key", options->key, "Service of policy and status (a number) and of push (a name)");
    verb->add_option("--push", options->pushes, "The same as --kind push --key SERVICE")->type_name("SERVICE");
    verb->add_option("--name", options->name, "Well-known bus name to own; the connection's unique name without it");
}

void AddSubscribers(CLI::App& app, Command& command)
{
    CLI::App* subscribers = app.add_subcommand("subscribers", "Who is told of which event")->require_subcommand(1);
    AddVerb(*subscribers, command, "list", "All subscriptions, in the order in which they were made", ListSubscribers);

    const auto addFields = [](CLI::App* verb, SubscriptionOptions& options)
    {
        verb->add_option("KIND", options.kind, "policy, status, auth, activated, number_changed or push")->required();
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
    const auto [verb, options] = AddVerb(app, command, "services",
        "Be the device's bus services, device daemon and service manager; print each call that arrives, until Ctrl-C", RunServices);
    verb->add_option("--serial", options->serial, "Serial number that the device daemon tells; the device's own without it");
}

void AddGlobalOptions(CLI::App& app, Command& command)
{
    app.add_flag_callback(
        "--json", [&command] { command.form = Form::Json; }, "Print data as JSON; what arrives over time as one object a line");
    app.add_option("--profile", command.profile, "The device to ask: a profile's name (kivctl profiles) or a file")
        ->type_name("NAME|FILE");
}

} // namespace

Exit ReadCommandLine(int argc, char** argv, Command& command)
{
    CLI::App app(kAbout, "kivctl");
    app.footer(kFooter);
    app.fallthrough();
    app.require_subcommand(1);
    AddGlobalOptions(app, command);
    for (const auto add :
        {AddCountry, AddDevice, AddSim, AddNetwork, AddNotify, AddPush, AddSubscribe, AddSubscribers, AddServices})
        add(app, command);
    try
    {
        app.parse(argc, argv);
    }
    catch (const CLI::RequiredError& error)
    {
        const std::vector<std::string> unknown = app.remaining();
        if (unknown.empty())
            return app.exit(error) == 0 ? Exit::Done : Exit::Usage;
        throw Failure(Exit::Usage, '"' + unknown.front() + "\" is no verb; --help lists them");
    }
    catch (const CLI::ParseError& error)
    {
        return app.exit(error) == 0 ? Exit::Done : Exit::Usage;
    }
    return Exit::Done;
}
