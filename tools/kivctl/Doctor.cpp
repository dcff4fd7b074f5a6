#include "Bus.h"
#include "Progress.h"
#include "StaleRecord.h"
#include "Verbs.h"

#include <BoardDaemon.h>
#include <DADBusManager.h>
#include <DASubscriberStore.h>
#include <DASystem.h>
#include <DeviceControl.h>
#include <ResultCode.h>
#include <ServiceManager.h>
#include <SubscriptionService.h>
#include <telephony.h>

#include <dlfcn.h>

#include <cstdlib>
#include <set>

namespace
{

/// The result of a check, and what to do about it; no remedy when the check succeeds.
struct Finding
{
    std::string text;
    std::string remedy = {};
};
using Findings = std::vector<Finding>;

constexpr int kPatienceMs = 3000; ///< how long a service may take to answer

const BusState& Bus()
{
    static const BusState state = TryBus();
    return state;
}

Finding CheckBus(const Command&)
{
    if (Bus().code == KIV_RESULT_SUCCESS)
        return {Bus().address};
    const bool isStuck = Bus().code == KIV_RESULT_BUS_TIMED_OUT;
    return {Bus().address + ": " + MeaningOf(Bus().code) + ": " + Bus().trouble,
        isStuck ? "restart the bus, or set DBUS_SYSTEM_BUS_ADDRESS to the address of another one"
                : "start dbus-daemon, and set DBUS_SYSTEM_BUS_ADDRESS to its address"};
}

/// A new reference to the shared connection; null when the bus does not answer.
GDBusConnection* Connection()
{
    int code = 0;
    return Bus().code == KIV_RESULT_SUCCESS ? DADBusManager::GetInstance()->InitDbusConnection(&code) : nullptr;
}

/// Calls a method of the bus itself. @return the reply; null on an error
GVariant* AskBus(GDBusConnection* connection, const char* method, GVariant* arguments, GError** error = nullptr)
{
    return g_dbus_connection_call_sync(connection, "org.freedesktop.DBus", "/org/freedesktop/DBus", "org.freedesktop.DBus", method,
        arguments, nullptr, G_DBUS_CALL_FLAGS_NONE, kPatienceMs, nullptr, error);
}

/// Whether the bus lets this user own a name that has no owner. The only way to find out is to own it for a moment.
bool MayOwn(GDBusConnection* connection, const char* busName)
{
    constexpr guint kDoNotQueue = 4;
    g_autoptr(GError) error = nullptr;
    g_autoptr(GVariant) taken = AskBus(connection, "RequestName", g_variant_new("(su)", busName, kDoNotQueue), &error);
    if (taken != nullptr)
    {
        g_autoptr(GVariant) released = AskBus(connection, "ReleaseName", g_variant_new("(s)", busName));
        static_cast<void>(released);
    }
    return !g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_ACCESS_DENIED);
}

/// A service of the device, and a call of it that changes nothing.
struct Service
{
    const char* busName;
    const char* path;
    const char* interface;
    const char* method;
    bool isMadeByAgents; ///< the call
    std::string program;
};

Finding CheckService(const Service& service)
{
    g_autoptr(GDBusConnection) connection = Connection();
    if (!connection)
        return {"not checked without a bus", "start the bus first"};
    const std::string name = service.busName;
    g_autoptr(GError) error = nullptr;
    g_autoptr(GVariant) reply = g_dbus_connection_call_sync(connection, service.busName, service.path, service.interface,
        service.method, nullptr, nullptr, G_DBUS_CALL_FLAGS_NONE, kPatienceMs, nullptr, &error);
    if (reply)
        return {name + " answers"};
    g_autoptr(GVariant) owner = AskBus(connection, "GetNameOwner", g_variant_new("(s)", service.busName));
    if (!owner && !MayOwn(connection, service.busName))
        return {name + " is not on the bus, and the bus forbids this user to own it",
            "start " + service.program + " as the user who may own it, or allow this user to own it in a bus policy"};
    if (!owner)
        return {name + " is not on the bus", "start it: " + service.program + ", or kivctl services for both"};
    const bool isForbidden = g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_ACCESS_DENIED) != FALSE;
    if (isForbidden && service.isMadeByAgents)
        return {name + " is on the bus, but the bus forbids this user to call it",
            "allow the calls of an agent in a bus policy, as the example kiv-agent.conf does"};
    if (isForbidden)
        return {name + " is on the bus, which forbids this user to ask whether it answers"};
    g_dbus_error_strip_remote_error(error);
    return {name + " does not answer: " + error->message, "check its process, and restart it"};
}

