#include "runtime_info.h"

#include "Calls.h"

using namespace kiv::platform;

namespace
{

std::optional<Topic> TopicOf(runtime_info_key_e key)
{
    switch (key)
    {
    case RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED:
        return Topic::FlightMode;
    case RUNTIME_INFO_KEY_WIFI_STATUS:
        return Topic::WifiStatus;
    case RUNTIME_INFO_KEY_PACKET_DATA_ENABLED:
        return Topic::PacketData;
    case RUNTIME_INFO_KEY_DATA_ROAMING_ENABLED:
        return Topic::DataRoaming;
    default:
        return std::nullopt;
    }
}

} // namespace

PLATFORM_API int runtime_info_get_value_int(runtime_info_key_e key, int* value)
{
    return Answer(Call::runtime_info_get_value_int, {},
        [&](State& state) { return key == RUNTIME_INFO_KEY_WIFI_STATUS ? Give(value, state.device.wifiStatus) : -EINVAL; });
}

PLATFORM_API int runtime_info_get_value_bool(runtime_info_key_e key, bool* value)
{
    return Answer(Call::runtime_info_get_value_bool, {},
        [&](State& state)
        {
            switch (key)
            {
            case RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED:
                return Give(value, state.device.flightMode);
            case RUNTIME_INFO_KEY_PACKET_DATA_ENABLED:
                return Give(value, state.device.packetData);
            case RUNTIME_INFO_KEY_DATA_ROAMING_ENABLED:
                return Give(value, state.device.dataRoaming);
            default:
                return -EINVAL;
            }
        });
}

PLATFORM_API int runtime_info_set_changed_cb(runtime_info_key_e key, runtime_info_changed_cb callback, void* user_data)
{
    return Register(Call::runtime_info_set_changed_cb, TopicOf(key), callback != nullptr,
        [key, callback, user_data](int /*value*/) { callback(key, user_data); });
}

PLATFORM_API int runtime_info_unset_changed_cb(runtime_info_key_e key)
{
    return Unregister(Call::runtime_info_unset_changed_cb, TopicOf(key));
}
