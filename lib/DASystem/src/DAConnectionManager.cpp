#include "DAConnectionManager.h"

#include "Handles.h"
#include "Singleton.h"

#include <net_connection.h>
#include <wifi.h>

DAConnectionManager* DAConnectionManager::__pInstance = nullptr;
IDAConnectionStateListener* DAConnectionManager::__pListener = nullptr;

namespace
{

/// Reads one state with a new connection handle; KIV_CONNECTION_STATE_UNKNOWN when it cannot be read.
template <class State>
int ReadState(int (*read)(connection_h, State*))
{
    connection_h created = nullptr;
    if (connection_create(&created) != 0 || created == nullptr)
        return KIV_CONNECTION_STATE_UNKNOWN;
    const kiv::Owned<void, connection_destroy> connection(created);

    State state{};
    return read(connection.get(), &state) == 0 ? static_cast<int>(state) : KIV_CONNECTION_STATE_UNKNOWN;
}

} // namespace

DAConnectionManager* DAConnectionManager::GetInstance()
{
    return kiv::Singleton(__pInstance, KIV_HERE, "ConnectionManager() failed.");
}

DAConnectionManager::DAConnectionManager() = default;
DAConnectionManager::~DAConnectionManager() = default;

void DAConnectionManager::SetConnectionEventListener(IDAConnectionStateListener* listener, void* userData)
{
    __pListener = listener; // first, so that it receives changes during the registration
    wifi_initialize();

    if (__pListener == nullptr)
    {
        wifi_unset_device_state_changed_cb();
        wifi_unset_connection_state_changed_cb();
        runtime_info_unset_changed_cb(RUNTIME_INFO_KEY_WIFI_STATUS);
        runtime_info_unset_changed_cb(RUNTIME_INFO_KEY_PACKET_DATA_ENABLED);
        runtime_info_unset_changed_cb(RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED);
        return;
    }
    wifi_set_device_state_changed_cb(wifi_device_state_changed, userData);
    wifi_set_connection_state_changed_cb(wifi_connection_state_changed, userData);
    runtime_info_set_changed_cb(RUNTIME_INFO_KEY_WIFI_STATUS, OnConnectionStateChanged, userData);
    runtime_info_set_changed_cb(RUNTIME_INFO_KEY_PACKET_DATA_ENABLED, OnConnectionStateChanged, userData);
    runtime_info_set_changed_cb(RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED, OnConnectionStateChanged, userData);
}

int DAConnectionManager::GetCellularNetworkState()
{
    return ReadState(connection_get_cellular_state);
}

int DAConnectionManager::GetWifiNetworkState()
{
    return ReadState(connection_get_wifi_state);
}

int DAConnectionManager::GetBTNetworkState()
{
    return ReadState(connection_get_bt_state);
}

bool DAConnectionManager::IsNetworkConnected(bool checkWifi, bool checkBT)
{
    bool isConnected = GetCellularNetworkState() == CONNECTION_CELLULAR_STATE_CONNECTED;
    if (checkWifi && GetWifiNetworkState() == CONNECTION_WIFI_STATE_CONNECTED)
        isConnected = true;
    if (checkBT && GetBTNetworkState() == CONNECTION_BT_STATE_CONNECTED)
        isConnected = true;
    return isConnected;
}

void DAConnectionManager::wifi_device_state_changed(wifi_device_state_e state, void* userData)
{
    if (IDAConnectionStateListener* const listener = __pListener)
        listener->OnWifiDeviceStateChanged(state, userData);
}

void DAConnectionManager::wifi_connection_state_changed(wifi_connection_state_e state, void* ap, void* userData)
{
    if (IDAConnectionStateListener* const listener = __pListener)
        listener->OnWifiConnectionStateChanged(state, ap, userData);
}

void DAConnectionManager::OnConnectionStateChanged(runtime_info_key_e key, void* userData)
{
    IDAConnectionStateListener* const listener = __pListener;
    if (listener == nullptr)
        return;

    bool isEnabled = false;
    int wifiStatus = 0;
    switch (key)
    {
    case RUNTIME_INFO_KEY_PACKET_DATA_ENABLED:
        if (runtime_info_get_value_bool(key, &isEnabled) == 0)
            listener->OnPacketDataChanged(isEnabled, userData);
        break;
    case RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED:
        if (runtime_info_get_value_bool(key, &isEnabled) == 0)
            listener->OnFlightModeChanged(isEnabled, userData);
        break;
    case RUNTIME_INFO_KEY_WIFI_STATUS:
        if (runtime_info_get_value_int(key, &wifiStatus) == 0)
            listener->OnWifiConnectedChanged(wifiStatus == RUNTIME_INFO_WIFI_STATUS_CONNECTED, userData);
        break;
    default:
        break;
    }
}
