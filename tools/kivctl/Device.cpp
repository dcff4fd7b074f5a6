#include "Bus.h"
#include "LibraryLog.h"
#include "Verbs.h"

#include <DASystem.h>
#include <DeviceControl.h>
#include <ResultCode.h>
#include <glib.h>

#include <algorithm>
#include <array>

namespace
{

using kiv::platform::ReasonFor;

/// Says why a value is missing.
/// @param key  of the device file, for which the device may know the reason
std::string WhyMissing(const char* key, int code)
{
    const std::string reason = ReasonFor(key);
    return !reason.empty() ? reason
                           : "the platform does not provide it" + (code ? ", code " + std::to_string(code) : std::string());
}

/// @param read  stores a text and returns the platform's code
template <typename Read>
Field ReadText(const char* name, const char* key, Read read)
{
    char* text = nullptr;
    const int code = read(&text);
    const LibraryText owner(text);
    return TextOr(name, text, WhyMissing(key, code));
}

Field ReadText(const char* name, const char* key, int (DASystem::*read)(char**))
{
    return ReadText(name, key, [read](char** text) { return (DASystem::GetInstance()->*read)(text); });
}

/// The device unique ID that the library returns. The caller owns the text, although its type is const.
struct DeviceId
{
    DeviceId() : code(DASystem::GetInstance()->GetDeviceUniqueID(&text)) {}
    DeviceId(const DeviceId&) = delete;
    DeviceId& operator=(const DeviceId&) = delete;
    ~DeviceId() { g_free(const_cast<char*>(text)); }

    const char* text = nullptr;
    const int code;
};

Field Serial()
{
    if (const BusState bus = TryBus(); bus.code != KIV_RESULT_SUCCESS)
        return Missing("serial", MeaningOf(bus.code));
    const DeviceId id;
    return TextOr("serial", id.text, id.code ? MeaningOf(id.code) : "the device daemon returned none");
}

/// The text that the library returns instead of an IMEI: the local time's offset from UTC, followed by zeros.
std::string ImeiFallback()
{
    const std::time_t now = std::time(nullptr);
    std::tm local{};
    localtime_r(&now, &local);
    std::string text = std::to_string(local.tm_gmtoff);
    text.resize(std::max<size_t>(text.size(), 15), '0');
    return text;
}

Field Imei(Identifiers identifiers)
{
    Field field = ReadText("imei", "", &DASystem::GetIMEI);
    if (field.value != Value(ImeiFallback()))
        return Masked(std::move(field), 0, 4, identifiers);
    field.note = "no modem answered; this is the UTC offset";
    return field;
}

Field FontSize()
{
    int size = 0;
    const int code = DASystem::GetInstance()->GetFontSize(&size);
    return code ? Missing("font_size", WhyMissing("settings.font-size", code)) : Field{"font_size", std::int64_t{size}};
}

Field CurrentTime()
{
    std::tm now{};
    if (const int code = DASystem::GetInstance()->GetCurrentTime(&now))
        return Missing("time", WhyMissing("", code));
    std::array<char, 32> text{};
    std::strftime(text.data(), text.size(), "%Y-%m-%d %H:%M:%S", &now);
    return {"time", std::string(text.data())};
}

enum class LanguageCode
{
    Plain,
    Iso639
};

Field Language(const char* name, LanguageCode which)
{
    char* text = nullptr;
    const int code = DASystem::GetInstance()->GetDeviceLanguageCode(&text, which == LanguageCode::Iso639);
    const LibraryText owner(text);
    Field field = TextOr(name, text, "unknown for this language");
    if (code)
        field.note = "default, because the setting cannot be read, code " + std::to_string(code);
    return field;
}

void AppendPackage(Record& record, std::string package)
{
    DASystem* const system = DASystem::GetInstance();
    record.push_back({"package", package});
    record.push_back({"package_installed", system->IsPackageInstalled(package.data())});
    record.push_back(
        ReadText("package_version", "", [&](char** version) { return system->GetPackageVersion(package.c_str(), version); }));
}

} // namespace

Exit ShowDevice(const DeviceOptions& options, const Command& command)
{
    DASystem* const system = DASystem::GetInstance();
    const auto salesCode = [system](char** code)
    {
        *code = system->GetCSC();
        return 0;
    };
    Record record{
        ReadText("name", "settings.device-name", &DASystem::GetDeviceName),
        ReadText("model", "device.model-name", &DASystem::GetModelName),
        ReadText("platform", "device.platform-name", &DASystem::GetPlatformName),
        ReadText("platform_version", "device.platform-version", &DASystem::GetSWVersion),
        Masked(ReadText("platform_device_id", "device.tizen-id", &DASystem::GetTizenIdN), 0, 4, command.identifiers),
        Masked(Serial(), 0, 4, command.identifiers),
        Imei(command.identifiers),
        ReadText("sales_code", "device.sales-code", salesCode),
        Language("language", LanguageCode::Plain),
        Language("language_iso639", LanguageCode::Iso639),
        CurrentTime(),
        FontSize(),
        {"flight_mode", system->IsFlightMode(), ReasonFor("runtime.flight-mode")},
        {"mobile_data", system->IsMobileData(), ReasonFor("settings.mobile-data")},
        {"data_roaming", system->IsDataRoamingEnabled(), ReasonFor("runtime.data-roaming")},
        {"storage_needed_mib", options.storageMiB},
        {"storage_suffices", system->IsSystemMemoryAvailable(options.storageMiB)},
    };
    if (options.package)
        AppendPackage(record, *options.package);
    Print(record, command.form);
    return Exit::Done;
}

Exit ShowDeviceId(const Command& command)
{
    const BusConnection connection = RequireBus();
    const LibraryLog log;
    const DeviceId id;
    RequireSuccess(id.code, log.Errors());
    if (!id.text)
        throw Failure(Exit::No, "the device daemon replied without a serial number");
    Print({{"device_id", std::string(id.text)}}, command.form);
    return Exit::Done;
}
