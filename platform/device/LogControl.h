/// @file
/// What the simulated device does with the lines of the platform log. Nothing unless somebody asks: tests keep them, tools
/// listen to them, and the environment variable KIV_LOG prints them to standard error, "error" those of error priority and up,
/// "info" those of information priority and up; "journal" sends all of them to the system log instead.
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
    std::string text; ///< as formatted, the writer's own line end included
};

/// Keeps every line from now on; lines kept before are dropped.
void StartLog();

/// The lines kept since StartLog() or the last TakeLog(), oldest first.
std::vector<LogLine> TakeLog();

/// Keeps no more lines; what was kept stays for TakeLog().
void StopLog();

/// Hands every line from now on to `sink`, on the thread that writes it; an empty function ends that. When it returns, the
/// sink before it may still be at work on other threads.
void SetLogSink(std::function<void(const LogLine&)> sink);

} // namespace kiv::platform

#pragma GCC visibility pop

#endif
