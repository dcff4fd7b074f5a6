#include "LibraryLog.h"
#include "Progress.h"
#include "Verbs.h"

#include <BoardDaemon.h>
#include <DADBusManager.h>
#include <DASubscriberStore.h>
#include <DASystem.h>
#include <DeviceControl.h>
#include <ServiceManager.h>
#include <telephony.h>

#include <dlfcn.h>

#include <cstdlib>

namespace
{

/// What one look found, and what to do about it; nothing is to be done when all is well.
struct Finding
{
    std::string text;
    std::string remedy = {};
};

constexpr int kPatienceMs = 3000; ///< with a service that runs, but may be stuck

Finding LookAtBus(const Command&)
{
    const LibraryLog log;
    int code = 0;
    g_autoptr(GDBusConnection) connection = DADBusManager::GetInstance()->InitDbusConnection(&code);
    g_autofree char* address = g_dbus_address_get_for_bus_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr);
    const std::string where = address ? address : "no address";
    if (connection)
        return {where};
    return {where + ": " + MeaningOf(code), "start dbus-daemon, and have DBUS_SYSTEM_BUS_ADDRESS tell where it listens"};
}

Finding LookAtService(const char* busName, const std::string& program)
{
    g_autoptr(GDBusConnection) connection = g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr);
    if (!connection)
        return {"not asked without a bus", "mend the bus first"};
    g_autoptr(GError) error = nullptr;
    g_autoptr(GVariant) reply = g_dbus_connection_call_sync(connection, busName, "/", "org.freedesktop.DBus.Peer", "Ping", nullptr,
        nullptr, G_DBUS_CALL_FLAGS_NONE, kPatienceMs, nullptr, &error);
    if (reply)
        return {std::string(busName) + " answers"};
    if (g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_SERVICE_UNKNOWN) ||
        g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_NAME_HAS_NO_OWNER))
        return {std::string(busName) + " is not on the bus", "start it: " + program + ", or kivctl services for both"};
    g_dbus_error_strip_remote_error(error);
    return {std::string(busName) + " does not answer: " + error->message, "look at its process, and start it again"};
}

Finding LookAtDeviceDaemon(const Command&)
{
    return LookAtService(kiv::BoardDaemon::kBusName, "kiv-board-daemon");
}

Finding LookAtServiceManager(const Command&)
{
    return LookAtService(kiv::ServiceManager::kBusName, "kiv-service-manager");
}

/// A daemon that the machine itself is known from. Asking does not start it.
Finding LookAtHostDaemon(const char* name, const std::string& unit, const char* interface, const char* path)
{
    g_autoptr(GDBusConnection) connection = g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr);
    if (!connection)
        return {"not asked without a bus", "mend the bus first"};
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
        return {"not permitted", std::string("have the bus policy of ") + name + " let this user ask it"};
    if (g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_SERVICE_UNKNOWN) ||
        g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_NAME_HAS_NO_OWNER))
        return {"does not run", "install and start it: systemctl start " + unit};
    g_dbus_error_strip_remote_error(error);
    return {std::string("does not answer: ") + error->message, "start it again: systemctl restart " + unit};
}

Finding LookAtModemManager(const Command&)
{
    return LookAtHostDaemon("ModemManager", "ModemManager", "org.freedesktop.ModemManager1", "/org/freedesktop/ModemManager1");
}

Finding LookAtNetworkManager(const Command&)
{
    return LookAtHostDaemon(
        "NetworkManager", "NetworkManager", "org.freedesktop.NetworkManager", "/org/freedesktop/NetworkManager");
}

Finding LookAtStore(const Command&)
{
    std::vector<DASubscription> subscriptions;
    std::string reason;
    if (DASubscriberStore().List(subscriptions, reason) == DASubscriberStore::Outcome::Done)
        return {DASubscriberStore::Path() + ", subscriptions: " + std::to_string(subscriptions.size())};
    const std::size_t end = reason.rfind("; "); // what to do follows, as the store knows the cause
    return {reason.substr(0, end), reason.substr(end + 2)};
}

Finding LookAtDevice(const Command& command)
{
    const std::string trouble = UseDevice(command);
    if (!trouble.empty())
        return {trouble, "name another with --profile or KIV_PROFILE; kivctl device keys lists what a file may hold"};
    const std::string device = DeviceAskedFor(command);
    return {(IsProfileName(device) ? "profile " : "file ") + (device.empty() ? "dual" : device) + ", " +
            kiv::platform::GetDevice().description};
}

/// The shared library that holds a function, its version in its real name.
template <typename Function>
Finding LookAtLibrary(Function* function)
{
    Dl_info info{};
    if (dladdr(reinterpret_cast<void*>(function), &info) == 0 || !info.dli_fname)
        return {"not to be found in memory", "run kivctl from an installation"};
    char* const real = realpath(info.dli_fname, nullptr);
    const LibraryText owner(real);
    const std::string path = real ? real : info.dli_fname;
    const size_t end = path.rfind(".so.");
    const std::string version = end == path.npos ? "unknown" : path.substr(end + 4);
    if (version == KIV_VERSION)
        return {path + ", version " + version};
    return {
        path + " is of version " + version + ", kivctl of " KIV_VERSION, "look at LD_LIBRARY_PATH, or install the two together"};
}

Finding LookAtSystemLibrary(const Command&)
{
    return LookAtLibrary(&DASystem::GetInstance);
}

Finding LookAtPlatformLibrary(const Command&)
{
    return LookAtLibrary(&telephony_init);
}

struct Check
{
    const char* name;
    Finding (*look)(const Command&);
    bool isForHost = false; ///< looked at only when the device is the machine itself
};

constexpr Check kChecks[] = {
    {"bus", LookAtBus},
    {"device daemon", LookAtDeviceDaemon},
    {"service manager", LookAtServiceManager},
    {"subscriber store", LookAtStore},
    {"device", LookAtDevice},
    {"ModemManager", LookAtModemManager, true},
    {"NetworkManager", LookAtNetworkManager, true},
    {"library", LookAtSystemLibrary},
    {"platform", LookAtPlatformLibrary},
};

} // namespace

Exit Examine(const Command& command)
{
    std::vector<Record> rows;
    Exit exit = Exit::Done;
    const Progress progress;
    const bool isHost = IsHost(DeviceAskedFor(command));
    for (const Check& check : kChecks)
    {
        if (check.isForHost && !isHost)
            continue;
        progress.Show(std::string("looking at the ") + check.name);
        const Finding finding = check.look(command);
        const bool isWell = finding.remedy.empty();
        if (!isWell)
            exit = Exit::No;
        rows.push_back({{"check", check.name}, {"ok", isWell, "", isWell ? Tone::Good : Tone::Bad}, {"finding", finding.text},
            isWell ? Missing("remedy", "") : Field{"remedy", finding.remedy}});
    }
    progress.Show("");
    PrintTable(rows, command.form);
    return exit;
}
