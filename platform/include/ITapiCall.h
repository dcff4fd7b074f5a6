/// @file
/// Voice calls. Results and threads as in TapiUtility.h.
#ifndef KIV_PLATFORM_ITAPICALL_H
#define KIV_PLATFORM_ITAPICALL_H

#include "TapiUtility.h"
#include "platform_decls.h"

PLATFORM_BEGIN_DECLS

/// The slot whose subscription is used for outgoing voice calls.
typedef enum PLATFORM_OPEN_ENUM
{
    TAPI_CALL_PREFERRED_VOICE_SUBS_UNKNOWN = -1,
    TAPI_CALL_PREFERRED_VOICE_SUBS_SIM1 = 0,
    TAPI_CALL_PREFERRED_VOICE_SUBS_SIM2 = 1
} TelCallPreferredVoiceSubs_t;

/// @param handle  open handle
/// @param subscription  receives a TelCallPreferredVoiceSubs_t, possibly one without a name in the enumeration
int tel_get_call_preferred_voice_subscription(TapiHandle* handle, TelCallPreferredVoiceSubs_t* subscription);

PLATFORM_END_DECLS

#endif
