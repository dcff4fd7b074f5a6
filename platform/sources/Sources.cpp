#include "SourceControl.h"

#include "DeviceFile.h"
#include "FollowedFile.h"
#include "Host.h"
#include "Locked.h"
#include "State.h"

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
constexpr const char* kHost = "host";

const char* TextOfProfile(const std::string& name)
{
    for (const EmbeddedProfile& profile : kProfiles)
        if (name == profile.name)
            return profile.text;
    return nullptr;
}

// A profile never changes; what it keeps is its text.
class EmbeddedSource : public Source
{
public:
    explicit EmbeddedSource(const char* profile) : text(profile) {}

    const char* const text;
};

Origin Open(const std::string& nameOrPath)
{
    if (nameOrPath == kHost)
        return Host::Open();

    if (const char* const text = TextOfProfile(nameOrPath))
        return {ReadDevice(text, "profile " + nameOrPath), std::make_shared<EmbeddedSource>(text)};

    if (nameOrPath.find('/') == std::string::npos && !g_file_test(nameOrPath.c_str(), G_FILE_TEST_EXISTS))
    {
        std::string names;
        for (const EmbeddedProfile& profile : kProfiles)
            names += std::string(profile.name) + ", ";
        throw DeviceFileError("\"" + nameOrPath + "\" is no profile and no file; profiles are " + names + kHost);
    }
    std::string text = ReadFile(nameOrPath);
    Device device = ReadDevice(text, nameOrPath);
    return {std::move(device), std::make_shared<FollowedFile>(nameOrPath, std::move(text))};
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

Origin OpenEnvironment()
{
    const char* const wish = g_getenv("KIV_PROFILE");
    return Open(wish != nullptr && *wish != '\0' ? wish : kDefaultProfile);
}

std::string UseProfile(const std::string& nameOrPath)
try
{
    Use(Open(nameOrPath));
    return {};
}
catch (const DeviceFileError& error)
{
    return error.what();
}

std::vector<Profile> ListProfiles()
{
    std::vector<Profile> profiles;
    for (const EmbeddedProfile& profile : kProfiles)
        profiles.push_back({profile.name, ReadDevice(profile.text, profile.name).description});
    return profiles;
}

Profile HostProfile()
{
    return {kHost, kHostDescription};
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
        const auto* const profile = state->Ready() ? dynamic_cast<EmbeddedSource*>(state->source.get()) : nullptr;
        text = profile != nullptr ? profile->text : TextOfProfile(kDefaultProfile);
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

} // namespace kiv::platform
