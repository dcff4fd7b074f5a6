/// @file
/// Voice calls. Results and threads as in TapiUtility.h.
#ifndef KIV_PLATFORM_ITAPICALL_H
#define KIV_PLATFORM_ITAPICALL_H

#include "TapiUtility.h"
#include "platform_decls.h"

PLATFORM_BEGIN_DECLS

/// The subscription that voice calls go out on, by slot.
typedef enum PLATFORM_OPEN_ENUM
{
    TAPI_CALL_PREFERRED_VOICE_SUBS_UNKNOWN = -1,
    TAPI_CALL_PREFERRED_VOICE_SUBS_SIM1 = 0,
    TAPI_CALL_PREFERRED_VOICE_SUBS_SIM2 = 1
} TelCallPreferredVoiceSubs_t;

/// @param handle  open handle
/// @param subscription  receives a TelCallPreferredVoiceSubs_t, possibly a value without a name here
int tel_get_call_preferred_voice_subscription(TapiHandle* handle, TelCallPreferredVoiceSubs_t* subscription);

PLATFORM_END_DECLS

#endif