Finding CheckDeviceDaemon(const Command&)
{
    return CheckService({kiv::BoardDaemon::kBusName, "/Org/Tizen/System/DeviceD/Board", "org.tizen.system.deviced.Board",
        "GetSerial", true, "kiv-board-daemon"});
}

Finding CheckServiceManager(const Command&)
{
    return CheckService({kiv::ServiceManager::kBusName, "/", "org.freedesktop.DBus.Peer", "Ping", false, "kiv-service-manager"});
}

/// Adds the names that a method of the bus lists. @return whether the bus allows the call
bool AddNames(GDBusConnection* connection, const char* method, std::set<std::string>& names)
{
    g_autoptr(GVariant) reply = AskBus(connection, method, nullptr);
    if (!reply)
        return false;
    g_autofree const char** list = nullptr;
    g_variant_get(reply, "(^a&s)", &list);
    for (const char** name = list; *name != nullptr; ++name)
        names.insert(*name);
    return true;
}

/// Checks the subscription service without starting it. `kivctl subscribe` does not depend on it.
Finding CheckSubscriptionService(const Command&)
{
    g_autoptr(GDBusConnection) connection = Connection();
    if (!connection)
        return {"not checked without a bus", "start the bus first"};
    const std::string name = kiv::SubscriptionService::kBusName;
    std::set<std::string> running, startable;
    if (!AddNames(connection, "ListNames", running) || !AddNames(connection, "ListActivatableNames", startable))
        return {"not known: the bus forbids this user to list its names"};
    if (running.count(name) != 0)
        return {name + " runs"};
    if (startable.count(name) != 0)
        return {name + " can be started by the bus"};
    return {name + " is not available; kivctl subscribe uses the file"};
}

/// Checks a daemon that provides values of the machine itself, without starting it.
Finding CheckHostDaemon(const char* name, const std::string& unit, const char* interface, const char* path)
{
    g_autoptr(GDBusConnection) connection = Connection();
    if (!connection)
        return {"not checked without a bus", "start the bus first"};
    g_autoptr(GError) error = nullptr;
    g_autoptr(GVariant) reply = g_dbus_connection_call_sync(connection, interface, path, "org.freedesktop.DBus.Properties", "Get",
        g_variant_new("(ss)", interface, "Version"), G_VARIANT_TYPE("(v)"), G_DBUS_CALL_FLAGS_NO_AUTO_START, kPatienceMs, nullptr,
        &error);
    if (reply)
    {
        g_autoptr(GVariant) version = nullptr;
        g_variant_get(reply, "(v)", &version);
        const bool isText = g_variant_is_of_type(version, G_VARIANT_TYPE_STRING);
        return {std::string("version ") + (isText ? g_variant_get_string(version, nullptr) : "unknown") + ", answers this user"};
    }
    if (g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_ACCESS_DENIED))
        return {"not permitted", std::string("allow this user to call ") + name + " in a bus policy"};
    if (g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_SERVICE_UNKNOWN) ||
        g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_NAME_HAS_NO_OWNER))
        return {"does not run", "install and start it: systemctl start " + unit};
    g_dbus_error_strip_remote_error(error);
    return {std::string("does not answer: ") + error->message, "restart it: systemctl restart " + unit};
}

Finding CheckModemManager(const Command&)
{
    return CheckHostDaemon("ModemManager", "ModemManager", "org.freedesktop.ModemManager1", "/org/freedesktop/ModemManager1");
}

Finding CheckNetworkManager(const Command&)
{
    return CheckHostDaemon("NetworkManager", "NetworkManager", "org.freedesktop.NetworkManager", "/org/freedesktop/NetworkManager");
}

Finding CheckStore(const Command&)
{
    std::vector<DASubscription> subscriptions;
    std::string reason;
    DASubscriberStore store;
    if (store.List(subscriptions, reason) == DASubscriberStore::Outcome::Done &&
        store.Check(reason) == DASubscriberStore::Outcome::Done)
        return {DASubscriberStore::Path() + ", subscriptions: " + std::to_string(subscriptions.size())};
    const std::size_t end = reason.rfind("; "); // what to do follows, as the store knows the cause
    return {reason.substr(0, end), reason.substr(end + 2)};
}

