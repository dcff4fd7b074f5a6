#include "DeviceFile.h"

#include "SourceControl.h"

#include <algorithm>
#include <charconv>
#include <glib.h>
#include <limits>
#include <memory>
#include <variant>

namespace kiv::platform
{

namespace
{

// Bounds of a number, or of the length of a text.
struct Limits
{
    std::int64_t low = 0;
    std::int64_t high = 0;
    bool digits = false; // of a text
};

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

constexpr std::int64_t kMost = std::numeric_limits<std::int64_t>::max();
constexpr Limits kYesNo{};
constexpr Limits kAnyText{0, 255};
constexpr Limits kSlotNumber{-1, 7};

// clang-format off
const Field<Device> kDeviceFields[] = {
    {"profile",   "description",      &Device::description,         {1, 120},            "the device in one line"},
    {"telephony", "available",        &Device::telephony,           kYesNo,              "whether there are modems at all"},
    {"telephony", "default-network",  &Device::defaultNetwork,      kSlotNumber,         "slot of the main SIM, -1 unknown"},
    {"telephony", "preferred-voice",  &Device::preferredVoice,      kSlotNumber,         "slot that calls go out on, -1 unknown"},
    {"telephony", "default-data",     &Device::defaultData,         kSlotNumber,         "slot that carries mobile data, -1 unknown"},
    {"device",    "tizen-id",         &Device::tizenId,             kAnyText,            "the platform's ID of this device"},
    {"device",    "platform-name",    &Device::platformName,        kAnyText,            "name of the platform"},
    {"device",    "platform-version", &Device::platformVersion,     kAnyText,            "version of the platform"},
    {"device",    "model-name",       &Device::modelName,           kAnyText,            "model"},
    {"device",    "sales-code",       &Device::salesCode,           kAnyText,            "sales code"},
    {"device",    "serial",           &Device::serial,              kAnyText,            "serial number of the board"},
    {"device",    "current-time",     &Device::currentTime,         {0, 253402300799},   "seconds since 1970, for a clock that stands"},
    {"settings",  "device-name",      &Device::deviceName,          kAnyText,            "name that the user gave the device"},
    {"settings",  "language",         &Device::language,            kAnyText,            "language and region, such as en_US"},
    {"settings",  "font-size",        &Device::fontSize,            {0, 4},              "0 small, 1 normal, 2 large, 3 huge, 4 giant"},
    {"settings",  "mobile-data",      &Device::mobileData,          kYesNo,              "whether mobile data is allowed"},
    {"runtime",   "flight-mode",      &Device::flightMode,          kYesNo,              "whether flight mode is on"},
    {"runtime",   "packet-data",      &Device::packetData,          kYesNo,              "whether packet data is on"},
    {"runtime",   "data-roaming",     &Device::dataRoaming,         kYesNo,              "whether data is allowed abroad"},
    {"runtime",   "wifi-status",      &Device::wifiStatus,          {0, 2},              "0 off, 1 not connected, 2 connected"},
    {"network",   "cellular",         &Device::cellularState,       {0, 5},
        "0 out of service, 1 flight mode, 2 roaming, 3 calls only, 4 available, 5 connected"},
    {"network",   "wifi",             &Device::wifiState,           {0, 2},              "0 off, 1 not connected, 2 connected"},
    {"network",   "bluetooth",        &Device::bluetoothState,      {0, 2},              "0 off, 1 not connected, 2 connected"},
    {"network",   "wifi-device",      &Device::wifiDeviceState,     {0, 1},              "0 off, 1 on"},
    {"network",   "wifi-connection",  &Device::wifiConnectionState, {-1, 3},
        "-1 failed, 0 not connected, 1 associating, 2 getting an address, 3 connected"},
    {"storage",   "block-size",       &Device::blockSize,           {1, 4294967295},     "bytes in a block"},
    {"storage",   "blocks-available", &Device::blocksAvailable,     {0, kMost},          "blocks free for the user"},
};

constexpr const char* kSlotGroup = "sim"; // and the number of the slot
const Field<SimSlot> kSlotFields[] = {
    {kSlotGroup, "cp-name",       &SimSlot::cpName,       {1, 63},            "name of the modem"},
    {kSlotGroup, "card-status",   &SimSlot::cardStatus,   {0, 255},
        "over successive reads, the last one stays: 1 no card, 2 initialising, 3 ready, 4 PIN required, 5 PUK required, 6 blocked, ..."},
    {kSlotGroup, "sim-state",     &SimSlot::simState,     {0, 3},
        "0 none, 1 locked, 2 available, 3 unknown; without it, as the card status has it"},
    {kSlotGroup, "mcc",           &SimSlot::mcc,          {3, 3, true},       "mobile country code"},
    {kSlotGroup, "mnc",           &SimSlot::mnc,          {2, 3, true},       "mobile network code"},
    {kSlotGroup, "msin",          &SimSlot::msin,         {1, 10, true},      "subscriber within the network"},
    {kSlotGroup, "number",        &SimSlot::number,       {0, 31},            "subscriber number"},
    {kSlotGroup, "imei",          &SimSlot::imei,         {15, 15, true},     "number of the modem"},
    {kSlotGroup, "service-state", &SimSlot::serviceState, {0, 2},             "0 in service, 1 out of service, 2 emergency only"},
    {kSlotGroup, "roaming",       &SimSlot::roaming,      kYesNo,             "whether the network is a foreign one"},
    {kSlotGroup, "service-type",  &SimSlot::serviceType,  {0, 15},
        "0 unknown, 1 none, 2 emergency only, 3 searching, 4 and above service of increasing generation"},
    {kSlotGroup, "sms-status",    &SimSlot::smsStatus,    {0, 1},             "1 when ready for text messages"},
};
// clang-format on

constexpr const char* kPackages = "packages"; // a key for each package ID
constexpr int kMostSlots = 8;

// What a value of the type may be, in words.
std::string ValuesOf(bool /*type*/, const Limits& /*limits*/)
{
    return "true or false";
}

template <class Number, std::enable_if_t<std::is_integral_v<Number>, int> = 0>
std::string ValuesOf(Number /*type*/, const Limits& limits)
{
    return "a number from " + std::to_string(limits.low) + " to " + std::to_string(limits.high);
}

std::string ValuesOf(const std::string& /*type*/, const Limits& limits)
{
    const std::string most = std::to_string(limits.high);
    const std::string length = limits.low == limits.high ? most : std::to_string(limits.low) + " to " + most;
    return length + (limits.digits ? " digits" : " bytes of text");
}

std::string ValuesOf(const std::vector<int>& /*type*/, const Limits& limits)
{
    return ValuesOf(0, limits) + ", or several with ; between them";
}

template <class Value>
std::string ValuesOf(const std::optional<Value>& /*type*/, const Limits& limits)
{
    return ValuesOf(Value{}, limits);
}

// Whether the text is a value of the type.
bool Parse(const std::string& text, const Limits& /*limits*/, bool& value)
{
    value = text == "true";
    return value || text == "false";
}

template <class Number, std::enable_if_t<std::is_integral_v<Number>, int> = 0>
bool Parse(const std::string& text, const Limits& limits, Number& value)
{
    std::int64_t number = 0;
    const char* const end = text.data() + text.size();
    const auto [stop, error] = std::from_chars(text.data(), end, number);
    if (error != std::errc() || stop != end || number < limits.low || number > limits.high)
        return false;
    value = static_cast<Number>(number);
    return true;
}

bool Parse(const std::string& text, const Limits& limits, std::string& value)
{
    value = text;
    const auto length = static_cast<std::int64_t>(text.size());
    const bool fits = length >= limits.low && length <= limits.high;
    return fits && (!limits.digits || text.find_first_not_of("0123456789") == std::string::npos);
}

bool Parse(const std::string& text, const Limits& limits, std::vector<int>& value)
{
    value.clear();
    std::size_t start = 0;
    for (std::size_t stop = 0; stop != std::string::npos; start = stop + 1)
    {
        stop = text.find(';', start);
        if (!Parse(text.substr(start, stop - start), limits, value.emplace_back()))
            return false;
    }
    return true;
}

template <class Value>
bool Parse(const std::string& text, const Limits& limits, std::optional<Value>& value)
{
    return Parse(text, limits, value.emplace());
}

template <class Owner>
std::string ValuesOf(const Field<Owner>& field)
{
    const Owner owner{};
    return std::visit([&](auto member) { return ValuesOf(owner.*member, field.limits); }, field.member);
}

// What stands for a key that the file leaves out, in words.
std::string DefaultOf(const std::string& /*value*/)
{
    return "required";
}

std::string DefaultOf(bool value)
{
    return value ? "true" : "false";
}

template <class Number, std::enable_if_t<std::is_integral_v<Number>, int> = 0>
std::string DefaultOf(Number value)
{
    return std::to_string(value);
}

std::string DefaultOf(const std::vector<int>& value)
{
    return DefaultOf(value.back());
}

template <class Value>
std::string DefaultOf(const std::optional<Value>& value)
{
    return value ? DefaultOf(*value) : "none";
}

template <class Owner>
std::string DefaultOf(const Field<Owner>& field)
{
    const Owner owner{};
    return std::visit([&](auto member) { return DefaultOf(owner.*member); }, field.member);
}

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
        for (char** group = groups.get(); *group; ++group)
            ReadGroup(*group, device);
        if (device.description.empty())
            Fail("profile", "description", "missing; " + ValuesOf(kDeviceFields[0]) + " are needed");
        for (std::size_t slot = 0; slot < device.slots.size(); ++slot)
            Check(device.slots, slot);
        return device;
    }

private:
    [[noreturn]] void Fail(const std::string& group, const std::string& key, const std::string& what) const
    {
        throw DeviceFileError(name_ + ": [" + group + "]" + (key.empty() ? "" : " " + key) + ": " + what);
    }

