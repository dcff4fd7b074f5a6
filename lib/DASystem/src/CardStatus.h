/// @file
/// What a card status means, and the names of SIM states in the log.
#ifndef KIV_CARDSTATUS_H
#define KIV_CARDSTATUS_H

#include <ITapiSim.h>
#include <telephony.h>

namespace kiv
{

enum class OnPolling
{
    Stop,
    Wait,
    Usable
};

/// What a card status means.
struct CardStatus
{
    int status;
    OnPolling onPolling;
    bool isUsable;  ///< now
    bool isWaiting; ///< may become usable later
};

// clang-format off
inline constexpr CardStatus CardStatusTable[] = {
    // status                           on polling          now    waiting
    {TAPI_SIM_STATUS_CARD_ERROR,         OnPolling::Stop,    false, false},
    {TAPI_SIM_STATUS_CARD_NOT_PRESENT,   OnPolling::Stop,    false, false},
    {TAPI_SIM_STATUS_SIM_INITIALIZING,   OnPolling::Wait,    false, true},
    {TAPI_SIM_STATUS_SIM_INIT_COMPLETED, OnPolling::Usable,  true,  false},
    {TAPI_SIM_STATUS_SIM_PIN_REQUIRED,   OnPolling::Wait,    false, true},
    {TAPI_SIM_STATUS_SIM_PUK_REQUIRED,   OnPolling::Wait,    false, true},
    {TAPI_SIM_STATUS_CARD_BLOCKED,       OnPolling::Stop,    false, false},
    {TAPI_SIM_STATUS_SIM_NCK_REQUIRED,   OnPolling::Wait,    false, true},
    {TAPI_SIM_STATUS_SIM_NSCK_REQUIRED,  OnPolling::Wait,    false, true},
    {TAPI_SIM_STATUS_SIM_SPCK_REQUIRED,  OnPolling::Wait,    false, true},
    {TAPI_SIM_STATUS_SIM_CCK_REQUIRED,   OnPolling::Wait,    false, true},
    {TAPI_SIM_STATUS_CARD_REMOVED,       OnPolling::Stop,    false, false},
    {TAPI_SIM_STATUS_SIM_LOCK_REQUIRED,  OnPolling::Wait,    false, true},
    {TAPI_SIM_STATUS_CARD_CRASHED,       OnPolling::Stop,    false, false},
    {TAPI_SIM_STATUS_CARD_POWEROFF,      OnPolling::Wait,    false, false},
    {TAPI_SIM_STATUS_UNKNOWN,            OnPolling::Wait,    false, true},
};
// clang-format on

/// Returns the row of a status; an unknown status counts as one that never becomes usable.
inline CardStatus Judge(TelSimCardStatus_t status)
{
    for (const CardStatus& row : CardStatusTable)
    {
        if (row.status == status)
            return row;
    }
    return {status, OnPolling::Stop, false, false};
}

/// Returns the name of an unusable SIM state, for the log.
inline const char* NameOf(telephony_sim_state_e state)
{
    switch (state)
    {
    case TELEPHONY_SIM_STATE_UNAVAILABLE:
        return "TELEPHONY_SIM_STATE_UNAVAILABLE";
    case TELEPHONY_SIM_STATE_LOCKED:
        return "TELEPHONY_SIM_STATE_LOCKED";
    case TELEPHONY_SIM_STATE_UNKNOWN:
        return "TELEPHONY_SIM_STATE_UNKNOWN";
    default:
        return "-";
    }
}

} // namespace kiv

#endif
