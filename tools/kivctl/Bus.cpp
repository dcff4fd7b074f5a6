#include "Bus.h"

#include "Deadline.h"

#include <DADBusManager.h>
#include <ResultCode.h>

#include <utility>

BusState TryBus()
{
    constexpr double kPatience = 5; // seconds; a bus on the same machine answers within milliseconds
    constexpr auto kBusClient = static_cast<GDBusConnectionFlags>(
        G_DBUS_CONNECTION_FLAGS_AUTHENTICATION_CLIENT | G_DBUS_CONNECTION_FLAGS_MESSAGE_BUS_CONNECTION);
    g_autofree char* address = g_dbus_address_get_for_bus_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr); // never null for this bus
    g_autoptr(GError) error = nullptr;
    g_autoptr(GCancellable) attempt = g_cancellable_new();
    Deadline deadline(kPatience, [&attempt] { g_cancellable_cancel(attempt); });
    g_autoptr(GDBusConnection) connection = g_dbus_connection_new_for_address_sync(address, kBusClient, nullptr, attempt, &error);
    if (connection != nullptr)
        return {KIV_RESULT_SUCCESS, address, ""};
    if (deadline.WasMissed())
        return {KIV_RESULT_BUS_TIMED_OUT, address, "no answer in time"};
    return {KIV_RESULT_NO_BUS, address, error->message};
}

BusConnection RequireBus()
{
    const BusState bus = TryBus();
    RequireSuccess(bus.code, {"address \"" + bus.address + "\": " + bus.trouble});
    int code = KIV_RESULT_SUCCESS;
    BusConnection connection(DADBusManager::GetInstance()->InitDbusConnection(&code));
    RequireSuccess(code, {});
    return connection;
}

std::string ReasonOf(const std::string& logged)
{
    static constexpr std::pair<const char*, const char*> kReasons[] = {
        {"GDBus.Error:org.freedesktop.DBus.Error.ServiceUnknown: ", kNoOwner},
        {"GDBus.Error:org.freedesktop.DBus.Error.NameHasNoOwner: ", kNoOwner},
        {"GDBus.Error:org.freedesktop.DBus.Error.AccessDenied: ", "this user is not allowed to call it"},
        {"GDBus.Error:org.freedesktop.DBus.Error.NoReply: ", "it left the bus without an answer"},
        {" without an owner, ", "no program owns the name"},
        {"Timeout was reached", "no answer in time"},
    };
    const std::string mark = "GDBus.Error:"; // an error that the bus or the service sent follows
    const size_t sent = logged.find(mark);
    for (const auto& [text, reason] : kReasons)
    {
        const size_t at = logged.find(text);
        if (at != logged.npos && (sent == logged.npos || at == sent))
            return reason;
    }
    if (sent == logged.npos)
        return logged;
    const bool isInBrackets = sent > 0 && logged[sent - 1] != ' ';
    const size_t begin = sent + mark.size();
    return "it answered with the error " + logged.substr(begin, logged.size() - begin - (isInBrackets ? 1 : 0));
}
