/// @file
/// Where the device's state comes from: profiles, which the library carries, device files, and the machine itself. For tests and
/// tools; the product never calls it. Any thread may call anything here.
#ifndef KIV_SOURCES_SOURCECONTROL_H
#define KIV_SOURCES_SOURCECONTROL_H

#include <optional>
#include <string>
#include <vector>

#pragma GCC visibility push(default)

namespace kiv::platform
{

/// Replaces the device by a profile or a device file, which it follows as it does one that KIV_PROFILE names.
/// @return what was wrong, naming file, group and key, and what would be right; empty when done. On trouble nothing changes.
std::string UseProfile(const std::string& nameOrPath);

struct Profile
{
    std::string name;
    std::string description;
};

/// The simulated devices that UseProfile() and KIV_PROFILE know by name.
std::vector<Profile> ListProfiles();

/// The text of such a profile, in the form of a device file; none when there is no such profile.
std::optional<std::string> TextOfProfile(const std::string& name);

/// The machine itself, which they know too: ModemManager, NetworkManager and its files tell what it is.
Profile HostProfile();

/// What one key of a device file is.
struct FieldInfo
{
    std::string group; ///< "sim0" stands for that of every slot
    std::string key;
    std::string values;   ///< what it may hold
    std::string fallback; ///< what it is without the key: "none" for a value that is missing, "required" where there is no device
    std::string meaning;
    std::vector<std::string> words; ///< the values that are words
};

/// Every key that a device file may hold.
std::vector<FieldInfo> ListFields();

struct FieldValue
{
    std::string key;                  ///< "GROUP.KEY"
    std::optional<std::string> value; ///< as a device file holds it; none where the device has no value
};

/// The values of the device in use, in the order of ListFields().
std::vector<FieldValue> ListValues();

/// @name Changes of a device file: all of one call or none
/// Whoever reads the file meanwhile sees the old one or the new one, and two writers at once lose nothing.
/// @return as UseProfile()
/// @{

/// Sets values. A file that is not there is made from the profile in use (from "dual" if a file is in use).
/// @param assignments  "GROUP.KEY=VALUE"
/// @param madeFrom     receives the name of that profile, and nothing when the file was there; may be null
std::string SetInDeviceFile(const std::string& path, const std::vector<std::string>& assignments, std::string* madeFrom = nullptr);

/// Makes a file from a profile, and sets values. A file that is there is left alone, and an error.
std::string MakeDeviceFile(const std::string& path, const std::string& profile, const std::vector<std::string>& assignments);

/// Removes keys, so that they have their defaults, and groups that lose their last key.
/// @param keys  "GROUP.KEY"; each has to be in the file
std::string UnsetInDeviceFile(const std::string& path, const std::vector<std::string>& keys);

/// @}

} // namespace kiv::platform

#pragma GCC visibility pop

#endif
