#ifndef IDACONNECTIONSTATELISTENER_H
#define IDACONNECTIONSTATELISTENER_H

#include "DATypes.h"

#include <wifi.h>

/// Is notified of connection changes. The agent implements it and registers it with DASystem::SetConnectionEventListener().
///
/// Every operation runs in the thread in which the platform delivers the change, and receives the userData of the registration.
/// None may throw, since the platform's C code calls it. The library calls the first five virtual functions of the class; their
/// order is fixed.
class KIV_SYSTEM_API IDAConnectionStateListener
{
public:
    /// The Wi-Fi device was switched on or off.
    virtual void OnWifiDeviceStateChanged(wifi_device_state_e state, void* userData) = 0;

    /// The Wi-Fi connection state changed.
    /// @param state     the new one
    /// @param ap        the platform's access point handle; borrowed for the call
    /// @param userData  from the registration
    virtual void OnWifiConnectionStateChanged(wifi_connection_state_e state, void* ap, void* userData) = 0;

    /// Flight mode was switched.
    virtual void OnFlightModeChanged(bool enabled, void* userData) = 0;

    /// Packet data was switched.
    virtual void OnPacketDataChanged(bool enabled, void* userData) = 0;

    /// The device joined or left a Wi-Fi network.
    virtual void OnWifiConnectedChanged(bool connected, void* userData) = 0;

    /// The library does not delete listeners.
    virtual ~IDAConnectionStateListener() = default;
};

#endif
