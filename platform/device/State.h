/// @file
/// The state that all services of the simulated device share.
#ifndef KIV_DEVICE_STATE_H
#define KIV_DEVICE_STATE_H

#include "DeviceControl.h"
#include "Handles.h"
#include "Notifier.h"
#include "Source.h"

#include <memory>
#include <mutex>
#include <string>

namespace kiv::platform
{

struct State
{
    std::mutex mutex; ///< guards all members before the notifier, which has its own lock

    Device device;
    std::shared_ptr<Source> source; ///< keeps the device current; null when nothing does
    std::string trouble;            ///< what is wrong with the profile that the environment names
    Handles handles;
    bool wifiInitialized = false;

    Notifier notifier;

    /// Whether there is a device. The first call reads the one that the environment names.
    bool Ready();

    /// Returns the trouble on the first call, and an empty text afterwards.
    std::string TakeTrouble();

    /// Replaces the device. The caller delivers the changes after it releases the lock.
    Changes Replace(Device next);

    /// Returns the present value of a text of the device.
    const Text& Current(Text Device::*text)
    {
        if (source != nullptr)
            source->Refresh(device, text);
        return device.*text;
    }

    /// Returns the slot whose modem has the name, or kNoSlot.
    int SlotOf(const char* cpName) const;

    /// Returns the slot that a handle was opened for, even if its modem has moved; null when the modem is gone.
    SimSlot* Find(int slot, const std::string& cpName);

private:
    friend void ResetDevice();
    bool loaded_ = false;
    bool isReported_ = false; ///< TakeTrouble() has returned the trouble
};

/// Returns the state, which is never destroyed, since threads may outlive main().
State& TheState();

/// Makes the source in use start or end its work. Call it without a lock after registrations changed.
void SettleSource() noexcept;

/// Replaces the device and its source. Registered callbacks for each changed value run before it returns.
void Use(Origin origin);

} // namespace kiv::platform

#endif
