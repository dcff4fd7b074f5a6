/// @file
/// The keys of a device file, and the values of the device that they name. SourceControl.h lists them.
#ifndef KIV_SOURCES_DEVICEFIELDS_H
#define KIV_SOURCES_DEVICEFIELDS_H

#include "DeviceControl.h"

#include <stdexcept>
#include <string>

namespace kiv::platform
{

/// Says what is wrong with a device file and what is expected.
class DeviceFileError : public std::runtime_error
{
    using std::runtime_error::runtime_error;
};

/// Throws DeviceFileError.
/// @param file  its name
/// @param key   empty when the whole group is wrong
[[noreturn]] void Fail(const std::string& file, const std::string& group, const std::string& key, const std::string& what);

inline constexpr const char* kSlotGroup = "sim"; ///< and the number of the slot

/// Prepares the device for the keys of a group, for example adds a slot. Fails when there is no such group.
void AddGroup(Device& device, const std::string& file, const std::string& group);

/// Stores a value in a device that has the group. Fails when there is no such key, or the value is wrong.
void Store(Device& device, const std::string& file, const std::string& group, const std::string& key, const std::string& value);

} // namespace kiv::platform

#endif
