/// @file
/// The device in text: a key file, in GLib's form, with one group for each service and one, sim0, sim1, ..., for each slot.
#ifndef KIV_SOURCES_DEVICEFILE_H
#define KIV_SOURCES_DEVICEFILE_H

#include "DeviceFields.h"

#include <string>
#include <vector>

namespace kiv::platform
{

/// @param name  of the file, for the error's text
/// Throws DeviceFileError for anything that is not as it should be: there is no half device.
Device ReadDevice(const std::string& text, const std::string& name);

/// The text with values changed, comments kept. Throws DeviceFileError, also when the result would not be a device.
/// @param assignments  "GROUP.KEY=VALUE"
/// @param removals     "GROUP.KEY"; each has to be there
std::string ChangeText(const std::string& text, const std::string& name, const std::vector<std::string>& assignments,
    const std::vector<std::string>& removals = {});

/// Throws DeviceFileError, also for what is no regular file.
std::string ReadFile(const std::string& path);

} // namespace kiv::platform

#endif
