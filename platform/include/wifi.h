/// @file
/// Changes of Wi-Fi. Every function gives 0, else an error code. Any thread; callbacks run on a thread of the platform's.
#ifndef KIV_PLATFORM_WIFI_H
#define KIV_PLATFORM_WIFI_H

#include "platform_decls.h"

PLATFORM_BEGIN_DECLS

/// An access point; valid while the callback that got it runs.
typedef void* wifi_ap_h;

typedef enum PLATFORM_OPEN_ENUM
{
    WIFI_DEVICE_STATE_DEACTIVATED = 0,
    WIFI_DEVICE_STATE_ACTIVATED = 1
} wifi_device_state_e;

typedef enum PLATFORM_OPEN_ENUM
{
    WIFI_CONNECTION_STATE_FAILURE = -1,
    WIFI_CONNECTION_STATE_DISCONNECTED = 0,
    WIFI_CONNECTION_STATE_ASSOCIATION = 1,
    WIFI_CONNECTION_STATE_CONFIGURATION = 2,
    WIFI_CONNECTION_STATE_CONNECTED = 3
} wifi_connection_state_e;

/// @param user_data  that of the registration
typedef void (*wifi_device_state_changed_cb)(wifi_device_state_e state, void* user_data);

/// @param ap         the access point in question, possibly null
/// @param user_data  that of the registration
typedef void (*wifi_connection_state_changed_cb)(wifi_connection_state_e state, wifi_ap_h ap, void* user_data);

/// Makes the other functions usable; may be called again.
int wifi_initialize(void);

/// Asks to be told of each change; a second registration replaces the first.
int wifi_set_device_state_changed_cb(wifi_device_state_changed_cb callback, void* user_data);

/// Ends the registration; without one it is an error. When it returns, the callback is not running and will not run any more;
/// called from within a callback it does not wait for callbacks that run on other threads.
int wifi_unset_device_state_changed_cb(void);

/// As wifi_set_device_state_changed_cb().
int wifi_set_connection_state_changed_cb(wifi_connection_state_changed_cb callback, void* user_data);

/// As wifi_unset_device_state_changed_cb().
int wifi_unset_connection_state_changed_cb(void);

PLATFORM_END_DECLS

#endif
