#include "system_settings.h"

#include "Calls.h"

using namespace kiv::platform;

PLATFORM_API int system_settings_get_value_int(system_settings_key_e key, int* value)
{
    return Answer(Call::system_settings_get_value_int, {},
        [&](State& state)
        {
            if (key != SYSTEM_SETTINGS_KEY_FONT_SIZE)
                return -EINVAL;
            return state.device.fontSize ? Give(value, *state.device.fontSize) : -ENODATA;
        });
}

PLATFORM_API int system_settings_get_value_bool(system_settings_key_e key, bool* value)
{
    return Answer(Call::system_settings_get_value_bool, {},
        [&](State& state)
        { return key == SYSTEM_SETTINGS_KEY_3G_DATA_NETWORK_ENABLED ? Give(value, state.device.mobileData) : -EINVAL; });
}

PLATFORM_API int system_settings_get_value_string(system_settings_key_e key, char** value)
{
    return Answer(Call::system_settings_get_value_string, {},
        [&](State& state)
        {
            switch (key)
            {
            case SYSTEM_SETTINGS_KEY_LOCALE_LANGUAGE:
                return GiveText(value, state.Current(&Device::language));
            case SYSTEM_SETTINGS_KEY_DEVICE_NAME:
                return GiveText(value, state.Current(&Device::deviceName));
            default:
                return -EINVAL;
            }
        });
}
