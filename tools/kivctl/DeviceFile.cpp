#include "Verbs.h"

#include <SourceControl.h>

std::vector<std::string> DeviceFileKeys()
{
    std::vector<std::string> keys;
    for (const kiv::platform::FieldInfo& field : kiv::platform::ListFields())
        keys.push_back(field.group + "." + field.key);
    return keys;
}

Exit SetInDeviceFile(const std::vector<std::string>& assignments, const Command& command)
{
    const std::string file = DeviceAskedFor(command);
    if (IsHost(file))
    {
        throw Failure(Exit::Usage,
            "the machine itself is changed by its own tools, such as nmcli and mmcli; what can be changed here "
            "is a device file, which --profile names, such as ./my.profile");
    }
    if (IsProfileName(file))
    {
        throw Failure(
            Exit::Usage, "a device that comes from a profile can not be changed; name a file with --profile, such as ./my.profile");
    }
    const std::string trouble = kiv::platform::SetInDeviceFile(file, assignments);
    if (!trouble.empty())
        throw Failure(Exit::BadDevice, trouble);
    return Exit::Done;
}

Exit ShowDeviceKeys(const Command& command)
{
    std::vector<Record> rows;
    for (const kiv::platform::FieldInfo& field : kiv::platform::ListFields())
    {
        rows.push_back({{"key", field.group + "." + field.key}, {"values", field.values}, {"default", field.fallback},
            {"meaning", field.meaning}});
    }
    PrintTable(rows, command.form);
    return Exit::Done;
}

Exit ShowProfiles(const Command& command)
{
    std::vector<Record> rows;
    std::vector<kiv::platform::Profile> profiles = kiv::platform::ListProfiles();
    profiles.push_back(kiv::platform::HostProfile());
    for (const kiv::platform::Profile& profile : profiles)
        rows.push_back({{"name", profile.name}, {"description", profile.description}});
    PrintTable(rows, command.form);
    return Exit::Done;
}
