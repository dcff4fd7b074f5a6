#include "telephony.h"

#include "Calls.h"

#include <algorithm>

using namespace kiv::platform;

namespace
{

/// Returns the SIM state that follows from the last card status read, or from the first one.
int SimStateOf(const SimSlot& sim)
{
    if (sim.simState)
        return *sim.simState;
    if (sim.cardStatus.empty())
        return TELEPHONY_SIM_STATE_UNKNOWN;

    const auto read = std::min<std::size_t>(sim.cardReads, sim.cardStatus.size());
    switch (sim.cardStatus[read == 0 ? 0 : read - 1])
    {
    case 3:
        return TELEPHONY_SIM_STATE_AVAILABLE;
    case 4:
    case 5:
    case 7:
    case 8:
    case 9:
    case 10:
    case 12:
        return TELEPHONY_SIM_STATE_LOCKED;
    case 2:
    case 255:
        return TELEPHONY_SIM_STATE_UNKNOWN;
    default:
        return TELEPHONY_SIM_STATE_UNAVAILABLE;
    }
}

template <class Work>
int AnswerForHandle(Call call, telephony_h handle, Work work)
{
    return AnswerForSlot(call, HandleKind::Telephony, handle, work);
}

} // namespace

PLATFORM_API int telephony_init(telephony_handle_list_s* list)
{
    const void* const caller = __builtin_return_address(0);
    return Answer(Call::telephony_init, {},
        [&](State& state)
        {
            if (list == nullptr)
                return -EINVAL;
            if (!state.device.telephony)
                return -ENOTSUP;
            *list = {};
            if (state.device.slots.empty())
                return 0;

            OpenHandle handles{HandleKind::HandleList, kNoSlot, state.handles.Open(Call::telephony_init, caller), {}, {}};
            for (const SimSlot& sim : state.device.slots)
            {
                const int slot = static_cast<int>(handles.list.size());
                handles.list.push_back(
                    state.handles.Add<telephony_h>({HandleKind::Telephony, slot, handles.opening, sim.cpName, {}}));
            }
            list->count = static_cast<unsigned>(handles.list.size());
            list->handle = state.handles.Add<telephony_h*>(std::move(handles));
            return 0;
        });
}

PLATFORM_API int telephony_deinit(telephony_handle_list_s* list)
{
    return Answer(Call::telephony_deinit, {},
        [&](State& state)
        {
            if (list == nullptr)
                return -EINVAL;
            const telephony_handle_list_s closed = *list;
            *list = {};
            if (closed.count == 0 && closed.handle == nullptr) // as telephony_init() returns on a device without slots
                return 0;
            return state.handles.Close(HandleKind::HandleList, closed.handle, Call::telephony_deinit) ? 0 : -EINVAL;
        });
}

PLATFORM_API int telephony_modem_get_imei(telephony_h handle, char** imei)
{
    return AnswerForHandle(Call::telephony_modem_get_imei, handle, [&](const SimSlot& sim) { return GiveText(imei, sim.imei); });
}

PLATFORM_API int telephony_sim_get_state(telephony_h handle, telephony_sim_state_e* sim_state)
{
    return AnswerForHandle(
        Call::telephony_sim_get_state, handle, [&](const SimSlot& sim) { return Give(sim_state, SimStateOf(sim)); });
}

PLATFORM_API int telephony_sim_get_subscriber_number(telephony_h handle, char** number)
{
    return AnswerForHandle(Call::telephony_sim_get_subscriber_number, handle,
        [&](const SimSlot& sim) { return sim.number ? GiveText(number, sim.number) : Give(number, nullptr); });
}

PLATFORM_API int telephony_network_get_service_state(telephony_h handle, telephony_network_service_state_e* state)
{
    return AnswerForHandle(
        Call::telephony_network_get_service_state, handle, [&](const SimSlot& sim) { return Give(state, sim.serviceState); });
}

PLATFORM_API int telephony_network_get_roaming_status(telephony_h handle, bool* roaming)
{
    return AnswerForHandle(
        Call::telephony_network_get_roaming_status, handle, [&](const SimSlot& sim) { return Give(roaming, sim.roaming); });
}
