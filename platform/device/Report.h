/// @file
/// What the device says to the user of a process that does not ask for it.
#ifndef KIV_DEVICE_REPORT_H
#define KIV_DEVICE_REPORT_H

#include <string>

namespace kiv::platform
{

/// Prints one line on standard error, behind the name of the program, whatever KIV_LOG is: for what the user of a process has set
/// up wrong, which its own results do not show. Call it with no lock held.
void Report(const std::string& text);

/// Reads KIV_LOG, which the first line of the log does otherwise, and reports a word that it does not know.
void SettleLog();

} // namespace kiv::platform

#endif
