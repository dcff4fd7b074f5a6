/// @file
/// The SIM card of a modem. Results and threads as in TapiUtility.h.
#ifndef KIV_PLATFORM_ITAPISIM_H
#define KIV_PLATFORM_ITAPISIM_H

#include "TapiUtility.h"
#include "platform_decls.h"

PLATFORM_BEGIN_DECLS

/// The status of a SIM card.
typedef enum PLATFORM_OPEN_ENUM
{
    TAPI_SIM_STATUS_CARD_ERROR = 0,
    TAPI_SIM_STATUS_CARD_NOT_PRESENT = 1,
    TAPI_SIM_STATUS_SIM_INITIALIZING = 2,
    TAPI_SIM_STATUS_SIM_INIT_COMPLETED = 3,
    TAPI_SIM_STATUS_SIM_PIN_REQUIRED = 4,
    TAPI_SIM_STATUS_SIM_PUK_REQUIRED = 5,
    TAPI_SIM_STATUS_CARD_BLOCKED = 6,
    TAPI_SIM_STATUS_SIM_NCK_REQUIRED = 7,  ///< network control key
    TAPI_SIM_STATUS_SIM_NSCK_REQUIRED = 8, ///< network subset control key
    TAPI_SIM_STATUS_SIM_SPCK_REQUIRED = 9, ///< service provider control key
    TAPI_SIM_STATUS_SIM_CCK_REQUIRED = 10, ///< corporate control key
    TAPI_SIM_STATUS_CARD_REMOVED = 11,
    TAPI_SIM_STATUS_SIM_LOCK_REQUIRED = 12,
    TAPI_SIM_STATUS_CARD_CRASHED = 13,
    TAPI_SIM_STATUS_CARD_POWEROFF = 14,
    TAPI_SIM_STATUS_UNKNOWN = 255 ///< before the first answer of the card
} TelSimCardStatus_t;

/// The identity on the SIM, as NUL-terminated digits. The three parts joined are the IMSI.
typedef struct
{
    char szMcc[3 + 1];   ///< mobile country code, 3 digits
    char szMnc[3 + 1];   ///< mobile network code, 2 or 3 digits
    char szMsin[10 + 1]; ///< subscriber within the network: the remaining digits
} TelSimImsiInfo_t;

/// @param handle  open handle
/// @param status        receives a TelSimCardStatus_t, possibly one without a name in the enumeration
/// @param card_changed  receives 1 when the card has changed since the last start, else 0
int tel_get_sim_init_info(TapiHandle* handle, TelSimCardStatus_t* status, int* card_changed);

/// @param handle  open handle
/// @param imsi  receives the record; filled on success only
int tel_get_sim_imsi(TapiHandle* handle, TelSimImsiInfo_t* imsi);

PLATFORM_END_DECLS

#endif
