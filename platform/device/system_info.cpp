#include "system_info.h"

#include "Calls.h"

#include <glib.h>

using namespace kiv::platform;

namespace
{

constexpr struct
{
    const char* key;
    Text Device::*text;
} kKeys[] = {
    {"tizen.org/system/tizenid", &Device::tizenId},
    {"tizen.org/system/platform.name", &Device::platformName},
    {"tizen.org/feature/platform.version", &Device::platformVersion},
    {"tizen.org/system/model_name", &Device::modelName},
};

} // namespace

PLATFORM_API int system_info_get_platform_string(const char* key, char** value)
{
    return Answer(Call::system_info_get_platform_string, {},
        [&](State& state)
        {
            for (const auto& row : kKeys)
                if (g_strcmp0(key, row.key) == 0)
                    return GiveText(value, state.Current(row.text));
            return -EINVAL;
        });
}
