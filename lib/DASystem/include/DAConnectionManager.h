#ifndef DACONNECTIONMANAGER_H
#define DACONNECTIONMANAGER_H

#include "IDAConnectionStateListener.h"
#include "ResultCode.h"

#include <runtime_info.h>

/// Reads the state of the device's connections, and notifies one listener of changes.
class KIV_SYSTEM_API DAConnectionManager
{
public:
    /// Returns the single instance. The first call creates it, and it is never deleted. Null when there is no memory for it; then
    /// the next call tries again. Any thread; holds a separate lock.
    static DAConnectionManager* GetInstance();

    DAConnectionManager();          ///< holds nothing; use GetInstance() instead
    virtual ~DAConnectionManager(); ///< releases nothing

    /// Registers a listener, which replaces the previous one; null unregisters.
    /// @param listener  borrowed until it is replaced
    /// @param userData  passed to the listener with every change
    /// Blocks on the platform and ignores its reply. Call it in the thread that receives the changes, or while none is being
    /// delivered: the listener is replaced without a lock.
    void SetConnectionEventListener(IDAConnectionStateListener* listener, void* userData);

    /// @return a connection_cellular_state_e, or KIV_CONNECTION_STATE_UNKNOWN (-1) when it cannot be read
    /// Blocks on the platform. Any thread.
    int GetCellularNetworkState();

    /// @return a connection_wifi_state_e, or KIV_CONNECTION_STATE_UNKNOWN (-1) when it cannot be read
    /// Blocks on the platform. Any thread.
    int GetWifiNetworkState();

    /// @return a connection_bt_state_e, or KIV_CONNECTION_STATE_UNKNOWN (-1) when it cannot be read
    /// Blocks on the platform. Any thread.
    int GetBTNetworkState();

    /// Queries the cellular connection and the selected others, one by one.
    /// @return whether at least one of them is up; a failed query counts as down
    /// Blocks on the platform. Any thread.
    bool IsNetworkConnected(bool checkWifi, bool checkBT);

    /// The platform calls it when the Wi-Fi device state changed.
    static void wifi_device_state_changed(wifi_device_state_e state, void* userData);

    /// The platform calls it when the Wi-Fi connection state changed.
    static void wifi_connection_state_changed(wifi_connection_state_e state, void* ap, void* userData);

    /// The platform calls it when a runtime value changed. It reads the value and notifies the listener; if the read fails, the
    /// listener is not notified.
    static void OnConnectionStateChanged(runtime_info_key_e key, void* userData);

    static DAConnectionManager* __pInstance;        ///< the instance; null until it is made
    static IDAConnectionStateListener* __pListener; ///< the registered listener; null when there is none
};

#endif
