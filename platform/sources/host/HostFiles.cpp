#include "HostFiles.h"

#include <glib.h>
#include <iterator>
#include <string_view>
#include <sys/statvfs.h>

namespace kiv::platform
{

namespace
{

constexpr char kMissing[] = "not available on this machine";

// machine-id(5) asks programs to publish only a keyed hash of the ID.
std::string PlatformId(const std::string& machineId)
{
    const auto* const key = reinterpret_cast<const guchar*>(machineId.data());
    g_autofree char* hash = g_compute_hmac_for_string(G_CHECKSUM_SHA256, key, machineId.size(), "org.kiv.platform-id", -1);
    return machineId.empty() ? "" : std::string(hash, 32);
}

// "de_AT" of "de_AT.UTF-8@euro". If no file has it, that of the environment.
std::string Language(const std::string& locale)
{
    const char* const variable = locale.empty() ? g_getenv("LANG") : locale.c_str();
    const std::string name = variable == nullptr ? "" : std::string(variable, strcspn(variable, ".@"));
    return name == "C" || name == "POSIX" ? "" : name;
}

// A file, or a variable in one of shell assignments, as machine-info(5), locale.conf(5) and os-release(5) are.
struct Place
{
    const char* path = "";
    const char* variable = nullptr;
};

constexpr struct
{
    Text Device::*text;
    const char* key; // of the reason
    Place places[2]; // the first that has a text decides
    std::string (*convert)(const std::string& text) = nullptr;
} kFacts[] = {
    {&Device::deviceName, "settings.device-name", {{"/etc/machine-info", "PRETTY_HOSTNAME"}, {"/proc/sys/kernel/hostname"}}},
    {&Device::language, "settings.language", {{"/etc/locale.conf", "LANG"}, {"/etc/default/locale", "LANG"}}, Language},
    {&Device::modelName, "device.model-name", {{"/sys/class/dmi/id/product_name"}, {"/sys/firmware/devicetree/base/model"}}},
    {&Device::platformName, "device.platform-name", {{"/etc/os-release", "NAME"}}},
    {&Device::platformVersion, "device.platform-version", {{"/etc/os-release", "VERSION_ID"}}},
    {&Device::tizenId, "device.tizen-id", {{"/etc/machine-id"}}, PlatformId},
    {&Device::serial, "device.serial", {{"/sys/class/dmi/id/product_serial"}, {"/sys/firmware/devicetree/base/serial-number"}}},
    {&Device::salesCode, "device.sales-code", {}},
};

// The rest of a line after its beginning, which includes the end of the line before.
std::string_view FieldOf(std::string_view text, std::string_view beginning)
{
    const std::size_t start = text.find(beginning);
    const std::string_view rest = start == std::string_view::npos ? "" : text.substr(start + beginning.size());
    return rest.substr(0, rest.find('\n'));
}

// The text at a place without the blanks around it; empty if there is none.
std::string ReadAt(const std::string& root, const Place& place, const char*& reason)
{
    g_autofree char* contents = nullptr;
    g_autoptr(GError) error = nullptr;
    g_file_get_contents((root + place.path).c_str(), &contents, nullptr, &error);
    if (g_error_matches(error, G_FILE_ERROR, G_FILE_ERROR_ACCES) != FALSE)
        reason = "not permitted";
    else if (contents == nullptr && g_str_has_prefix(place.path, "/etc/") != FALSE) // then that of the vendor
        g_file_get_contents((root + "/usr/lib" + (place.path + 4)).c_str(), &contents, nullptr, nullptr);
    if (contents == nullptr || place.variable == nullptr)
        return contents == nullptr ? "" : g_strstrip(contents);

    const std::string lines = std::string("\n") + contents;
    const std::string value(FieldOf(lines, std::string("\n") + place.variable + "="));
    g_autofree char* unquoted = g_shell_unquote(value.c_str(), nullptr);
    return unquoted == nullptr ? "" : unquoted;
}

} // namespace

void HostFiles::ReadAll(Device& device)
{
    for (const auto& fact : kFacts)
        Refresh(device, fact.text);
    device.fontSize.reset();
    device.reasons["settings.font-size"] = kMissing;
    RefreshStorage(device);
}

void HostFiles::Refresh(Device& device, Text Device::*text)
{
    for (const auto& fact : kFacts)
    {
        if (fact.text != text)
            continue;
        const char* reason = kMissing;
        std::string found;
        for (auto place = std::begin(fact.places); found.empty() && place != std::end(fact.places); ++place)
            found = ReadAt(root_, *place, reason);
        if (fact.convert != nullptr)
            found = fact.convert(found);
        device.*text = found.empty() ? Text() : Text(found);
        device.reasons.erase(fact.key);
        if (found.empty())
            device.reasons[fact.key] = reason;
    }
}

void HostFiles::RefreshStorage(Device& device)
{
    struct statvfs storage
    {
    };
    if (statvfs((root_ + "/home").c_str(), &storage) != 0 && statvfs((root_ + "/").c_str(), &storage) != 0)
        storage = {};
    device.blockSize = static_cast<std::uint32_t>(storage.f_frsize); // which free blocks are counted in
    device.blocksAvailable = storage.f_bavail;
}

bool HostFiles::RefreshPackage(Device& device, const std::string& id)
{
    g_autoptr(GMappedFile) file = g_mapped_file_new((root_ + "/var/lib/dpkg/status").c_str(), FALSE, nullptr);
    if (file == nullptr)
        return false;

    const std::string_view status(g_mapped_file_get_contents(file), g_mapped_file_get_length(file));
    const std::string heading = "Package: " + id + "\n";
    device.packages.erase(id);
    for (std::size_t at = status.find(heading); at != std::string_view::npos; at = status.find(heading, at + 1))
    {
        const std::string_view paragraph = status.substr(at, status.find("\n\n", at) - at);
        const bool isHeading = at == 0 || status[at - 1] == '\n';
        if (isHeading && FieldOf(paragraph, "\nStatus: ") == "install ok installed")
            device.packages[id] = FieldOf(paragraph, "\nVersion: ");
    }
    return true;
}

} // namespace kiv::platform
