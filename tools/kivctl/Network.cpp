#include "Verbs.h"

#include <DASystem.h>
#include <DeviceControl.h>
#include <net_connection.h>

namespace
{

using kiv::platform::ReasonFor;

template <std::size_t N>
Field StateField(const char* name, const Word (&words)[N], int state)
{
    if (state == KIV_CONNECTION_STATE_UNKNOWN)
        return {name, std::string("unknown"), "the device does not answer"};
    return {name, WordFor(words, state), ReasonFor(std::string("network.") + name)};
}

} // namespace

Exit ShowNetwork(const NetworkOptions& options, const Command& command)
{
    static constexpr Word kCellular[] = {{CONNECTION_CELLULAR_STATE_OUT_OF_SERVICE, "out of service"},
        {CONNECTION_CELLULAR_STATE_FLIGHT_MODE, "flight mode"}, {CONNECTION_CELLULAR_STATE_ROAMING, "roaming"},
        {CONNECTION_CELLULAR_STATE_CALL_ONLY_AVAILABLE, "calls only"}, {CONNECTION_CELLULAR_STATE_AVAILABLE, "available"},
        {CONNECTION_CELLULAR_STATE_CONNECTED, "connected"}};
    static constexpr Word kWifi[] = {{CONNECTION_WIFI_STATE_DEACTIVATED, "off"},
        {CONNECTION_WIFI_STATE_DISCONNECTED, "disconnected"}, {CONNECTION_WIFI_STATE_CONNECTED, "connected"}};
    static constexpr Word kBluetooth[] = {{CONNECTION_BT_STATE_DEACTIVATED, "off"},
        {CONNECTION_BT_STATE_DISCONNECTED, "disconnected"}, {CONNECTION_BT_STATE_CONNECTED, "connected"}};

    DASystem* const system = DASystem::GetInstance();
    const bool isConnected = system->IsNetworkConnected(options.countsWifi, options.countsBluetooth);
    Print({StateField("cellular", kCellular, system->GetCellularNetworkState()),
              StateField("wifi", kWifi, system->GetWifiNetworkState()),
              StateField("bluetooth", kBluetooth, system->GetBTNetworkState()), {"connected", isConnected, ReasonFor("network")}},
        command.form);
    return isConnected ? Exit::Done : Exit::No;
}
