#include "Nearest.h"
#include "Verbs.h"

#include <DeviceControl.h>
#include <SourceControl.h>
#include <StandardOutput.h>
#include <Visible.h>

#include <algorithm>

namespace
{

/// The device file to change. Ends the verb when the device does not come from a file.
std::string RequireFile(const Command& command)
{
    std::string file = DeviceAskedFor(command);
    if (IsHost(file))
    {
        throw Failure(Exit::Usage, "only a device file can be changed; give one with --profile, such as ./my.profile (tools such "
                                   "as nmcli and mmcli change "
                                   "the machine itself)");
    }
    if (IsProfileName(file))
    {
        throw Failure(Exit::Usage, "a profile cannot be changed; give a device file with --profile, such as ./my.profile");
    }
    return file;
}

void RequireNone(const std::string& trouble)
{
    if (!trouble.empty())
        throw Failure(Exit::BadDevice, trouble);
}

/// A key that identifies a person or a device, and how many characters at the end of its value are never masked.
struct Identifier
{
    const char* key;
    size_t shown;
};
constexpr Identifier kIdentifiers[] = {{"device.tizen-id", 4}, {"device.serial", 4}, {"msin", 0}, {"number", 2}, {"imei", 4}};

Field ValueField(const kiv::platform::FieldValue& value, Identifiers identifiers)
{
    if (!value.value)
        return Missing("value", kiv::platform::ReasonFor(value.key));
    Field field{"value", *value.value};
    const bool isOfSlot = value.key.rfind("sim", 0) == 0;
    for (const Identifier& identifier : kIdentifiers)
    {
        if (value.key == identifier.key || (isOfSlot && value.key.substr(value.key.find('.') + 1) == identifier.key))
            field = Masked(field, 0, identifier.shown, identifiers);
    }
    return field;
}

std::vector<Record> ValueRows(Identifiers identifiers)
{
    const std::vector<kiv::platform::FieldValue> values = kiv::platform::ListValues();
    std::vector<Record> rows;
    rows.reserve(values.size());
    for (const kiv::platform::FieldValue& value : values)
        rows.push_back({{"key", value.key}, ValueField(value, identifiers)});
    return rows;
}

} // namespace

Exit SetInDeviceFile(const DeviceFileOptions& options, const Command& command)
{
    const std::string file = RequireFile(command);
    if (!options.from.empty())
    {
        RequireNone(kiv::platform::MakeDeviceFile(file, options.from, options.words));
        return Exit::Done;
    }
    if (options.words.empty())
        throw Failure(Exit::Usage, "nothing to change; expected GROUP.KEY=VALUE, such as runtime.flight-mode=true");
    std::string madeFrom;
    RequireNone(kiv::platform::SetInDeviceFile(file, options.words, &madeFrom));
    if (!madeFrom.empty())
        Note("created " + file + " from the profile " + madeFrom);
    return Exit::Done;
}

Exit UnsetInDeviceFile(const DeviceFileOptions& options, const Command& command)
{
    RequireNone(kiv::platform::UnsetInDeviceFile(RequireFile(command), options.words));
    return Exit::Done;
}

Exit ShowDeviceValues(const DeviceValueOptions& options, const Command& command)
{
    if (options.key.empty())
    {
        PrintTable(ValueRows(command.identifiers), command.form);
        return Exit::Done;
    }
    std::vector<std::string> keys;
    for (const kiv::platform::FieldValue& value : kiv::platform::ListValues())
    {
        keys.push_back(value.key);
        if (value.key != options.key)
            continue;
        const Field field = ValueField(value, Identifiers::Shown);
        const bool isBare = command.form.notation == Form::Notation::Text && command.form.fields.empty();
        if (!isBare)
            Print({{"key", value.key}, field}, command.form);
        else if (value.value)
            kiv::StandardOutput::Write(kiv::platform::Visible(*value.value) + '\n');
        else
            Note(value.key + " has no value" + (field.note.empty() ? "" : ": " + field.note));
        return value.value ? Exit::Done : Exit::No;
    }
    throw Failure(Exit::Usage,
        '"' + options.key + "\" is not a key of this device" + DidYouMean(options.key, keys) + "; kivctl device get lists them");
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
    std::vector<kiv::platform::Profile> profiles = kiv::platform::ListProfiles();
    profiles.push_back(kiv::platform::HostProfile());
    std::vector<Record> rows;
    rows.reserve(profiles.size());
    for (const kiv::platform::Profile& profile : profiles)
        rows.push_back({{"name", profile.name}, {"description", profile.description}});
    PrintTable(rows, command.form);
    return Exit::Done;
}

Exit ShowProfile(const ProfileOptions& options, const Command& command)
{
    const auto text = kiv::platform::TextOfProfile(options.name);
    if (IsHost(options.name))
        throw Failure(Exit::BadDevice, "the machine itself is not a profile; kivctl device get --profile host shows its values");
    if (!text)
        throw Failure(Exit::BadDevice,
            '"' + options.name + "\" is not a profile" + DidYouMean(options.name, ProfileNames()) + "; kivctl profiles lists them");
    if (command.form.notation == Form::Notation::Text && command.form.fields.empty())
    {
        kiv::StandardOutput::Write(*text);
        return Exit::Done;
    }
    RequireNone(kiv::platform::UseProfile(options.name));
    PrintTable(ValueRows(Identifiers::Shown), command.form);
    return Exit::Done;
}
