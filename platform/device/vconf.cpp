#include "vconf.h"

#include "Calls.h"

#include <glib.h>

using namespace kiv::platform;

PLATFORM_API char* vconf_get_str(const char* in_key)
{
    char* value = nullptr;
    Answer(Call::vconf_get_str, {},
        [&](State& state)
        { return g_strcmp0(in_key, "db/csc/salescode") == 0 ? GiveText(&value, state.Current(&Device::salesCode)) : -EINVAL; });
    return value;
}
