#include "Calls.h"
#include "ITapiCall.h"
#include "ITapiNetText.h"
#include "ITapiNetwork.h"
#include "ITapiSim.h"
#include "TapiUtility.h"

#include <algorithm>
#include <glib.h>

using namespace kiv::platform;

namespace
{

template <class Work>
int AnswerForModem(Call call, TapiHandle* handle, Work work)
{
    return AnswerForSlot(call, HandleKind::Tapi, handle, work);
}

/// Reads a value of the whole device, which every modem returns.
template <class Out>
int GiveRole(Call call, TapiHandle* handle, Out* out, int Device::*role)
{
    return Answer(call, {handle},
        [&](State& state) { return state.handles.Find(HandleKind::Tapi, handle, call) ? Give(out, state.device.*role) : -EINVAL; });
}

} // namespace

PLATFORM_API char** tel_get_cp_name_list(void)
{
    char** names = nullptr;
    Answer(Call::tel_get_cp_name_list, {},
        [&](State& state)
        {
            const auto& slots = state.device.slots;
            if (!state.device.telephony)
                return -ENOTSUP;
            names = g_new0(char*, slots.size() + 1);
            std::transform(slots.begin(), slots.end(), names, [](const SimSlot& sim) { return g_strdup(sim.cpName.c_str()); });
            return 0;
        });
    return names;
}

PLATFORM_API TapiHandle* tel_init(const char* cp_name)
{
    const void* const caller = __builtin_return_address(0);
    TapiHandle* handle = nullptr;
    Answer(Call::tel_init, {nullptr, cp_name},
        [&](State& state)
        {
            const int slot = cp_name != nullptr && state.device.telephony ? state.SlotOf(cp_name) : kNoSlot;
            if (slot == kNoSlot)
                return -EINVAL;
            const Opening opening = state.handles.Open(Call::tel_init, caller);
            handle = state.handles.Add<TapiHandle*>({HandleKind::Tapi, slot, opening, cp_name, {}});
            return 0;
        });
    return handle;
}

PLATFORM_API int tel_deinit(TapiHandle* handle)
{
    return Answer(Call::tel_deinit, {handle},
        [&](State& state) { return state.handles.Close(HandleKind::Tapi, handle, Call::tel_deinit) ? 0 : -EINVAL; });
}

PLATFORM_API int tel_get_property_int(TapiHandle* handle, const char* property, int* result)
{
    return AnswerForModem(Call::tel_get_property_int, handle,
        [&](const SimSlot& sim)
        { return g_strcmp0(property, TAPI_PROP_NETWORK_SERVICE_TYPE) == 0 ? Give(result, sim.serviceType) : -EINVAL; });
}

PLATFORM_API int tel_get_sim_init_info(TapiHandle* handle, TelSimCardStatus_t* status, int* card_changed)
{
    return AnswerForModem(Call::tel_get_sim_init_info, handle,
        [&](SimSlot& sim)
        {
            if (card_changed == nullptr)
                return -EINVAL;
            if (sim.cardStatus.empty())
                return -ENODATA;
            *card_changed = 0;
            const auto read = std::min<std::size_t>(sim.cardReads, sim.cardStatus.size() - 1);
            sim.cardReads += sim.cardReads < sim.cardStatus.size() ? 1U : 0U;
            return Give(status, sim.cardStatus[read]);
        });
}

PLATFORM_API int tel_get_sim_imsi(TapiHandle* handle, TelSimImsiInfo_t* imsi)
{
    return AnswerForModem(Call::tel_get_sim_imsi, handle,
        [&](const SimSlot& sim)
        {
            if (imsi == nullptr)
                return -EINVAL;
            if (!sim.mcc || !sim.mnc || !sim.msin)
                return -ENODATA;
            g_strlcpy(imsi->szMcc, sim.mcc->c_str(), sizeof imsi->szMcc);
            g_strlcpy(imsi->szMnc, sim.mnc->c_str(), sizeof imsi->szMnc);
            g_strlcpy(imsi->szMsin, sim.msin->c_str(), sizeof imsi->szMsin);
            return 0;
        });
}

PLATFORM_API int tel_get_network_default_subscription(TapiHandle* handle, TelNetworkDefaultSubs_t* subscription)
{
    return GiveRole(Call::tel_get_network_default_subscription, handle, subscription, &Device::defaultNetwork);
}

PLATFORM_API int tel_get_network_default_data_subscription(TapiHandle* handle, TelNetworkDefaultDataSubs_t* subscription)
{
    return GiveRole(Call::tel_get_network_default_data_subscription, handle, subscription, &Device::defaultData);
}

PLATFORM_API int tel_get_call_preferred_voice_subscription(TapiHandle* handle, TelCallPreferredVoiceSubs_t* subscription)
{
    return GiveRole(Call::tel_get_call_preferred_voice_subscription, handle, subscription, &Device::preferredVoice);
}

PLATFORM_API int tel_check_sms_device_status(TapiHandle* handle, int* ready_status)
{
    return AnswerForModem(
        Call::tel_check_sms_device_status, handle, [&](const SimSlot& sim) { return Give(ready_status, sim.smsStatus); });
}
