#include "State.h"

#include "Calls.h"
#include "DeviceFile.h"
#include "Locked.h"
#include "dlog.h"

#include <algorithm>
#include <cerrno>
#include <fcntl.h>
#include <glib.h>
#include <glib/gstdio.h>
#include <memory>
#include <sys/file.h>
#include <unistd.h>
#include <utility>

namespace kiv::platform
{

namespace
{

struct EmbeddedProfile
{
    const char* name;
    const char* text;
};

constexpr EmbeddedProfile kProfiles[] = {
#include "profiles.inc"
};
constexpr const char* kDefaultProfile = "dual";

const char* TextOfProfile(const std::string& name)
{
    for (const EmbeddedProfile& profile : kProfiles)
        if (name == profile.name)
            return profile.text;
    return nullptr;
}

struct Source
{
    std::string path; // empty for a profile
    std::string text;
    Device device;
};

Source Open(const std::string& nameOrPath)
{
    if (const char* const text = TextOfProfile(nameOrPath))
        return {{}, text, ReadDevice(text, "profile " + nameOrPath)};

    if (nameOrPath.find('/') == std::string::npos && !g_file_test(nameOrPath.c_str(), G_FILE_TEST_EXISTS))
    {
        std::string names;
        for (const EmbeddedProfile& profile : kProfiles)
            names += (names.empty() ? "" : ", ") + std::string(profile.name);
        throw DeviceFileError("\"" + nameOrPath + "\" is no profile and no file; profiles are " + names);
    }
    std::string text = ReadFile(nameOrPath);
    Device device = ReadDevice(text, nameOrPath);
    return {nameOrPath, std::move(text), std::move(device)};
}

// A change from anywhere: what `change` gives under the lock is delivered without it.
template <class Make>
void Apply(Make change)
{
    Changes changes;
    {
        const Locked state(TheState());
        state->Ready();
        changes = change(*state);
        state->trouble.clear();
    }
    FollowFile();
    TheState().notifier.Deliver(changes);
}

// Locks the directory, so that two writers go one after the other and no lock file is left behind.
class DirectoryLock
{
public:
    explicit DirectoryLock(const std::string& path)
    {
        const std::unique_ptr<char, decltype(&g_free)> directory(g_path_get_dirname(path.c_str()), g_free);
        descriptor_ = open(directory.get(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
        if (descriptor_ < 0 || TEMP_FAILURE_RETRY(flock(descriptor_, LOCK_EX)) != 0)
        {
            const std::string reason = g_strerror(errno);
            Close();
            throw DeviceFileError(path + ": its directory cannot be locked: " + reason);
        }
    }
    DirectoryLock(const DirectoryLock&) = delete;
    DirectoryLock& operator=(const DirectoryLock&) = delete;
    ~DirectoryLock() { Close(); }

private:
    void Close() const
    {
        if (descriptor_ >= 0)
            close(descriptor_);
    }

    int descriptor_ = -1;
};

} // namespace

State& TheState()
{
    static State* const state = new State;
    return *state;
}

bool State::Ready()
{
    if (loaded_)
        return trouble.empty();

    loaded_ = true;
    const char* const wish = g_getenv("KIV_PROFILE");
    try
    {
        Source source = Open(wish != nullptr && *wish != '\0' ? wish : kDefaultProfile);
        path = std::move(source.path);
        text = std::move(source.text);
        device = std::move(source.device);
    }
    catch (const DeviceFileError& error)
    {
        device = Device();
        device.telephony = false;
        trouble = error.what();
    }
    return trouble.empty();
}

Changes State::Replace(Device next)
{
    Changes changes = Differences(device, next);
    device = std::move(next);
    return changes;
}

int State::SlotOf(const char* cpName) const
{
    const auto found =
        std::find_if(device.slots.begin(), device.slots.end(), [cpName](const SimSlot& sim) { return sim.cpName == cpName; });
    return found == device.slots.end() ? kNoSlot : static_cast<int>(found - device.slots.begin());
}

Device GetDevice()
{
    const Locked state(TheState());
    state->Ready();
    return state->device;
}

void SetDevice(const Device& device)
{
    Apply(
        [&](State& state)
        {
            state.path.clear();
            return state.Replace(device);
        });
}

void ChangeDevice(const std::function<void(Device&)>& change)
{
    Apply(
        [&](State& state)
        {
            Device next = state.device;
            change(next);
            return state.Replace(std::move(next));
        });
}

std::string UseProfile(const std::string& nameOrPath)
try
{
    Source source = Open(nameOrPath);
    Apply(
        [&](State& state)
        {
            state.path = std::move(source.path);
            state.text = std::move(source.text);
            return state.Replace(std::move(source.device));
        });
    return {};
}
catch (const DeviceFileError& error)
{
    return error.what();
}

void ReadAgain(const std::string& path)
{
    State& state = TheState();
    Changes changes;
    {
        const std::lock_guard reading(state.reading);
        try
        {
            std::string text = ReadFile(path);
            Device next = ReadDevice(text, path);
            state.lastReport.clear();

            const std::lock_guard lock(state.mutex);
            if (state.path != path || state.text == text)
                return;
            for (std::size_t i = 0; i < next.slots.size() && i < state.device.slots.size(); ++i)
                if (next.slots[i].cardStatus == state.device.slots[i].cardStatus)
                    next.slots[i].cardReads = state.device.slots[i].cardReads;
            state.text = std::move(text);
            changes = state.Replace(std::move(next));
        }
        catch (const DeviceFileError& error)
        {
            if (state.lastReport != error.what())
                __dlog_print(LOG_ID_SYSTEM, DLOG_ERROR, "KIV_PLATFORM", "%s\n", error.what());
            state.lastReport = error.what();
        }
    }
    state.notifier.Deliver(changes);
}

std::string DeviceTrouble()
{
    const Locked state(TheState());
    state->Ready();
    return state->trouble;
}

void ResetDevice()
{
    ResetCalls();
    TheState().notifier.RemoveAll();
    FollowFile();
    const Locked state(TheState());
    state->handles = Handles();
    state->wifiInitialized = false;
    state->path.clear();
    state->trouble.clear();
    state->loaded_ = false;
}

std::vector<Profile> ListProfiles()
{
    std::vector<Profile> profiles;
    for (const EmbeddedProfile& profile : kProfiles)
        profiles.push_back({profile.name, ReadDevice(profile.text, profile.name).description});
    return profiles;
}

std::string SetInDeviceFile(const std::string& path, const std::vector<std::string>& assignments)
try
{
    const DirectoryLock lock(path);
    std::string text;
    if (g_file_test(path.c_str(), G_FILE_TEST_EXISTS))
    {
        text = ReadFile(path);
    }
    else
    {
        const Locked state(TheState());
        text = state->Ready() && state->path.empty() ? state->text : TextOfProfile(kDefaultProfile);
    }

    text = ChangeText(text, path, assignments);
    constexpr auto kReplaceAndSync =
        static_cast<GFileSetContentsFlags>(G_FILE_SET_CONTENTS_CONSISTENT | G_FILE_SET_CONTENTS_DURABLE);
    g_autoptr(GError) error = nullptr;
    if (!g_file_set_contents_full(path.c_str(), text.data(), static_cast<gssize>(text.size()), kReplaceAndSync, 0644, &error))
        throw DeviceFileError(path + ": " + error->message);
    return {};
}
catch (const DeviceFileError& error)
{
    return error.what();
}

std::vector<std::string> OpenHandles()
{
    const Locked state(TheState());
    return state->handles.Describe();
}

std::vector<std::string> TakeMisuses()
{
    const Locked state(TheState());
    return state->handles.TakeMisuses();
}

} // namespace kiv::platform
