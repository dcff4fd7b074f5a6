#include "SimCard.h"

#include "Kivctl.h"

#include <DASystem.h>
#include <DeviceControl.h>
#include <glib.h>

#include <numeric>

std::string CardStatusWord(TelSimCardStatus_t status)
{
    static constexpr Word kWords[] = {
        {TAPI_SIM_STATUS_CARD_ERROR, "card error"},
        {TAPI_SIM_STATUS_CARD_NOT_PRESENT, "no card"},
        {TAPI_SIM_STATUS_SIM_INITIALIZING, "initialising"},
        {TAPI_SIM_STATUS_SIM_INIT_COMPLETED, "ready"},
        {TAPI_SIM_STATUS_SIM_PIN_REQUIRED, "PIN required"},
        {TAPI_SIM_STATUS_SIM_PUK_REQUIRED, "PUK required"},
        {TAPI_SIM_STATUS_CARD_BLOCKED, "card blocked"},
        {TAPI_SIM_STATUS_SIM_NCK_REQUIRED, "network key required"},
        {TAPI_SIM_STATUS_SIM_NSCK_REQUIRED, "network subset key required"},
        {TAPI_SIM_STATUS_SIM_SPCK_REQUIRED, "provider key required"},
        {TAPI_SIM_STATUS_SIM_CCK_REQUIRED, "corporate key required"},
        {TAPI_SIM_STATUS_CARD_REMOVED, "card removed"},
        {TAPI_SIM_STATUS_SIM_LOCK_REQUIRED, "SIM lock required"},
        {TAPI_SIM_STATUS_CARD_CRASHED, "card crashed"},
        {TAPI_SIM_STATUS_CARD_POWEROFF, "card powered off"},
        {TAPI_SIM_STATUS_UNKNOWN, "not known yet"},
    };
    return WordFor(kWords, status);
}

CardAnswer ReadCard(int slot)
{
    constexpr auto kUnread = static_cast<TelSimCardStatus_t>(-1);
    DASystem* const system = DASystem::GetInstance();
    TelSimCardStatus_t status = kUnread;
    const bool isUsable = system->IsAvaliableState(slot, &status);
    if (status == kUnread)
        return {slot, false, true, "modem does not answer"};
    // Wait for a card without power too, as the library's own poll does.
    const bool mayBecomeUsable = system->IsWaittingSimCheck(status) || status == TAPI_SIM_STATUS_CARD_POWEROFF;
    return {slot, isUsable, mayBecomeUsable, CardStatusWord(status)};
}

std::vector<std::string> RequireCpNames()
{
    g_auto(GStrv) names = DASystem::GetInstance()->GetCpNameList();
    if (!names || !names[0])
    {
        const std::string reason = kiv::platform::ReasonFor("telephony.available");
        throw Failure(Exit::No, !reason.empty() ? reason : "this device has no modem, or its telephony does not work");
    }
    return {names, names + g_strv_length(names)};
}

std::vector<int> RequireSlots(int asked, size_t count)
{
    if (asked >= 0 && static_cast<size_t>(asked) >= count)
    {
        throw Failure(Exit::No, "there is no slot " + std::to_string(asked) +
                                    "; slots are counted from 0, and the last slot of this device is " + std::to_string(count - 1));
    }
    if (asked >= 0)
        return {asked};
    std::vector<int> all(count);
    std::iota(all.begin(), all.end(), 0);
    return all;
}
