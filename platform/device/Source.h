/// @file
/// The interface between the device and the source of its values, which keeps them current.
#ifndef KIV_DEVICE_SOURCE_H
#define KIV_DEVICE_SOURCE_H

#include "DeviceControl.h"

#include <memory>
#include <string>

namespace kiv::platform
{

/// At most one source is in use at a time. Only that one replaces the device, with the lock of the state held.
class Source
{
public:
    Source() = default;
    Source(const Source&) = delete;
    Source& operator=(const Source&) = delete;
    virtual ~Source() = default;

    /// Starts its work if it is in use and there are registrations, otherwise ends it. Called without a lock after either may have
    /// changed. When its work has ended, its thread is gone; only a call from a callback does not wait for that.
    virtual void Settle() noexcept {}

    /// @name Values that the source reads when a call needs them; the state is locked, and the device is that of the state
    /// @{
    virtual void Refresh(Device& /*device*/, Text Device::* /*text*/) {}
    virtual void RefreshStorage(Device& /*device*/) {}
    /// @return whether the platform has packages
    virtual bool RefreshPackage(Device& /*device*/, const std::string& /*id*/) { return true; }
    /// @}
};

/// A device and its source, which is null when nothing keeps the device current.
struct Origin
{
    Device device;
    std::shared_ptr<Source> source;
};

/// Returns the device that the environment names. Defined with the sources, which the device does not know. Throws an exception
/// that describes what is wrong.
Origin OpenEnvironment();

} // namespace kiv::platform

#endif
