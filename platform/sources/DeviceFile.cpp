#include "DeviceFile.h"

#include "Suggestion.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstring>
#include <fcntl.h>
#include <glib.h>
#include <memory>
#include <sys/stat.h>
#include <unistd.h>

namespace kiv::platform
{

namespace
{

using KeyFile = std::unique_ptr<GKeyFile, decltype(&g_key_file_unref)>;
using Owned = std::unique_ptr<char, decltype(&g_free)>;
using OwnedList = std::unique_ptr<char*, decltype(&g_strfreev)>;

// One file while it is read.
class Reader
{
public:
    Reader(GKeyFile* file, const std::string& name) : file_(file), name_(name) {}

    Device Read()
    {
        Device device;
        const OwnedList groups(g_key_file_get_groups(file_, nullptr), g_strfreev);
        for (char** group = groups.get(); *group != nullptr; ++group)
        {
            AddGroup(device, name_, *group);
            const OwnedList keys(g_key_file_get_keys(file_, *group, nullptr, nullptr), g_strfreev);
            for (char** key = keys.get(); *key != nullptr; ++key)
                Store(device, name_, *group, *key, Value(*group, *key));
        }
        if (device.description.empty())
            Fail(name_, "profile", "description", "missing; expected a description of the device in one line");
        for (std::size_t slot = 0; slot < device.slots.size(); ++slot)
            Check(device.slots, slot);
        return device;
    }

private:
    std::string Value(const std::string& group, const std::string& key) const
    {
        const Owned raw(g_key_file_get_value(file_, group.c_str(), key.c_str(), nullptr), g_free);
        if (!CanBeUnescaped(raw.get()))
            Fail(name_, group, key, "not UTF-8, or a backslash that escapes nothing; write \\\\ for a backslash");
        const Owned value(g_key_file_get_string(file_, group.c_str(), key.c_str(), nullptr), g_free);
        return value.get();
    }

    // Whether GLib accepts a value as a text. It prints a warning about a value with two faults.
    static bool CanBeUnescaped(const char* raw)
    {
        if (g_utf8_validate(raw, -1, nullptr) == FALSE)
            return false;
        for (const char* at = std::strchr(raw, '\\'); at != nullptr; at = std::strchr(at + 2, '\\'))
            if (at[1] == '\0' || std::strchr("sntr\\", at[1]) == nullptr)
                return false;
        return true;
    }

    void Check(const std::vector<SimSlot>& slots, std::size_t slot) const
    {
        const std::string group = kSlotGroup + std::to_string(slot);
        const SimSlot& sim = slots[slot];
        if (sim.cpName.empty())
            Fail(name_, group, "cp-name", "missing; every slot up to the last one needs a name");
        for (std::size_t other = 0; other < slot; ++other)
            if (slots[other].cpName == sim.cpName)
                Fail(name_, group, "cp-name",
                    "\"" + sim.cpName + "\" is the name of sim" + std::to_string(other) + "; every slot needs a different name");
        if (sim.mcc.has_value() != sim.mnc.has_value() || sim.mcc.has_value() != sim.msin.has_value())
            Fail(name_, group, !sim.mcc ? "mcc" : !sim.mnc ? "mnc" : "msin", "missing; expected all of mcc, mnc and msin, or none");
        if (sim.mcc && sim.mcc->size() + sim.mnc->size() + sim.msin->size() > 15)
            Fail(name_, group, "msin", "too long; mcc, mnc and msin together have at most 15 digits");
    }

