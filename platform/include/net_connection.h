/// @file
/// The state of the network connections. Every function returns 0, else an error code, and then leaves its
/// out-parameter untouched. Any thread.
#ifndef KIV_PLATFORM_NET_CONNECTION_H
#define KIV_PLATFORM_NET_CONNECTION_H

#include "platform_decls.h"

PLATFORM_BEGIN_DECLS

/// A client of the connection service.
typedef void* connection_h;

/// The state of the cellular connection.
typedef enum PLATFORM_OPEN_ENUM
{
    CONNECTION_CELLULAR_STATE_OUT_OF_SERVICE = 0,
    CONNECTION_CELLULAR_STATE_FLIGHT_MODE = 1,
    CONNECTION_CELLULAR_STATE_ROAMING = 2,
    CONNECTION_CELLULAR_STATE_CALL_ONLY_AVAILABLE = 3,
    CONNECTION_CELLULAR_STATE_AVAILABLE = 4,
    CONNECTION_CELLULAR_STATE_CONNECTED = 5
} connection_cellular_state_e;

/// The state of the Wi-Fi connection.
typedef enum PLATFORM_OPEN_ENUM
{
    CONNECTION_WIFI_STATE_DEACTIVATED = 0,
    CONNECTION_WIFI_STATE_DISCONNECTED = 1,
    CONNECTION_WIFI_STATE_CONNECTED = 2
} connection_wifi_state_e;

/// The state of the Bluetooth connection.
typedef enum PLATFORM_OPEN_ENUM
{
    CONNECTION_BT_STATE_DEACTIVATED = 0,
    CONNECTION_BT_STATE_DISCONNECTED = 1,
    CONNECTION_BT_STATE_CONNECTED = 2
} connection_bt_state_e;

/// @param connection  receives a handle, which the caller releases with connection_destroy()
int connection_create(connection_h* connection);

/// Releases a handle.
int connection_destroy(connection_h connection);

/// @param connection  open handle
/// @param state  receives a connection_cellular_state_e, possibly one without a name in the enumeration
int connection_get_cellular_state(connection_h connection, connection_cellular_state_e* state);

/// @param connection  open handle
/// @param state  receives a connection_wifi_state_e, possibly one without a name in the enumeration
int connection_get_wifi_state(connection_h connection, connection_wifi_state_e* state);

/// @param connection  open handle
/// @param state  receives a connection_bt_state_e, possibly one without a name in the enumeration
int connection_get_bt_state(connection_h connection, connection_bt_state_e* state);

PLATFORM_END_DECLS

#endif
