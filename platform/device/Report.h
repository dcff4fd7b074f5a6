/// @file
/// Messages of the device to the user of a process.
#ifndef KIV_DEVICE_REPORT_H
#define KIV_DEVICE_REPORT_H

#include <string>

namespace kiv::platform
{

/// Prints one line on standard error, after the name of the program, whatever KIV_LOG is. It is for wrong settings of the user that
/// the results of the process do not show. Call it without a lock.
void Report(const std::string& text);

/// Reads KIV_LOG before the first line of the log does, and reports an unknown word.
void SettleLog();

} // namespace kiv::platform

#endif