    GKeyFile* file_;
    const std::string& name_;
};

KeyFile Load(const std::string& text, const std::string& name)
{
    KeyFile file(g_key_file_new(), g_key_file_unref);
    g_autoptr(GError) error = nullptr;
    if (!g_key_file_load_from_data(file.get(), text.data(), text.size(), G_KEY_FILE_KEEP_COMMENTS, &error))
        throw DeviceFileError(name + ": " + error->message);
    return file;
}

void Assign(GKeyFile* file, const std::string& name, const std::string& assignment)
{
    const std::size_t equals = assignment.find('=');
    const std::size_t dot = assignment.find('.');
    if (equals == std::string::npos || dot == std::string::npos || dot == 0 || dot + 1 >= equals)
        throw DeviceFileError(
            name + ": \"" + assignment + "\" sets nothing; expected GROUP.KEY=VALUE, such as runtime.flight-mode=true");

    const std::string group = assignment.substr(0, dot);
    const std::string key = assignment.substr(dot + 1, equals - dot - 1);
    const std::string value = assignment.substr(equals + 1);
    const std::string both = group + key;
    const auto isControl = [](char ch) { return g_ascii_iscntrl(ch) != FALSE; };
    if (both.find_first_of("[]") != std::string::npos || key.find(' ') != std::string::npos ||
        std::any_of(both.begin(), both.end(), isControl))
        throw DeviceFileError(name + ": \"" + assignment + "\" has a bracket, a blank or a control character in its group or key");
    if (!g_utf8_validate(assignment.data(), static_cast<gssize>(assignment.size()), nullptr))
        throw DeviceFileError(name + ": [" + group + "] " + key + ": the value is not UTF-8");
    g_key_file_set_string(file, group.c_str(), key.c_str(), value.c_str());
}

void Remove(GKeyFile* file, const std::string& name, const std::string& what)
{
    const std::size_t dot = what.find('.');
    if (dot == std::string::npos)
        throw DeviceFileError(name + ": \"" + what + "\" is not a key; expected GROUP.KEY, such as runtime.flight-mode");
    const std::string group = what.substr(0, dot);
    const std::string key = what.substr(dot + 1);
    if (g_key_file_remove_key(file, group.c_str(), key.c_str(), nullptr) == FALSE)
    {
        const OwnedList keys(g_key_file_get_keys(file, group.c_str(), nullptr, nullptr), g_strfreev);
        const std::vector<std::string> present(keys.get(), keys.get() + (keys ? g_strv_length(keys.get()) : 0));
        Fail(name, group, key, "not in the file" + DidYouMean(key, present));
    }
    const OwnedList rest(g_key_file_get_keys(file, group.c_str(), nullptr, nullptr), g_strfreev);
    if (*rest == nullptr)
        g_key_file_remove_group(file, group.c_str(), nullptr);
}

} // namespace

Device ReadDevice(const std::string& text, const std::string& name)
{
    return Reader(Load(text, name).get(), name).Read();
}

std::string ChangeText(const std::string& text, const std::string& name, const std::vector<std::string>& assignments,
    const std::vector<std::string>& removals)
{
    const KeyFile file = Load(text, name);
    for (const std::string& key : removals)
        Remove(file.get(), name, key);
    for (const std::string& assignment : assignments)
        Assign(file.get(), name, assignment);
    const Owned changed(g_key_file_to_data(file.get(), nullptr, nullptr), g_free);
    ReadDevice(changed.get(), name);
    return changed.get();
}

std::string ReadFile(const std::string& path)
{
    const auto fail = [&path](const char* what) { throw DeviceFileError(path + ": " + what); };
    const int descriptor = open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK); // a FIFO would wait for its writer
    if (descriptor < 0)
        fail(g_strerror(errno));
    const std::unique_ptr<const int, void (*)(const int*)> owner(&descriptor, [](const int* opened) { close(*opened); });
    struct stat status = {};
    if (fstat(descriptor, &status) != 0 || !S_ISREG(status.st_mode))
        fail("not a regular file");

    std::string text;
    std::array<char, 4096> part{};
    for (ssize_t length = 1; length > 0; text.append(part.data(), static_cast<std::size_t>(length)))
    {
        length = TEMP_FAILURE_RETRY(read(descriptor, part.data(), part.size()));
        if (length < 0)
            fail(g_strerror(errno));
    }
    return text;
}

} // namespace kiv::platform
