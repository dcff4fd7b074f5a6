#include "Bus.h"

#include "Deadline.h"

#include <DADBusManager.h>
#include <ResultCode.h>

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
    RequireSuccess(bus.code, {bus.address + ": " + bus.trouble});
    int code = KIV_RESULT_SUCCESS;
    BusConnection connection(DADBusManager::GetInstance()->InitDbusConnection(&code));
    RequireSuccess(code, {});
    return connection;
}
