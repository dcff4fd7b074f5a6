/// @file
/// Notifies callbacks of changes of the device.
#ifndef KIV_DEVICE_NOTIFIER_H
#define KIV_DEVICE_NOTIFIER_H

#include "DeviceControl.h"

#include <array>
#include <condition_variable>
#include <functional>
#include <memory>
#include <mutex>
#include <thread>
#include <vector>

namespace kiv::platform
{

/// The values that callbacks can be registered for.
enum class Topic
{
    WifiDevice,
    WifiConnection,
    FlightMode,
    WifiStatus,
    PacketData,
    DataRoaming
};
constexpr std::size_t kTopicCount = 6;

struct Change
{
    Topic topic;
    int value;
};
using Changes = std::vector<Change>;

/// Returns the topics that differ between two devices, with the values of `after`.
Changes Differences(const Device& before, const Device& after);

class Notifier
{
public:
    using Callback = std::function<void(int value)>;

    /// Registers a callback, which replaces an earlier one for the topic.
    void Add(Topic topic, Callback callback);

    /// Removes a registration. @return whether there was one
    bool Remove(Topic topic);
    void RemoveAll();
    bool HasAny();

    /// Calls the callbacks that are registered at the moment of each call, with no lock held.
    void Deliver(const Changes& changes);

    /// Waits until no callback of the topic runs on another thread. Does not wait within a callback, which could wait for itself.
    void AwaitEnd(Topic topic);

    /// @name Around fork()
    /// @{
    void HoldStill() { mutex_.lock(); }
    void GoOn() { mutex_.unlock(); }
    /// In the child, where no callback runs on another thread.
    void GoOnAlone()
    {
        running_ = {};
        mutex_.unlock();
    }
    /// @}

    /// Whether this thread is within a callback.
    static bool IsDelivering();

private:
    std::mutex mutex_;
    std::condition_variable ended_;
    std::array<std::shared_ptr<const Callback>, kTopicCount> callbacks_;
    std::array<int, kTopicCount> running_{};
};

} // namespace kiv::platform

#endif