    void ReadGroup(const std::string& group, Device& device)
    {
        const OwnedList keys(g_key_file_get_keys(file_, group.c_str(), nullptr, nullptr), g_strfreev);
        if (group == kPackages)
        {
            for (char** key = keys.get(); *key; ++key)
                device.packages[*key] = Value(group, *key);
            return;
        }
        if (group.rfind(kSlotGroup, 0) == 0)
            return ReadKeys(group, kSlotGroup, keys.get(), kSlotFields, SlotOf(group, device));
        ReadKeys(group, group, keys.get(), kDeviceFields, device);
    }

    // The slots of the file make room for themselves; whether one is missing shows in its CP name.
    SimSlot& SlotOf(const std::string& group, Device& device) const
    {
        std::uint32_t slot = 0;
        const Limits limits{0, kMostSlots - 1};
        const std::string number = group.substr(std::string(kSlotGroup).size());
        if (!Parse(number, limits, slot) || number != std::to_string(slot))
            Fail(group, "", "no such group; slots are sim0 to sim" + std::to_string(kMostSlots - 1));
        if (slot >= device.slots.size())
            device.slots.resize(slot + 1U);
        return device.slots[slot];
    }

    template <class Owner, std::size_t count>
    void ReadKeys(const std::string& group, const std::string& tableGroup, char** keys, const Field<Owner> (&fields)[count],
        Owner& owner) const
    {
        std::string known;
        for (const Field<Owner>& field : fields)
            if (tableGroup == field.group)
                known += (known.empty() ? "" : ", ") + std::string(field.key);
        if (known.empty())
            Fail(group, "",
                "no such group; groups are profile, telephony, sim0, ..., device, settings, runtime, network, storage, packages");

        for (; *keys; ++keys)
        {
            const Field<Owner>* found = nullptr;
            for (const Field<Owner>& field : fields)
                if (tableGroup == field.group && g_str_equal(field.key, *keys))
                    found = &field;
            if (!found)
                Fail(group, *keys, "no such key; keys are " + known);

            const std::string text = Value(group, *keys);
            if (!std::visit([&](auto member) { return Parse(text, found->limits, owner.*member); }, found->member))
                Fail(group, *keys, "\"" + text + "\" is wrong; " + ValuesOf(*found) + " would be right");
        }
    }

