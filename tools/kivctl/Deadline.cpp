#include "Deadline.h"

#include <algorithm>
#include <chrono>
#include <utility>

Deadline::Deadline(std::optional<double> seconds, std::function<void()> onMiss) : onMiss_(std::move(onMiss))
{
    constexpr double kYear = 365.0 * 24 * 60 * 60; // longer waits would overflow the clock
    if (seconds)
        thread_ = std::thread(&Deadline::Wait, this, std::min(*seconds, kYear));
}

Deadline::~Deadline()
{
    WasMissed();
}

bool Deadline::WasMissed()
{
    {
        const std::lock_guard<std::mutex> lock(mutex_);
        isOver_ = true;
    }
    change_.notify_one();
    if (thread_.joinable())
        thread_.join();
    return wasMissed_;
}

void Deadline::Wait(double seconds)
{
    std::unique_lock<std::mutex> lock(mutex_);
    if (change_.wait_for(lock, std::chrono::duration<double>(seconds), [this] { return isOver_; }))
        return;
    wasMissed_ = true;
    lock.unlock();
    onMiss_();
}
