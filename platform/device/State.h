/// @file
/// The one state that all services of the simulated device answer from.
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
    std::mutex mutex; ///< guards what stands before the notifier, which guards itself

    Device device;
    std::shared_ptr<Source> source; ///< keeps the device current; null when nothing does
    std::string trouble;            ///< what is wrong with the environment's profile
    Handles handles;
    bool wifiInitialized = false;

    Notifier notifier;

    /// Whether there is a device to answer from; the first question reads what the environment names.
    bool Ready();

    /// The trouble, if nobody was told of it yet; empty from then on.
    std::string UntoldTrouble();

    /// Puts a device in place; the changes are then to be delivered with the lock released.
    Changes Replace(Device next);

    /// A text of the device, as it is now.
    const Text& Current(Text Device::*text)
    {
        if (source != nullptr)
            source->Refresh(device, text);
        return device.*text;
    }

    /// The slot whose modem has the name, or kNoSlot.
    int SlotOf(const char* cpName) const;

    /// The slot that a handle was opened for, wherever its modem is now; null when that is gone.
    SimSlot* Find(int slot, const std::string& cpName);

private:
    friend void ResetDevice();
    bool loaded_ = false;
    bool told_ = false; ///< the trouble, to somebody
};

/// Lives as long as the process, for the threads that outlive its main().
State& TheState();

/// Has the source in use start or end its work. Called with no lock held, after registrations came or went.
void SettleSource() noexcept;

/// Replaces the device and what keeps it current. Registered callbacks for each value that differs run before it returns.
void Use(Origin origin);

} // namespace kiv::platform

#endif
