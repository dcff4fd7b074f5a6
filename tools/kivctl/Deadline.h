#ifndef DEADLINE_H
#define DEADLINE_H

#include <condition_variable>
#include <functional>
#include <mutex>
#include <optional>
#include <thread>

/// Does something when the time is up, such as ending a call that has no time limit of its own. Waits on a thread of its own, which
/// ends with the object.
class Deadline
{
public:
    /// @param seconds  no deadline when empty
    /// @param onMiss   called on the thread of the deadline, at most once
    Deadline(std::optional<double> seconds, std::function<void()> onMiss);
    Deadline(const Deadline&) = delete;
    Deadline& operator=(const Deadline&) = delete;
    ~Deadline();

    /// Ends the wait. @return whether the time was already up
    bool WasMissed();

private:
    void Wait(double seconds);

    const std::function<void()> onMiss_;
    std::mutex mutex_;
    std::condition_variable change_;
    bool isOver_ = false;
    bool wasMissed_ = false;
    std::thread thread_;
};

#endif
