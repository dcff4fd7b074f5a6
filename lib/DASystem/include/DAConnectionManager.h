#ifndef DACONNECTIONMANAGER_H
#define DACONNECTIONMANAGER_H

#include "IDAConnectionStateListener.h"
#include "ResultCode.h"

#include <runtime_info.h>

/// The state of the device's connections, and the listener that hears of their changes.
class KIV_SYSTEM_API DAConnectionManager
{
public:
    /// The one instance, made on first use, never deleted; null when there is no memory for it, and the next call tries again.
    /// Any thread; holds a lock of its own.
    static DAConnectionManager* GetInstance();

    DAConnectionManager();          ///< holds nothing; GetInstance() gives the one to ask
    virtual ~DAConnectionManager(); ///< releases nothing

    /// Registers the one listener of the process in place of the one before; null unregisters.
    /// @param listener  borrowed until another takes its place
    /// @param userData  handed to the listener with every change
    /// Blocks on the platform; what that answers to the registration is not looked at. Call it in the thread that receives the
    /// changes, or while none is being delivered: the listener is exchanged without a lock.
    void SetConnectionEventListener(IDAConnectionStateListener* listener, void* userData);

    /// @return a connection_cellular_state_e; KIV_CONNECTION_STATE_UNKNOWN, which is -1, when it cannot be read. Blocks on the
    /// platform. Any thread.
    int GetCellularNetworkState();

    /// @return a connection_wifi_state_e; KIV_CONNECTION_STATE_UNKNOWN, which is -1, when it cannot be read. Blocks on the
    /// platform. Any thread.
    int GetWifiNetworkState();

    /// @return a connection_bt_state_e; KIV_CONNECTION_STATE_UNKNOWN, which is -1, when it cannot be read. Blocks on the platform.
    /// Any thread.
    int GetBTNetworkState();

    /// Asks for the cellular connection, and for the others that are selected, each with a query of its own.
    /// @return whether at least one of them is up; a query that fails counts as down. Blocks on the platform. Any thread.
    bool IsNetworkConnected(bool checkWifi, bool checkBT);

    /// The platform's entry for a changed Wi-Fi device state.
    static void wifi_device_state_changed(wifi_device_state_e state, void* userData);

    /// The platform's entry for a changed Wi-Fi connection state.
    static void wifi_connection_state_changed(wifi_connection_state_e state, void* ap, void* userData);

    /// The platform's entry for a changed runtime value: reads the value and tells the listener; a value that can not be read
    /// is not told.
    static void OnConnectionStateChanged(runtime_info_key_e key, void* userData);

    static DAConnectionManager* __pInstance;        ///< the instance, null until it is made
    static IDAConnectionStateListener* __pListener; ///< the registered listener, null when there is none
};

#endif