    std::string Value(const std::string& group, const std::string& key) const
    {
        g_autoptr(GError) error = nullptr; // may come with a value
        const Owned value(g_key_file_get_string(file_, group.c_str(), key.c_str(), &error), g_free);
        if (error)
            Fail(group, key, "not UTF-8, or a backslash that escapes nothing; \\\\ is a backslash");
        return value.get();
    }

    void Check(const std::vector<SimSlot>& slots, std::size_t slot) const
    {
        const std::string group = kSlotGroup + std::to_string(slot);
        const SimSlot& sim = slots[slot];
        if (sim.cpName.empty())
            Fail(group, "cp-name", "missing; every slot up to the last one has a name of its own");
        for (std::size_t other = 0; other < slot; ++other)
            if (slots[other].cpName == sim.cpName)
                Fail(
                    group, "cp-name", "\"" + sim.cpName + "\" is that of sim" + std::to_string(other) + "; every slot has its own");
        if (sim.mcc.has_value() != sim.mnc.has_value() || sim.mcc.has_value() != sim.msin.has_value())
            Fail(group, !sim.mcc ? "mcc" : !sim.mnc ? "mnc" : "msin", "missing; mcc, mnc and msin stand together or not at all");
        if (sim.mcc && sim.mcc->size() + sim.mnc->size() + sim.msin->size() > 15)
            Fail(group, "msin", "too long; mcc, mnc and msin are 15 digits at most");
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
            name + ": \"" + assignment + "\" sets nothing; GROUP.KEY=VALUE is needed, such as runtime.flight-mode=true");

