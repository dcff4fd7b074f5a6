/// @file
/// Controls what the simulated device does with lines of the platform log, which it drops by default. Tests keep them, and tools
/// receive them. The environment variable KIV_LOG prints them on standard error: with "error" from error priority on, with "info"
/// from information priority on. "journal" sends all of them to the system log instead.
#ifndef KIV_DEVICE_LOGCONTROL_H
#define KIV_DEVICE_LOGCONTROL_H

#include <functional>
#include <string>
#include <vector>

#pragma GCC visibility push(default)

namespace kiv::platform
{

struct LogLine
{
    int id;       ///< log_id_t
    int priority; ///< log_priority
    std::string tag;
    std::string text; ///< formatted, including the writer's line end
};

/// Starts to keep every line, and drops earlier ones.
void StartLog();

/// Returns the lines kept since StartLog() or the last TakeLog(), oldest first.
std::vector<LogLine> TakeLog();

/// Stops keeping lines; TakeLog() still returns those kept before.
void StopLog();

/// Passes every line to `sink`, on the thread that writes it; an empty function ends that. On return, the previous sink may still
/// be running on other threads.
void SetLogSink(std::function<void(const LogLine&)> sink);

} // namespace kiv::platform

#pragma GCC visibility pop

#endif
