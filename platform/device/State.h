/// @file
/// The one state that all services of the simulated device answer from.
#ifndef KIV_DEVICE_STATE_H
#define KIV_DEVICE_STATE_H

#include "DeviceControl.h"
#include "Handles.h"
#include "Notifier.h"

#include <mutex>

namespace kiv::platform
{

struct State
{
    std::mutex mutex; ///< guards what stands before the notifier, which guards itself

    Device device;
    std::string path;    ///< the file that the device follows; empty when it follows none
    std::string text;    ///< of the profile or file that the device was last read from
    std::string trouble; ///< what is wrong with the environment's profile
    Handles handles;
    bool wifiInitialized = false;

    Notifier notifier;

    std::mutex reading;     ///< held while the file is read again, so that an older text never replaces a newer one
    std::string lastReport; ///< what was wrong with the file that was read again; guarded by `reading`

    /// Whether there is a device to answer from; the first question reads what the environment names.
    bool Ready();

    /// Puts a device in place; the changes are then to be delivered with the lock released.
    Changes Replace(Device next);

    /// The slot whose modem has the name, or kNoSlot.
    int SlotOf(const char* cpName) const;

private:
    friend void ResetDevice();
    bool loaded_ = false;
};

/// Lives as long as the process, for the threads that outlive its main().
State& TheState();

/// Starts or ends following the device's file, as there are registrations or not. Called with no lock held. Ended, the
/// follower's thread is gone, except that a callback does not wait for it.
void FollowFile() noexcept;

/// Takes over a device file that changed. Blocks while callbacks run.
void ReadAgain(const std::string& path);

} // namespace kiv::platform

#endif
