/// @file
/// The sources of the device's state: profiles, which are part of the library, device files, and the machine itself. For tests and
/// tools; the library never calls these functions. Any thread may call them.
#ifndef KIV_SOURCES_SOURCECONTROL_H
#define KIV_SOURCES_SOURCECONTROL_H

#include <optional>
#include <string>
#include <vector>

#pragma GCC visibility push(default)

namespace kiv::platform
{

/// Replaces the device by a profile, a device file or the machine itself, as KIV_PROFILE does.
/// @return empty on success; otherwise what is wrong, with file, group and key, and what is expected. On an error nothing changes.
std::string UseProfile(const std::string& nameOrPath);

struct Profile
{
    std::string name;
    std::string description;
};

/// The simulated devices that UseProfile() and KIV_PROFILE know by name.
std::vector<Profile> ListProfiles();

/// The text of a profile, in the form of a device file; none when there is no such profile.
std::optional<std::string> TextOfProfile(const std::string& name);

/// The machine itself, under its name for UseProfile() and KIV_PROFILE. ModemManager, NetworkManager and files provide its state.
Profile HostProfile();

/// The description of one key of a device file.
struct FieldInfo
{
    std::string group; ///< "sim0" for the groups of all slots
    std::string key;
    std::string values;   ///< the possible values
    std::string fallback; ///< the value without the key; "none" for a missing value, "required" if a file must have the key
    std::string meaning;
    std::vector<std::string> words; ///< the values that are words
};

/// Every key that a device file may have.
std::vector<FieldInfo> ListFields();

struct FieldValue
{
    std::string key;                  ///< "GROUP.KEY"
    std::optional<std::string> value; ///< as in a device file; none when the device has no value
};

/// The values of the device in use, in the order of ListFields().
std::vector<FieldValue> ListValues();

/// @name Changes of a device file
/// Each call makes all of its changes or none. A reader sees either the old or the new file, and concurrent writers do not lose
/// changes.
/// @return as UseProfile()
/// @{

/// Sets values. If there is no such file, creates it from the profile in use, or from "dual" when no profile is in use.
/// @param assignments  "GROUP.KEY=VALUE"
/// @param madeFrom     receives the name of that profile, or an empty text when the file existed; may be null
std::string SetInDeviceFile(const std::string& path, const std::vector<std::string>& assignments, std::string* madeFrom = nullptr);

/// Creates a file from a profile, and sets values. It is an error when the file exists.
std::string MakeDeviceFile(const std::string& path, const std::string& profile, const std::vector<std::string>& assignments);

/// Removes keys, so that they have their defaults. Removes groups without keys, too.
/// @param keys  "GROUP.KEY"; each must be in the file
std::string UnsetInDeviceFile(const std::string& path, const std::vector<std::string>& keys);

/// @}

} // namespace kiv::platform

#pragma GCC visibility pop

#endif
