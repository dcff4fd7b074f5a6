/// @file
/// The device as text: a GLib key file with one group per service and one group per slot (sim0, sim1, ...).
#ifndef KIV_SOURCES_DEVICEFILE_H
#define KIV_SOURCES_DEVICEFILE_H

#include "DeviceFields.h"

#include <string>
#include <vector>

namespace kiv::platform
{

/// Reads a device.
/// @param name  of the file, for the error's text
/// Throws DeviceFileError for anything wrong: a device is never read in part.
Device ReadDevice(const std::string& text, const std::string& name);

/// Changes values in a text and keeps its comments. Throws DeviceFileError, also when the result is not a device.
/// @param assignments  "GROUP.KEY=VALUE"
/// @param removals     "GROUP.KEY"; each must be in the text
std::string ChangeText(const std::string& text, const std::string& name, const std::vector<std::string>& assignments,
    const std::vector<std::string>& removals = {});

/// Reads a file. Throws DeviceFileError, also when it is not a regular file.
std::string ReadFile(const std::string& path);

} // namespace kiv::platform

#endif
