#include "HostFiles.h"

#include <cerrno>
#include <glib.h>
#include <memory>
#include <string_view>
#include <sys/statvfs.h>

namespace kiv::platform
{

namespace
{

using Owned = std::unique_ptr<char, decltype(&g_free)>;

// A text, or why there is none.
struct Fact
{
    Text text;
    const char* reason = "not available on this machine";
};

// The text of a file without the blanks around it, and without the NUL at the end of a device tree's file. An empty file has none.
Fact ReadFile(const std::string& path)
{
    char* contents = nullptr;
    g_autoptr(GError) error = nullptr;
    if (g_file_get_contents(path.c_str(), &contents, nullptr, &error) == FALSE)
        return {std::nullopt, g_error_matches(error, G_FILE_ERROR, G_FILE_ERROR_ACCES) ? "not permitted" : Fact().reason};
    const Owned owner(contents, g_free);
    g_strstrip(contents);
    return *contents == '\0' ? Fact() : Fact{contents};
}

// The text of the first file that has one. If none has, the reason of the first.
template <class... Paths>
Fact FirstFile(const std::string& root, const char* path, Paths... others)
{
    Fact fact = ReadFile(root + path);
    if constexpr (sizeof...(others) > 0)
        if (!fact.text)
            if (Fact other = FirstFile(root, others...); other.text)
                return other;
    return fact;
}

// The value of a key in a file of shell assignments, as os-release(5), machine-info(5) and locale.conf(5) are.
Fact Assigned(const Fact& file, const std::string& key)
{
    const std::unique_ptr<char*, decltype(&g_strfreev)> lines(g_strsplit(file.text.value_or("").c_str(), "\n", -1), g_strfreev);
    for (char** line = lines.get(); *line != nullptr; ++line)
    {
        if (g_str_has_prefix(*line, (key + "=").c_str()) == FALSE)
            continue;
        const Owned value(g_shell_unquote(*line + key.size() + 1, nullptr), g_free);
        if (value != nullptr && *value != '\0')
            return {value.get()};
    }
    return {};
}

Fact DeviceName(const std::string& root)
{
    const Fact pretty = Assigned(ReadFile(root + "/etc/machine-info"), "PRETTY_HOSTNAME");
    return pretty.text ? pretty : ReadFile(root + "/proc/sys/kernel/hostname");
}

Fact Model(const std::string& root)
{
    return FirstFile(root, "/sys/class/dmi/id/product_name", "/sys/firmware/devicetree/base/model");
}

Fact Serial(const std::string& root)
{
    return FirstFile(root, "/sys/class/dmi/id/product_serial", "/sys/firmware/devicetree/base/serial-number");
}

Fact PlatformName(const std::string& root)
{
    return Assigned(FirstFile(root, "/etc/os-release", "/usr/lib/os-release"), "NAME");
}

Fact PlatformVersion(const std::string& root)
{
    return Assigned(FirstFile(root, "/etc/os-release", "/usr/lib/os-release"), "VERSION_ID");
}

// machine-id(5) asks programs to publish only a keyed hash of the ID.
Fact PlatformId(const std::string& root)
{
    constexpr char kPurpose[] = "org.kiv.platform-id";
    Fact id = ReadFile(root + "/etc/machine-id");
    if (!id.text)
        return id;
    const std::string key = *id.text;
    const auto* const bytes = reinterpret_cast<const guchar*>(key.data());
    const Owned hash(g_compute_hmac_for_string(G_CHECKSUM_SHA256, bytes, key.size(), kPurpose, -1), g_free);
    id.text = std::string(hash.get(), 32);
    return id;
}

// "de_AT" of "de_AT.UTF-8@euro".
Fact Language(const std::string& root)
{
    Fact locale = Assigned(ReadFile(root + "/etc/locale.conf"), "LANG");
    if (!locale.text)
        locale = Assigned(ReadFile(root + "/etc/default/locale"), "LANG");
    if (const char* const variable = g_getenv("LANG"); !locale.text && variable != nullptr)
        locale.text = variable;
    if (locale.text)
        locale.text->resize(
            locale.text->find_first_of(".@") == std::string::npos ? locale.text->size() : locale.text->find_first_of(".@"));
    const std::string name = locale.text.value_or("");
    return name.empty() || name == "C" || name == "POSIX" ? Fact() : locale;
}

Fact SalesCode(const std::string& /*root*/)
{
    return {};
}

constexpr struct
{
    Text Device::*text;
    const char* key; // of the reason
    Fact (*read)(const std::string& root);
} kFacts[] = {
    {&Device::deviceName, "settings.device-name", DeviceName},
    {&Device::language, "settings.language", Language},
    {&Device::modelName, "device.model-name", Model},
    {&Device::platformName, "device.platform-name", PlatformName},
    {&Device::platformVersion, "device.platform-version", PlatformVersion},
    {&Device::tizenId, "device.tizen-id", PlatformId},
    {&Device::serial, "device.serial", Serial},
    {&Device::salesCode, "device.sales-code", SalesCode},
};

// The value of a field in a paragraph of dpkg's status file.
std::string_view FieldOf(std::string_view paragraph, std::string_view field)
{
    const std::size_t start = paragraph.find(field);
    if (start == std::string_view::npos)
        return {};
    const std::string_view rest = paragraph.substr(start + field.size());
    return rest.substr(0, rest.find('\n'));
}

} // namespace

void HostFiles::Read(Device& device) const
{
    for (const auto& row : kFacts)
        Read(device, row.text);
    device.fontSize.reset();
    device.reasons["settings.font-size"] = Fact().reason;
    ReadStorage(device);
}

void HostFiles::Read(Device& device, Text Device::*text) const
{
    for (const auto& row : kFacts)
    {
        if (row.text != text)
            continue;
        const Fact fact = row.read(root_);
        device.*text = fact.text;
        device.reasons.erase(row.key);
        if (!fact.text)
            device.reasons[row.key] = fact.reason;
    }
}

void HostFiles::ReadStorage(Device& device) const
{
    struct statvfs storage
    {
    };
    if (statvfs((root_ + "/home").c_str(), &storage) != 0 && statvfs((root_ + "/").c_str(), &storage) != 0)
        storage = {};
    device.blockSize = static_cast<std::uint32_t>(storage.f_frsize); // which free blocks are counted in
    device.blocksAvailable = storage.f_bavail;
}

bool HostFiles::ReadPackage(Device& device, const std::string& id) const
{
    using Mapped = std::unique_ptr<GMappedFile, decltype(&g_mapped_file_unref)>;
    const Mapped file(g_mapped_file_new((root_ + "/var/lib/dpkg/status").c_str(), FALSE, nullptr), g_mapped_file_unref);
    if (file == nullptr)
        return false;

    const std::string_view status(g_mapped_file_get_contents(file.get()), g_mapped_file_get_length(file.get()));
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
