#include "wifi.h"

#include "Calls.h"

using namespace kiv::platform;

PLATFORM_API int wifi_initialize(void)
{
    return Answer(Call::wifi_initialize, {},
        [](State& state)
        {
            state.wifiInitialized = true;
            return 0;
        });
}

PLATFORM_API int wifi_set_device_state_changed_cb(wifi_device_state_changed_cb callback, void* user_data)
{
    return Register(Call::wifi_set_device_state_changed_cb, Topic::WifiDevice, callback != nullptr,
        [=](int value) { callback(static_cast<wifi_device_state_e>(value), user_data); });
}

PLATFORM_API int wifi_unset_device_state_changed_cb(void)
{
    return Unregister(Call::wifi_unset_device_state_changed_cb, Topic::WifiDevice);
}

PLATFORM_API int wifi_set_connection_state_changed_cb(wifi_connection_state_changed_cb callback, void* user_data)
{
    return Register(Call::wifi_set_connection_state_changed_cb, Topic::WifiConnection, callback != nullptr,
        [=](int value) { callback(static_cast<wifi_connection_state_e>(value), nullptr, user_data); });
}

PLATFORM_API int wifi_unset_connection_state_changed_cb(void)
{
    return Unregister(Call::wifi_unset_connection_state_changed_cb, Topic::WifiConnection);
}
