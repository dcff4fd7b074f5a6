/// @file
/// Telephony, one handle per SIM slot.
/// Every function returns 0 on success, else an error code, and then leaves its out-parameters untouched unless documented
/// otherwise. All block on the modem. Any thread.
#ifndef KIV_PLATFORM_TELEPHONY_H
#define KIV_PLATFORM_TELEPHONY_H

#include "platform_decls.h"

PLATFORM_BEGIN_DECLS

/// The handle of one slot, known only to the platform.
typedef struct telephony_data telephony_data;

/// The telephony of one SIM slot.
typedef telephony_data* telephony_h;

/// The handles of all slots: handle[i] is that of slot i.
typedef struct
{
    unsigned int count;  ///< number of SIM slots
    telephony_h* handle; ///< count handles
} telephony_handle_list_s;

/// Results of this service. Other values than 0 are errors without a name in this header.
typedef enum PLATFORM_OPEN_ENUM
{
    TELEPHONY_ERROR_NONE = 0,
    TELEPHONY_ERROR_SIM_NOT_AVAILABLE = -39841791 ///< 0xFDA01001
} telephony_error_e;

/// The state of a SIM.
typedef enum PLATFORM_OPEN_ENUM
{
    TELEPHONY_SIM_STATE_UNAVAILABLE = 0, ///< no card, or no working one
    TELEPHONY_SIM_STATE_LOCKED = 1,      ///< the card waits for a code
    TELEPHONY_SIM_STATE_AVAILABLE = 2,
    TELEPHONY_SIM_STATE_UNKNOWN = 3 ///< not known yet
} telephony_sim_state_e;

/// The service that a slot has.
typedef enum PLATFORM_OPEN_ENUM
{
    TELEPHONY_NETWORK_SERVICE_STATE_IN_SERVICE = 0,
    TELEPHONY_NETWORK_SERVICE_STATE_OUT_OF_SERVICE = 1,
    TELEPHONY_NETWORK_SERVICE_STATE_EMERGENCY_ONLY = 2
} telephony_network_service_state_e;

/// Opens one handle per slot.
/// @param list  receives the handles, which the caller releases with telephony_deinit(); the count is 0 on a device without slots
int telephony_init(telephony_handle_list_s* list);

/// Closes every handle of a list. Copies of the list share these handles.
/// @param list  a list of telephony_init(), or a copy; emptied
int telephony_deinit(telephony_handle_list_s* list);

/// @param handle  open handle
/// @param imei  receives the number of the slot's modem; free() it
int telephony_modem_get_imei(telephony_h handle, char** imei);

/// @param handle  open handle
/// @param state  receives a telephony_sim_state_e, possibly one without a name in the enumeration
int telephony_sim_get_state(telephony_h handle, telephony_sim_state_e* state);

/// @param handle  open handle
/// @param number  receives the subscriber number, which may be empty or null; free() it
int telephony_sim_get_subscriber_number(telephony_h handle, char** number);

/// @param handle  open handle
/// @param state  receives a telephony_network_service_state_e, possibly one without a name in the enumeration
int telephony_network_get_service_state(telephony_h handle, telephony_network_service_state_e* state);

/// @param handle  open handle
/// @param roaming  receives whether the slot is registered with a foreign network; meaningful only in service
int telephony_network_get_roaming_status(telephony_h handle, bool* roaming);

PLATFORM_END_DECLS

#endif
