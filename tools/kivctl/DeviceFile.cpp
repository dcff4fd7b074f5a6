#include "Verbs.h"

#include <SimulatedDevice.h>

Exit SetInDeviceFile(const std::vector<std::string>& assignments, const Command& command)
{
    const std::string file = DeviceAskedFor(command);
    if (IsProfileName(file))
    {
        throw Failure(
            Exit::Usage, "a device that comes from a profile can not be changed; name a file with --profile, such as ./my.profile");
    }
    const std::string trouble = kiv::sim::SetInDeviceFile(file, assignments);
    if (!trouble.empty())
        throw Failure(Exit::BadDevice, trouble);
    return Exit::Done;
}

Exit ShowDeviceKeys(const Command& command)
{
    std::vector<Record> rows;
    for (const kiv::sim::FieldInfo& field : kiv::sim::ListFields())
        rows.push_back({{"key", field.group + "." + field.key}, {"values", field.values}, {"meaning", field.meaning}});
    PrintTable(rows, command.form);
    return Exit::Done;
}

Exit ShowProfiles(const Command& command)
{
    std::vector<Record> rows;
    for (const kiv::sim::Profile& profile : kiv::sim::ListProfiles())
        rows.push_back({{"name", profile.name}, {"description", profile.description}});
    PrintTable(rows, command.form);
    return Exit::Done;
}
