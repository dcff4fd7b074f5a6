/// @file
/// The state of the device, and notifications of its changes. Every function returns 0, else an error code, and then leaves its
/// out-parameter untouched. A key of another type is an error. Any thread.
#ifndef KIV_PLATFORM_RUNTIME_INFO_H
#define KIV_PLATFORM_RUNTIME_INFO_H

#include "platform_decls.h"

PLATFORM_BEGIN_DECLS

/// The values that can be read and watched, with their types.
typedef enum PLATFORM_OPEN_ENUM
{
    RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED = 0,  ///< bool
    RUNTIME_INFO_KEY_WIFI_STATUS = 1,          ///< int: a runtime_info_wifi_status_e
    RUNTIME_INFO_KEY_PACKET_DATA_ENABLED = 9,  ///< bool
    RUNTIME_INFO_KEY_DATA_ROAMING_ENABLED = 10 ///< bool
} runtime_info_key_e;

/// Values of RUNTIME_INFO_KEY_WIFI_STATUS.
typedef enum PLATFORM_OPEN_ENUM
{
    RUNTIME_INFO_WIFI_STATUS_DISABLED = 0,
    RUNTIME_INFO_WIFI_STATUS_UNCONNECTED = 1,
    RUNTIME_INFO_WIFI_STATUS_CONNECTED = 2
} runtime_info_wifi_status_e;

/// @param key  the value in question
/// @param user_data  from the registration
typedef void (*runtime_info_changed_cb)(runtime_info_key_e key, void* user_data);

/// Reads a number.
int runtime_info_get_value_int(runtime_info_key_e key, int* value);

/// Reads a switch.
int runtime_info_get_value_bool(runtime_info_key_e key, bool* value);

/// Registers a callback for changes of one value. A second registration for the key replaces the first. The callback runs on a
/// thread of the platform and can read the new value.
int runtime_info_set_changed_cb(runtime_info_key_e key, runtime_info_changed_cb callback, void* user_data);

/// Ends a registration; an error when there is none. When it returns, the callback is not running and will not run again.
/// Within a callback it does not wait for callbacks on other threads.
int runtime_info_unset_changed_cb(runtime_info_key_e key);

PLATFORM_END_DECLS

#endif
