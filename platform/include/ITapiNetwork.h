/// @file
/// Which SIM the device uses for which purpose. Results and threads as in TapiUtility.h.
#ifndef KIV_PLATFORM_ITAPINETWORK_H
#define KIV_PLATFORM_ITAPINETWORK_H

#include "TapiUtility.h"
#include "platform_decls.h"

PLATFORM_BEGIN_DECLS

/// The slot of the main subscription.
typedef enum PLATFORM_OPEN_ENUM
{
    TAPI_NETWORK_DEFAULT_SUBS_UNKNOWN = -1,
    TAPI_NETWORK_DEFAULT_SUBS_SIM1 = 0,
    TAPI_NETWORK_DEFAULT_SUBS_SIM2 = 1
} TelNetworkDefaultSubs_t;

/// The slot whose subscription carries mobile data.
typedef enum PLATFORM_OPEN_ENUM
{
    TAPI_NETWORK_DEFAULT_DATA_SUBS_UNKNOWN = -1,
    TAPI_NETWORK_DEFAULT_DATA_SUBS_SIM1 = 0,
    TAPI_NETWORK_DEFAULT_DATA_SUBS_SIM2 = 1
} TelNetworkDefaultDataSubs_t;

/// @param handle  open handle
/// @param subscription  receives a TelNetworkDefaultSubs_t, possibly one without a name in the enumeration
int tel_get_network_default_subscription(TapiHandle* handle, TelNetworkDefaultSubs_t* subscription);

/// @param handle  open handle
/// @param subscription  receives a TelNetworkDefaultDataSubs_t, possibly one without a name in the enumeration
int tel_get_network_default_data_subscription(TapiHandle* handle, TelNetworkDefaultDataSubs_t* subscription);

PLATFORM_END_DECLS

#endif
