/// @file
/// What keeps the device's values current besides its remote control: the seam between the device and where its state comes from.
#ifndef KIV_DEVICE_SOURCE_H
#define KIV_DEVICE_SOURCE_H

#include "DeviceControl.h"

#include <memory>
#include <string>

namespace kiv::platform
{

/// One source is in use at a time, or none. It puts devices in place with the lock of the state held, and only while in use.
class Source
{
public:
    Source() = default;
    Source(const Source&) = delete;
    Source& operator=(const Source&) = delete;
    virtual ~Source() = default;

    /// Starts or ends its work, as it is in use and there are registrations. Called after either may have changed, with no lock
    /// held. Ended, its thread is gone, except that a callback does not wait for it.
    virtual void Settle() noexcept {}

    /// @name What it looks up when a call asks for it, if anything; the state is locked, and the device is that of the state
    /// @{
    virtual void Refresh(Device& /*device*/, Text Device::* /*text*/) {}
    virtual void RefreshStorage(Device& /*device*/) {}
    /// @return whether the platform has packages at all
    virtual bool RefreshPackage(Device& /*device*/, const std::string& /*id*/) { return true; }
    /// @}
};

/// A device, and what keeps it current; null when nothing does.
struct Origin
{
    Device device;
    std::shared_ptr<Source> source;
};

/// What the environment names. Defined with the sources: the device knows none of them. Throws an exception that describes what
/// is wrong.
Origin OpenEnvironment();

} // namespace kiv::platform

#endif
