#ifndef DEADLINE_H
#define DEADLINE_H

#include <gio/gio.h>

#include <condition_variable>
#include <mutex>
#include <optional>
#include <thread>

/// Closes a bus connection when the time is up. This ends the calls that wait for answers on it; the library's calls have no time
/// limit. Waits on a thread of its own, which ends with the object.
class Deadline
{
public:
    /// @param seconds  no deadline when empty
    Deadline(GDBusConnection* connection, std::optional<double> seconds);
    Deadline(const Deadline&) = delete;
    Deadline& operator=(const Deadline&) = delete;
    ~Deadline();

    /// Ends the wait. @return whether the time was already up
    bool WasMissed();

private:
    void Wait(GDBusConnection* connection, double seconds);

    std::mutex mutex_;
    std::condition_variable change_;
    bool isOver_ = false;
    bool wasMissed_ = false;
    std::thread thread_;
};

#endif
