/// @file
/// Where the device's state comes from: profiles, which the library carries, device files, and the machine itself. For tests and
/// tools; the product never calls it. Any thread may call anything here.
#ifndef KIV_SOURCES_SOURCECONTROL_H
#define KIV_SOURCES_SOURCECONTROL_H

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
};

/// Every key that a device file may hold.
std::vector<FieldInfo> ListFields();

/// Changes values in a device file, all or none; whoever reads it meanwhile sees the old file or the new one, and two writers
/// at once lose nothing. A file that is not there is made from the profile in use (from "dual" if a file is in use).
/// @param assignments  "GROUP.KEY=VALUE"
/// @return as UseProfile()
std::string SetInDeviceFile(const std::string& path, const std::vector<std::string>& assignments);

} // namespace kiv::platform

#pragma GCC visibility pop

#endif
