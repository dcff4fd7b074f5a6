#include "Notifier.h"

#include <algorithm>
#include <utility>

namespace kiv::platform
{

namespace
{

thread_local int deliveries = 0;

std::array<int, kTopicCount> ValuesOf(const Device& device)
{
    return {device.wifiDeviceState, device.wifiConnectionState, device.flightMode, device.wifiStatus, device.packetData,
        device.dataRoaming};
}

} // namespace

Changes Differences(const Device& before, const Device& after)
{
    const auto old = ValuesOf(before);
    const auto now = ValuesOf(after);
    Changes changes;
    for (std::size_t i = 0; i < kTopicCount; ++i)
        if (old[i] != now[i])
            changes.push_back({static_cast<Topic>(i), now[i]});
    return changes;
}

void Notifier::Add(Topic topic, Callback callback)
{
    auto shared = std::make_shared<const Callback>(std::move(callback));
    const std::lock_guard lock(mutex_);
    callbacks_[static_cast<std::size_t>(topic)] = std::move(shared);
}

bool Notifier::Remove(Topic topic)
{
    const std::lock_guard lock(mutex_);
    return std::exchange(callbacks_[static_cast<std::size_t>(topic)], nullptr) != nullptr;
}

void Notifier::RemoveAll()
{
    const std::lock_guard lock(mutex_);
    callbacks_ = {};
}

bool Notifier::HasAny()
{
    const std::lock_guard lock(mutex_);
    return std::any_of(callbacks_.begin(), callbacks_.end(), [](const auto& callback) { return callback != nullptr; });
}

void Notifier::Deliver(const Changes& changes)
{
    for (const Change& change : changes)
    {
        const auto topic = static_cast<std::size_t>(change.topic);
        std::unique_lock lock(mutex_);
        const std::shared_ptr<const Callback> callback = callbacks_[topic];
        if (callback == nullptr)
            continue;
        ++running_[topic];
        lock.unlock();

        ++deliveries;
        (*callback)(change.value);
        --deliveries;

        lock.lock();
        --running_[topic];
        ended_.notify_all();
    }
}

void Notifier::AwaitEnd(Topic topic)
{
    if (IsDelivering())
        return;
    std::unique_lock lock(mutex_);
    ended_.wait(lock, [&] { return running_[static_cast<std::size_t>(topic)] == 0; });
}

bool Notifier::IsDelivering()
{
    return deliveries > 0;
}

} // namespace kiv::platform
