#include "net_connection.h"

#include "Calls.h"

using namespace kiv::platform;

namespace
{

template <class Out>
int GiveState(Call call, connection_h connection, Out* out, int Device::*value)
{
    return Answer(call, {},
        [&](State& state)
        { return state.handles.Find(HandleKind::Connection, connection, call) ? Give(out, state.device.*value) : -EINVAL; });
}

} // namespace

PLATFORM_API int connection_create(connection_h* connection)
{
    const void* const caller = __builtin_return_address(0);
    return Answer(Call::connection_create, {},
        [&](State& state)
        {
            if (connection == nullptr)
                return -EINVAL;
            const Opening opening = state.handles.Open(Call::connection_create, caller);
            *connection = state.handles.Add<connection_h>({HandleKind::Connection, kNoSlot, opening, {}, {}});
            return 0;
        });
}

PLATFORM_API int connection_destroy(connection_h connection)
{
    return Answer(Call::connection_destroy, {},
        [&](State& state)
        { return state.handles.Close(HandleKind::Connection, connection, Call::connection_destroy) ? 0 : -EINVAL; });
}

PLATFORM_API int connection_get_cellular_state(connection_h connection, connection_cellular_state_e* state)
{
    return GiveState(Call::connection_get_cellular_state, connection, state, &Device::cellularState);
}

PLATFORM_API int connection_get_wifi_state(connection_h connection, connection_wifi_state_e* state)
{
    return GiveState(Call::connection_get_wifi_state, connection, state, &Device::wifiState);
}

PLATFORM_API int connection_get_bt_state(connection_h connection, connection_bt_state_e* state)
{
    return GiveState(Call::connection_get_bt_state, connection, state, &Device::bluetoothState);
}