    const std::string group = assignment.substr(0, dot);
    const std::string key = assignment.substr(dot + 1, equals - dot - 1);
    const std::string value = assignment.substr(equals + 1);
    const std::string both = group + key;
    const auto isControl = [](char ch) { return g_ascii_iscntrl(ch) != FALSE; };
    if (both.find_first_of("[]") != std::string::npos || key.find(' ') != std::string::npos ||
        std::any_of(both.begin(), both.end(), isControl))
        throw DeviceFileError(
            name + ": \"" + assignment + "\" has a group or a key with a bracket, a blank or a control character in it");
    if (!g_utf8_validate(assignment.data(), static_cast<gssize>(assignment.size()), nullptr))
        throw DeviceFileError(name + ": [" + group + "] " + key + ": the value is not UTF-8");
    g_key_file_set_string(file, group.c_str(), key.c_str(), value.c_str());
}

template <class Owner, std::size_t count>
void List(const Field<Owner> (&fields)[count], const char* groupEnd, std::vector<FieldInfo>& all)
{
    for (const Field<Owner>& field : fields)
        all.push_back({std::string(field.group) + groupEnd, field.key, ValuesOf(field), DefaultOf(field), field.meaning});
}

} // namespace

Device ReadDevice(const std::string& text, const std::string& name)
{
    return Reader(Load(text, name).get(), name).Read();
}

std::string ChangeText(const std::string& text, const std::string& name, const std::vector<std::string>& assignments)
{
    const KeyFile file = Load(text, name);
    for (const std::string& assignment : assignments)
        Assign(file.get(), name, assignment);
    const Owned changed(g_key_file_to_data(file.get(), nullptr, nullptr), g_free);
    ReadDevice(changed.get(), name);
    return changed.get();
}

std::string ReadFile(const std::string& path)
{
    g_autoptr(GError) error = nullptr;
    g_autofree char* text = nullptr;
    gsize length = 0;
    if (!g_file_get_contents(path.c_str(), &text, &length, &error))
        throw DeviceFileError(path + ": " + error->message);
    return {text, length};
}

std::vector<FieldInfo> ListFields()
{
    std::vector<FieldInfo> all;
    List(kDeviceFields, "", all);
    List(kSlotFields, "0", all);
    all.push_back({kPackages, "PACKAGE-ID", "text", "none", "version of an installed package"});
    return all;
}

} // namespace kiv::platform
