#include "DeviceFields.h"

#include "FieldValues.h"
#include "SourceControl.h"
#include "Suggestion.h"

#include <algorithm>
#include <iterator>
#include <limits>
#include <variant>

namespace kiv::platform
{

namespace
{

template <class Owner>
using Member = std::variant<bool Owner::*, int Owner::*, std::uint32_t Owner::*, std::uint64_t Owner::*, std::string Owner::*,
    std::vector<int> Owner::*, std::optional<int> Owner::*, std::optional<std::int64_t> Owner::*, Text Owner::*>;

template <class Owner>
struct Field
{
    const char* group;
    const char* key;
    Member<Owner> member;
    Limits limits;
    const char* meaning;
};

// clang-format off
constexpr Word kFontSizes[] = {{0, "small"}, {1, "normal"}, {2, "large"}, {3, "huge"}, {4, "giant"}};
constexpr Word kSwitch[] = {{0, "off"}, {1, "on"}};
constexpr Word kConnection[] = {{0, "off"}, {1, "disconnected"}, {2, "connected"}};
constexpr Word kCellular[] = {{0, "out-of-service"}, {1, "flight-mode"}, {2, "roaming"}, {3, "calls-only"}, {4, "available"},
    {5, "connected"}};
constexpr Word kWifiConnection[] = {{-1, "failure"}, {0, "disconnected"}, {1, "associating"}, {2, "configuring"}, {3, "connected"}};
constexpr Word kSlot[] = {{-1, "unknown"}};
constexpr Word kCard[] = {{0, "card-error"}, {1, "no-card"}, {2, "initialising"}, {3, "ready"}, {4, "pin-required"},
    {5, "puk-required"}, {6, "card-blocked"}, {7, "network-key-required"}, {8, "network-subset-key-required"},
    {9, "provider-key-required"}, {10, "corporate-key-required"}, {11, "card-removed"}, {12, "sim-lock-required"},
    {13, "card-crashed"}, {14, "card-powered-off"}, {255, "not-known-yet"}};
constexpr Word kSimState[] = {{0, "unavailable"}, {1, "locked"}, {2, "available"}, {3, "unknown"}};
constexpr Word kService[] = {{0, "in-service"}, {1, "out-of-service"}, {2, "emergency-only"}};
constexpr Word kServiceType[] = {{0, "unknown"}, {1, "none"}, {2, "emergency-only"}, {3, "searching"}};
constexpr Word kReady[] = {{0, "not-ready"}, {1, "ready"}};

constexpr std::int64_t kMost = std::numeric_limits<std::int64_t>::max();
constexpr Limits kYesNo{};
constexpr Limits kAnyText{0, 255};
constexpr Limits kSlotNumber = UpTo(7, kSlot);

const Field<Device> kDeviceFields[] = {
    {"profile",   "description",      &Device::description,         {1, 120},                "description of the device in one line"},
    {"telephony", "available",        &Device::telephony,           kYesNo,                  "whether the device has modems"},
    {"telephony", "default-network",  &Device::defaultNetwork,      kSlotNumber,             "slot of the main SIM"},
    {"telephony", "preferred-voice",  &Device::preferredVoice,      kSlotNumber,             "slot for outgoing calls"},
    {"telephony", "default-data",     &Device::defaultData,         kSlotNumber,             "slot for mobile data"},
    {"device",    "tizen-id",         &Device::tizenId,             kAnyText,                "the platform's ID of this device"},
    {"device",    "platform-name",    &Device::platformName,        kAnyText,                "name of the platform"},
    {"device",    "platform-version", &Device::platformVersion,     kAnyText,                "version of the platform"},
    {"device",    "model-name",       &Device::modelName,           kAnyText,                "model"},
    {"device",    "sales-code",       &Device::salesCode,           kAnyText,                "sales code"},
    {"device",    "serial",           &Device::serial,              kAnyText,                "serial number of the board"},
    {"device",    "current-time",     &Device::currentTime,         {0, 253402300799},       "time of a stopped clock, in seconds since 1970"},
    {"settings",  "device-name",      &Device::deviceName,          kAnyText,                "name that the user gave the device"},
    {"settings",  "language",         &Device::language,            kAnyText,                "language and region, such as en_US"},
    {"settings",  "font-size",        &Device::fontSize,            OneOf(kFontSizes),       "font size"},
    {"settings",  "mobile-data",      &Device::mobileData,          kYesNo,                  "whether mobile data is allowed"},
    {"runtime",   "flight-mode",      &Device::flightMode,          kYesNo,                  "whether flight mode is on"},
    {"runtime",   "packet-data",      &Device::packetData,          kYesNo,                  "whether packet data is on"},
    {"runtime",   "data-roaming",     &Device::dataRoaming,         kYesNo,                  "whether data is allowed while roaming"},
    {"runtime",   "wifi-status",      &Device::wifiStatus,          OneOf(kConnection),      "Wi-Fi state in runtime_info"},
    {"network",   "cellular",         &Device::cellularState,       OneOf(kCellular),        "state of the cellular network"},
    {"network",   "wifi",             &Device::wifiState,           OneOf(kConnection),      "Wi-Fi state in net_connection"},
    {"network",   "bluetooth",        &Device::bluetoothState,      OneOf(kConnection),      "Bluetooth state"},
    {"network",   "wifi-device",      &Device::wifiDeviceState,     OneOf(kSwitch),          "state of the Wi-Fi device in wifi"},
    {"network",   "wifi-connection",  &Device::wifiConnectionState, OneOf(kWifiConnection),  "state of the Wi-Fi connection in wifi"},
    {"storage",   "block-size",       &Device::blockSize,           {1, 4294967295},         "bytes per block"},
    {"storage",   "blocks-available", &Device::blocksAvailable,     {0, kMost},              "blocks free for the user"},
};

const Field<SimSlot> kSlotFields[] = {
    {kSlotGroup, "cp-name",       &SimSlot::cpName,       {1, 63},                "name of the modem"},
    {kSlotGroup, "card-status",   &SimSlot::cardStatus,   UpTo(255, kCard),       "status of the card; several for successive reads, of which the last one stays"},
    {kSlotGroup, "sim-state",     &SimSlot::simState,     OneOf(kSimState),       "state of the SIM (default: as the card status implies)"},
    {kSlotGroup, "mcc",           &SimSlot::mcc,          {3, 3, true},           "mobile country code"},
    {kSlotGroup, "mnc",           &SimSlot::mnc,          {2, 3, true},           "mobile network code"},
    {kSlotGroup, "msin",          &SimSlot::msin,         {1, 10, true},          "number of the subscriber within the network"},
    {kSlotGroup, "number",        &SimSlot::number,       {0, 31},                "subscriber number"},
    {kSlotGroup, "imei",          &SimSlot::imei,         {15, 15, true},         "IMEI of the modem"},
    {kSlotGroup, "service-state", &SimSlot::serviceState, OneOf(kService),        "registration of the modem in telephony"},
    {kSlotGroup, "roaming",       &SimSlot::roaming,      kYesNo,                 "whether the SIM is roaming"},
    {kSlotGroup, "service-type",  &SimSlot::serviceType,  UpTo(15, kServiceType), "service of the modem; from 4 on, the generation of the network"},
    {kSlotGroup, "sms-status",    &SimSlot::smsStatus,    OneOf(kReady),          "whether the modem is ready for text messages"},
};
// clang-format on

constexpr int kMostSlots = 8;
constexpr const char* kPackages = "packages"; // a key for each package ID
constexpr const char* kFaults = "faults";     // a key for each function, optionally with "@" and the number of a call
constexpr Limits kFaultCode{std::numeric_limits<int>::min(), std::numeric_limits<int>::max()};

constexpr Call kCalls[] = {
#define CALL(name) Call::name,
#include "calls.inc"
#undef CALL
};

template <class Owner, std::size_t count>
std::vector<std::string> KeysOf(const Field<Owner> (&fields)[count], const std::string& group)
{
    std::vector<std::string> keys;
    for (const Field<Owner>& field : fields)
        if (group == field.group)
            keys.emplace_back(field.key);
    return keys;
}

std::string Joined(const std::vector<std::string>& words)
{
    std::string text;
    for (const std::string& word : words)
        text += (text.empty() ? "" : ", ") + word;
    return text;
}

std::vector<std::string> WordsOf(const Limits& limits)
{
    std::vector<std::string> words;
    std::transform(
        limits.words, limits.words + limits.wordCount, std::back_inserter(words), [](const Word& word) { return word.text; });
    return words;
}

std::string Wrong(const std::string& value, const std::string& expected, const std::vector<std::string>& words = {})
{
    return "\"" + value + "\" is invalid; expected " + expected + DidYouMean(value, words);
}

template <class Owner>
std::string Describe(const Field<Owner>& field)
{
    return std::visit([&](auto member) { return platform::Describe(Owner{}.*member, field.limits); }, field.member);
}

template <class Owner>
Text Format(const Owner& owner, const Field<Owner>& field)
{
    return std::visit([&](auto member) { return platform::Format(owner.*member, field.limits); }, field.member);
}

/// The value without the key.
template <class Owner>
std::string DefaultOf(const Field<Owner>& field)
{
    if (std::holds_alternative<std::string Owner::*>(field.member))
        return "required";
    return Format(Owner{}, field).value_or("none");
}

template <class Owner, std::size_t count>
void StoreIn(Owner& owner, const Field<Owner> (&fields)[count], const std::string& fieldGroup, const std::string& file,
    const std::string& group, const std::string& key, const std::string& value)
{
    const auto field = std::find_if(std::begin(fields), std::end(fields),
        [&](const Field<Owner>& candidate) { return fieldGroup == candidate.group && key == candidate.key; });
    if (field == std::end(fields))
    {
        const std::vector<std::string> keys = KeysOf(fields, fieldGroup);
        Fail(file, group, key, "no such key; keys are " + Joined(keys) + DidYouMean(key, keys));
    }
    if (!std::visit([&](auto member) { return Parse(value, field->limits, owner.*member); }, field->member))
        Fail(file, group, key, Wrong(value, Describe(*field), WordsOf(field->limits)));
}

void StoreFault(Device& device, const std::string& file, const std::string& key, const std::string& value)
{
    const std::size_t at = key.find('@');
    const std::string name = key.substr(0, at);
    const auto call = std::find_if(std::begin(kCalls), std::end(kCalls), [&](Call candidate) { return name == NameOf(candidate); });
    if (call == std::end(kCalls))
    {
        std::vector<std::string> names;
        std::transform(std::begin(kCalls), std::end(kCalls), std::back_inserter(names), NameOf);
        Fail(file, kFaults, key, "no such function of the platform" + DidYouMean(name, names));
    }
    BrokenCall fault{*call, 0};
    const Limits numbers{1, 1'000'000};
    if (at != key.npos && !Parse(key.substr(at + 1), numbers, fault.number))
        Fail(file, kFaults, key, Wrong(key.substr(at), "@ and " + platform::Describe(fault.number, numbers)));
    if (!Parse(value, kFaultCode, fault.code) || fault.code == 0)
        Fail(file, kFaults, key, Wrong(value, platform::Describe(fault.code, kFaultCode) + ", but not 0"));
    device.faults.push_back(fault);
}

SimSlot* SlotOf(Device& device, const std::string& group)
{
    for (std::size_t slot = 0; slot < device.slots.size(); ++slot)
        if (group == kSlotGroup + std::to_string(slot))
            return &device.slots[slot];
    return nullptr;
}

template <class Owner, std::size_t count>
void List(const Field<Owner> (&fields)[count], const char* groupEnd, std::vector<FieldInfo>& all)
{
    for (const Field<Owner>& field : fields)
    {
        const bool isYesNo = std::holds_alternative<bool Owner::*>(field.member);
        all.push_back({std::string(field.group) + groupEnd, field.key, Describe(field), DefaultOf(field), field.meaning,
            isYesNo ? std::vector<std::string>{"true", "false"} : WordsOf(field.limits)});
    }
}

template <class Owner, std::size_t count>
void ListValues(const Owner& owner, const Field<Owner> (&fields)[count], const std::string& groupEnd, std::vector<FieldValue>& all)
{
    for (const Field<Owner>& field : fields)
        all.push_back({field.group + groupEnd + "." + field.key, Format(owner, field)});
}

} // namespace

void Fail(const std::string& file, const std::string& group, const std::string& key, const std::string& what)
{
    throw DeviceFileError(file + ": [" + group + "]" + (key.empty() ? "" : " " + key) + ": " + what);
}

void AddGroup(Device& device, const std::string& file, const std::string& group)
{
    if (group == kPackages || group == kFaults || !KeysOf(kDeviceFields, group).empty())
        return;
    const std::string prefix = kSlotGroup;
    if (group.rfind(prefix, 0) != 0)
    {
        Fail(file, group, "",
            "no such group; groups are profile, telephony, sim0, ..., device, settings, runtime, network, storage, packages, "
            "faults" +
                DidYouMean(group,
                    {"profile", "telephony", "sim0", "device", "settings", "runtime", "network", "storage", kPackages, kFaults}));
    }
    std::uint32_t slot = 0;
    const std::string number = group.substr(prefix.size());
    if (!Parse(number, {0, kMostSlots - 1}, slot) || number != std::to_string(slot))
        Fail(file, group, "", "no such group; slots are sim0 to sim" + std::to_string(kMostSlots - 1));
    // A slot may come before lower ones; a missing slot is found later, because it has no CP name.
    if (slot >= device.slots.size())
        device.slots.resize(slot + 1U);
}

void Store(Device& device, const std::string& file, const std::string& group, const std::string& key, const std::string& value)
{
    if (group == kPackages)
        device.packages[key] = value;
    else if (group == kFaults)
        StoreFault(device, file, key, value);
    else if (SimSlot* const slot = SlotOf(device, group))
        StoreIn(*slot, kSlotFields, kSlotGroup, file, group, key, value);
    else
        StoreIn(device, kDeviceFields, group, file, group, key, value);
}

std::vector<FieldInfo> ListFields()
{
    std::vector<FieldInfo> all;
    List(kDeviceFields, "", all);
    List(kSlotFields, "0", all);
    all.push_back({kPackages, "PACKAGE-ID", "text", "none", "version of an installed package", {}});
    all.push_back({kFaults, "FUNCTION", "an error code", "none",
        "result of this platform function, which then does nothing else; FUNCTION@2: only of its second call", {}});
    return all;
}

std::vector<FieldValue> ListValues()
{
    const Device device = GetDevice();
    std::vector<FieldValue> all;
    ListValues(device, kDeviceFields, "", all);
    for (std::size_t slot = 0; slot < device.slots.size(); ++slot)
        ListValues(device.slots[slot], kSlotFields, std::to_string(slot), all);
    for (const auto& [package, version] : device.packages)
        all.push_back({std::string(kPackages) + "." + package, version});
    for (const BrokenCall& fault : device.faults)
    {
        const std::string number = fault.number == 0 ? "" : "@" + std::to_string(fault.number);
        all.push_back({std::string(kFaults) + "." + NameOf(fault.call) + number, std::to_string(fault.code)});
    }
    return all;
}

} // namespace kiv::platform
