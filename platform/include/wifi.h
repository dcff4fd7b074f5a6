/// @file
/// Notifications of Wi-Fi changes. Every function returns 0, else an error code. Any thread. Callbacks run on a thread of the
/// platform.
#ifndef KIV_PLATFORM_WIFI_H
#define KIV_PLATFORM_WIFI_H

#include "platform_decls.h"

PLATFORM_BEGIN_DECLS

/// An access point; valid while the callback that received it runs.
typedef void* wifi_ap_h;

/// Whether Wi-Fi is switched on.
typedef enum PLATFORM_OPEN_ENUM
{
    WIFI_DEVICE_STATE_DEACTIVATED = 0,
    WIFI_DEVICE_STATE_ACTIVATED = 1
} wifi_device_state_e;

/// The state of the connection to an access point.
typedef enum PLATFORM_OPEN_ENUM
{
    WIFI_CONNECTION_STATE_FAILURE = -1,
    WIFI_CONNECTION_STATE_DISCONNECTED = 0,
    WIFI_CONNECTION_STATE_ASSOCIATION = 1,
    WIFI_CONNECTION_STATE_CONFIGURATION = 2,
    WIFI_CONNECTION_STATE_CONNECTED = 3
} wifi_connection_state_e;

/// @param state  the new state
/// @param user_data  from the registration
typedef void (*wifi_device_state_changed_cb)(wifi_device_state_e state, void* user_data);

/// @param state  the new state
/// @param ap         the access point in question, possibly null
/// @param user_data  from the registration
typedef void (*wifi_connection_state_changed_cb)(wifi_connection_state_e state, wifi_ap_h ap, void* user_data);

/// Prepares the other functions; may be called again.
int wifi_initialize(void);

/// Registers a callback for each change. A second registration replaces the first.
int wifi_set_device_state_changed_cb(wifi_device_state_changed_cb callback, void* user_data);

/// Ends the registration; an error when there is none. When it returns, the callback is not running and will not run again.
/// Within a callback it does not wait for callbacks on other threads.
int wifi_unset_device_state_changed_cb(void);

/// See wifi_set_device_state_changed_cb().
int wifi_set_connection_state_changed_cb(wifi_connection_state_changed_cb callback, void* user_data);

/// See wifi_unset_device_state_changed_cb().
int wifi_unset_connection_state_changed_cb(void);

PLATFORM_END_DECLS

#endif
