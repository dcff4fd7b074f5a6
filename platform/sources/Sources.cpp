#include "SourceControl.h"

#include "DeviceFile.h"
#include "FollowedFile.h"
#include "Host.h"
#include "Locked.h"
#include "State.h"
#include "Suggestion.h"

#include <algorithm>
#include <cerrno>
#include <fcntl.h>
#include <functional>
#include <glib.h>
#include <iterator>
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

const EmbeddedProfile* Find(const std::string& name)
{
    const auto* const found = std::find_if(
        std::begin(kProfiles), std::end(kProfiles), [&name](const EmbeddedProfile& profile) { return name == profile.name; });
    return found == std::end(kProfiles) ? nullptr : found;
}

[[noreturn]] void FailUnknown(const std::string& name, const char* what, std::vector<std::string> names = {})
{
    std::transform(std::begin(kProfiles), std::end(kProfiles), std::inserter(names, names.begin()),
        [](const EmbeddedProfile& profile) { return profile.name; });
    std::string list;
    for (const std::string& known : names)
        list += (list.empty() ? "" : ", ") + known;
    throw DeviceFileError("\"" + name + "\" is " + what + "; profiles are " + list + DidYouMean(name, names));
}

// A source that never changes.
class EmbeddedSource : public Source
{
public:
    explicit EmbeddedSource(const EmbeddedProfile& embedded) : profile(embedded) {}

    const EmbeddedProfile& profile;
};

bool Exists(const std::string& path)
{
    return g_file_test(path.c_str(), G_FILE_TEST_EXISTS) != FALSE;
}

Origin Open(const std::string& nameOrPath)
{
    if (nameOrPath == kHost)
        return OpenHost();

    if (const EmbeddedProfile* const profile = Find(nameOrPath))
        return {ReadDevice(profile->text, "profile " + nameOrPath), std::make_shared<EmbeddedSource>(*profile)};

    if (nameOrPath.find('/') == std::string::npos && !Exists(nameOrPath))
        FailUnknown(nameOrPath, "neither a profile nor a file", {kHost});
    std::string text = ReadFile(nameOrPath);
    Device device = ReadDevice(text, nameOrPath);
    return {std::move(device), std::make_shared<FollowedFile>(nameOrPath, std::move(text))};
}

// Locks the directory: concurrent writers wait for each other, and no lock file is needed.
class DirectoryLock
{
public:
    explicit DirectoryLock(const std::string& path)
    {
        const std::unique_ptr<char, decltype(&g_free)> directory(g_path_get_dirname(path.c_str()), g_free);
        descriptor_ = open(directory.get(), O_RDONLY | O_DIRECTORY | O_CLOEXEC);
        if (descriptor_ < 0)
            throw DeviceFileError(path + ": its directory cannot be opened: " + g_strerror(errno));
        if (TEMP_FAILURE_RETRY(flock(descriptor_, LOCK_EX)) != 0)
        {
            const std::string reason = g_strerror(errno);
            close(descriptor_);
            throw DeviceFileError(path + ": its directory cannot be locked: " + reason);
        }
    }
    DirectoryLock(const DirectoryLock&) = delete;
    DirectoryLock& operator=(const DirectoryLock&) = delete;
    ~DirectoryLock() { close(descriptor_); }

private:
    int descriptor_ = -1;
};

const EmbeddedProfile* ProfileInUse()
{
    const Locked state(TheState());
    const auto* const source = state->Ready() ? dynamic_cast<EmbeddedSource*>(state->source.get()) : nullptr;
    return source != nullptr ? &source->profile : Find(kDefaultProfile);
}

// Replaces the text of the file by the result of `change`.
std::string Rewrite(const std::string& path, const std::function<std::string()>& change)
try
{
    const DirectoryLock lock(path);
    const std::string text = change();
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

std::optional<std::string> TextOfProfile(const std::string& name)
{
    const EmbeddedProfile* const profile = Find(name);
    return profile != nullptr ? std::optional<std::string>(profile->text) : std::nullopt;
}

std::string SetInDeviceFile(const std::string& path, const std::vector<std::string>& assignments, std::string* madeFrom)
{
    return Rewrite(path,
        [&]
        {
            const EmbeddedProfile* const profile = Exists(path) ? nullptr : ProfileInUse();
            if (madeFrom != nullptr)
                *madeFrom = profile != nullptr ? profile->name : "";
            return ChangeText(profile != nullptr ? profile->text : ReadFile(path), path, assignments);
        });
}

std::string MakeDeviceFile(const std::string& path, const std::string& profile, const std::vector<std::string>& assignments)
{
    return Rewrite(path,
        [&]
        {
            const EmbeddedProfile* const found = Find(profile);
            if (found == nullptr)
                FailUnknown(profile, "not a profile");
            if (Exists(path))
                throw DeviceFileError(path + ": already exists; expected the name of a new file");
            return ChangeText(found->text, path, assignments);
        });
}

std::string UnsetInDeviceFile(const std::string& path, const std::vector<std::string>& keys)
{
    return Rewrite(path, [&] { return ChangeText(ReadFile(path), path, {}, keys); });
}

} // namespace kiv::platform