/// One finding for each record without a reachable service. None without a bus or a store, because other checks report these.
Findings CheckSubscribers(const Command&)
{
    std::vector<DASubscription> subscriptions;
    std::string reason;
    g_autoptr(GDBusConnection) connection = Connection();
    if (!connection || DASubscriberStore().List(subscriptions, reason) != DASubscriberStore::Outcome::Done)
        return {};
    std::set<std::string> names;
    if (!AddNames(connection, "ListNames", names) || !AddNames(connection, "ListActivatableNames", names))
        return {{"not known: the bus forbids this user to list its names"}};
    Findings findings;
    for (const DASubscription& subscription : subscriptions)
    {
        const std::string& name = subscription.subscriber.busname;
        if (names.count(name) == 0)
            findings.push_back(
                {subscription.kind + " " + subscription.key + ": no program owns " + name + ", and the bus cannot start one",
                    "start the service, or remove its record: " + RemovalOf(subscription)});
    }
    if (findings.empty())
        findings.push_back({subscriptions.empty() ? "none" : "each one is on the bus, or the bus can start it"});
    return findings;
}

Finding CheckDevice(const Command& command)
{
    const std::string trouble = UseDevice(command);
    if (!trouble.empty())
        return {trouble, "choose another with --profile or KIV_PROFILE; kivctl device keys lists the keys of a file"};
    const std::string device = DeviceAskedFor(command);
    return {(IsProfileName(device) ? "profile " : "file ") + (device.empty() ? "dual" : device) + ", " +
            kiv::platform::GetDevice().description};
}

/// Checks the shared library that contains a function. Its version is part of its file name.
template <typename Function>
Finding CheckLibrary(Function* function)
{
    Dl_info info{};
    if (dladdr(reinterpret_cast<void*>(function), &info) == 0 || !info.dli_fname)
        return {"the file of the library cannot be determined", "run kivctl from an installation"};
    char* const real = realpath(info.dli_fname, nullptr);
    const LibraryText owner(real);
    const std::string path = real ? real : info.dli_fname;
    const size_t end = path.rfind(".so.");
    const std::string version = end == path.npos ? "unknown" : path.substr(end + 4);
    if (version == KIV_VERSION)
        return {path + ", version " + version};
    return {path + " has version " + version + ", but kivctl has " KIV_VERSION,
        "check LD_LIBRARY_PATH, or install the same version of both"};
}

Finding CheckSystemLibrary(const Command&)
{
    return CheckLibrary(&DASystem::GetInstance);
}

Finding CheckPlatformLibrary(const Command&)
{
    return CheckLibrary(&telephony_init);
}

template <Finding (*check)(const Command&)>
Findings One(const Command& command)
{
    return {check(command)};
}

struct Examination
{
    const char* name;
    Findings (*check)(const Command&);
    bool isForHost = false; ///< done only when the device is the machine itself
};

constexpr Examination kChecks[] = {
    {"bus", One<CheckBus>},
    {"device daemon", One<CheckDeviceDaemon>},
    {"service manager", One<CheckServiceManager>},
    {"subscription service", One<CheckSubscriptionService>},
    {"subscriber store", One<CheckStore>},
    {"subscribers", CheckSubscribers},
    {"device", One<CheckDevice>},
    {"ModemManager", One<CheckModemManager>, true},
    {"NetworkManager", One<CheckNetworkManager>, true},
    {"library", One<CheckSystemLibrary>},
    {"platform", One<CheckPlatformLibrary>},
};

} // namespace

Exit Examine(const Command& command)
{
    std::vector<Record> rows;
    Exit exit = Exit::Done;
    const Progress progress;
    const bool isHost = IsHost(DeviceAskedFor(command));
    for (const Examination& examination : kChecks)
    {
        if (examination.isForHost && !isHost)
            continue;
        progress.Show(std::string("checking the ") + examination.name);
        for (const Finding& finding : examination.check(command))
        {
            const bool isWell = finding.remedy.empty();
            if (!isWell)
                exit = Exit::No;
            rows.push_back({{"check", examination.name}, {"ok", isWell, "", isWell ? Tone::Good : Tone::Bad},
                {"finding", finding.text}, isWell ? Missing("remedy", "") : Field{"remedy", finding.remedy}});
        }
    }
    progress.Show("");
    PrintTable(rows, command.form);
    return exit;
}
