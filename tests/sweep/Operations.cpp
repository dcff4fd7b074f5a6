#include "sweep/Operations.h"

#include <DAConnectionManager.h>
#include <DADBusManager.h>
#include <DASimManager.h>
#include <DASubscriberStore.h>
#include <DASystem.h>

#include <cstring>
#include <cxxabi.h>
#include <dlfcn.h>

namespace kiv::test
{

namespace
{

using Text = const char*;
using Slots = telephony_handle_list_s;
using Status = TelSimCardStatus_t;

// Arguments and results, by their types ------------------------------------------------------------------------------------------

/// What goes into the parameters of an operation: its texts, its numbers.
struct Given
{
    Text text = "";
    double number = 0;
    bool keepsTexts = false; ///< the texts that come out are the library's
};

template <class... Values>
std::string Tell(const Values&... values)
{
    std::ostringstream text;
    text << std::boolalpha;
    ((text << ' ' << values), ...);
    return text.str();
}

char before[] = "before"; ///< what a text is that is to be written

/// Tells a text that came out, and frees it.
std::string Take(Text text)
{
    const std::string told = text == nullptr ? "null" : text;
    if (text != before)
        std::free(const_cast<char*>(text));
    return ' ' + told;
}

template <class Type, class... Others>
constexpr bool kIsOneOf = (std::is_same_v<Type, Others> || ...);
template <class Type>
constexpr bool kIsNumber = std::is_arithmetic_v<Type> || std::is_enum_v<Type>;
template <class Type>
constexpr bool kIsTextIn = kIsOneOf<Type, std::string, Text, char*>;
template <class Type>
constexpr bool kIsTextOut = kIsOneOf<Type, char**, Text*, Text&>;
template <class Type>
constexpr bool kIsHandles = kIsOneOf<Type, Slots, telephony_data**>;
template <class Type>
using Target = std::conditional_t<std::is_reference_v<Type>, std::remove_reference_t<Type>, std::remove_pointer_t<Type>>;
template <class Type>
using Held = std::conditional_t<kIsTextIn<Type>, std::string, std::conditional_t<kIsHandles<Type>, Slots, Target<Type>>>;

/// What is passed for a parameter.
template <class Type>
struct Argument
{
    Argument(const Given& given, const Session& session) : keepsTexts(given.keepsTexts)
    {
        if constexpr (kIsNumber<Type>)
            value = static_cast<Type>(given.number);
        else if constexpr (kIsTextIn<Type>)
            value = given.text;
        else if constexpr (kIsHandles<Type>)
            value = session.given;
        else if constexpr (kIsTextOut<Type> || kIsOneOf<Type, std::string*>)
            value = before;
        else if constexpr (kIsOneOf<Type, std::vector<char*>*>)
            value = {before};
        else if constexpr (kIsOneOf<Type, bool*>)
            value = true;
        else if constexpr (kIsOneOf<Type, tm*>)
            value.tm_year = 1;
    }

    Type Pass()
    {
        if constexpr (kIsOneOf<Type, Text, char*>)
            return value.data();
        else if constexpr (kIsOneOf<Type, telephony_data**>)
            return value.handle;
        else if constexpr (std::is_pointer_v<Type>)
            return &value;
        else
            return value;
    }

    /// What came out. A number that the platform writes counts after a success alone.
    std::string TellOut(bool isDone) const
    {
        std::string told;
        if constexpr (kIsTextOut<Type>)
            told = keepsTexts ? Tell(value == nullptr ? "null" : value) : Take(value);
        else if constexpr (kIsOneOf<Type, tm*>)
            told = Tell(value.tm_year, value.tm_mon, value.tm_mday, value.tm_hour, value.tm_min, value.tm_sec, value.tm_wday,
                value.tm_yday);
        else if constexpr (kIsOneOf<Type, std::vector<char*>*>)
            for (char* const text : value)
                told += Take(text);
        else if constexpr (std::is_pointer_v<Type> && !kIsTextIn<Type> && !kIsHandles<Type>)
            told = isDone || kIsOneOf<Type, bool*, std::string*> ? Tell(value) : "";
        return told;
    }

    Held<Type> value{};
    bool keepsTexts;
};

template <class Result>
std::string TellResult(const Result& result)
{
    if constexpr (kIsOneOf<Result, char*>)
        return Take(result);
    if constexpr (!kIsOneOf<Result, char*, char**>)
        return Tell(result);
    if constexpr (kIsOneOf<Result, char**>)
    {
        g_auto(GStrv) names = result;
        g_autofree char* told = names == nullptr ? g_strdup("null") : g_strjoinv(" ", names);
        return Tell(told);
    }
}

/// Calls a member with arguments made for its parameters. @return its result and what came out, a blank before each
template <class Class, class Result, class... Parameters>
std::string CallMember(Result (Class::*member)(Parameters...), const Given& given, const Session& session)
{
    std::tuple<Argument<Parameters>...> arguments{Argument<Parameters>(given, session)...};
    const auto call = [&](auto&... each) -> std::string
    {
        if constexpr (std::is_void_v<Result>)
        {
            (Class::GetInstance()->*member)(each.Pass()...);
            return ("" + ... + each.TellOut(true));
        }
        else
        {
            const Result result = (Class::GetInstance()->*member)(each.Pass()...);
            const bool isDone = kIsOneOf<Result, bool> ? result != Result{} : result == Result{};
            return (TellResult(result) + ... + each.TellOut(isDone));
        }
    };
    return std::apply(call, arguments);
}

template <class Class, class Result, class... Parameters>
constexpr bool TakesHandle(Result (Class::*)(Parameters...))
{
    return kIsOneOf<telephony_data**, Parameters...>;
}

// The table ----------------------------------------------------------------------------------------------------------------------

/// The symbol of a member, readable: "DASystem::GetIMEI(char**)".
template <class Function>
std::string SymbolOf(Function function)
{
    void* address = nullptr;
    std::memcpy(&address, &function, sizeof address);
    Dl_info info{};
    const char* const symbol = dladdr(address, &info) == 0 ? nullptr : info.dli_sname;
    const std::unique_ptr<char, decltype(&std::free)> readable(abi::__cxa_demangle(symbol, nullptr, nullptr, nullptr), std::free);
    return readable ? readable.get() : "";
}

struct Table
{
    /// Adds a member under its very type.
    template <class Type, class Class>
    Table& Add(Type Class::*member, const Given& given, const Story& good)
    {
        const auto run = [member, given](Session& session) { return CallMember(member, given, session); };
        AddRun({SymbolOf(member)}, run, good);
        rows.back().needsHandle = TakesHandle(member);
        return *this;
    }

    /// Adds members that one function calls.
    Table& AddRun(std::vector<std::string> symbols, const std::function<std::string(Session&)>& run, const Story& good)
    {
        const std::string name = symbols[0];
        const auto withoutBlank = [run](Session& session)
        {
            const std::string told = run(session);
            return told.empty() ? told : told.substr(1);
        };
        rows.push_back({std::move(symbols), name, kind, lock, false, withoutBlank, Complete(name, good), {}, {}});
        return *this;
    }

    /// What the last one added comes to when one of these calls fails.
    Table& Fails(const Calls& calls, const Story& story)
    {
        rows.back().failing.push_back({calls, Complete(rows.back().name, story)});
        return *this;
    }

    void WithoutMemory(const std::vector<std::string>& results) { rows.back().noMemory = results; }

    /// Puts the place of a member into its own lines, which come as "E > text".
    Story Complete(const std::string& name, Story story) const
    {
        const std::size_t begin = name.find("::") + 2;
        for (std::size_t i = 1; i < story.size(); ++i)
            story[i].insert(1, story[i][2] == '>' ? ' ' + file + ' ' + name.substr(begin, name.find('(') - begin) : "");
        return story;
    }

    std::vector<Operation> rows;

    // of those that are added next
    std::string file = {}; ///< where lines of their own come from
    Kind kind = Kind::Single;
    SimLock lock = SimLock::AroundReads;
};

const Calls kOpen{Call::telephony_init}, kState{Call::telephony_sim_get_state}, kNumber{Call::telephony_sim_get_subscriber_number},
    kImsi{Call::tel_get_cp_name_list, Call::tel_init, Call::tel_get_sim_imsi};
const std::string kNotOpened = "E DASimManager.cpp SuccessToInitTelephonyHandle > telephony_init Failed.";
const std::string kNotAvailable = "E DASimManager.cpp IsSimAvailable > Sim is not available";

/// Hears of changes: what changed, and the new value.
struct Listener : IDAConnectionStateListener
{
    void OnWifiDeviceStateChanged(wifi_device_state_e state, void*) override { heard += Tell("device", state); }
    void OnWifiConnectionStateChanged(wifi_connection_state_e state, void*, void*) override { heard += Tell("connection", state); }
    void OnFlightModeChanged(bool enabled, void*) override { heard += Tell("flight", enabled); }
    void OnPacketDataChanged(bool enabled, void*) override { heard += Tell("packet", enabled); }
    void OnWifiConnectedChanged(bool connected, void*) override { heard += Tell("wifi", connected); }

    std::string heard;
};

template <class S>
std::string Listen(Session&)
{
    using C = DAConnectionManager;
    Listener listener;
    S::GetInstance()->SetConnectionEventListener(&listener, nullptr);
    for (const bool isOn : {false, true})
        platform::ChangeDevice([&](platform::Device& device) { device.packetData = isOn; });
    C::wifi_device_state_changed(WIFI_DEVICE_STATE_ACTIVATED, nullptr);
    C::wifi_connection_state_changed(WIFI_CONNECTION_STATE_CONNECTED, nullptr, nullptr);
    for (const auto key :
        {RUNTIME_INFO_KEY_WIFI_STATUS, RUNTIME_INFO_KEY_PACKET_DATA_ENABLED, RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED})
        C::OnConnectionStateChanged(key, nullptr);
    S::GetInstance()->SetConnectionEventListener(nullptr, nullptr);
    return listener.heard;
}

/// Connection states, of the facade as of its manager.
template <class S>
void AddConnection(Table& t)
{
    using C = DAConnectionManager;
    t.kind = Kind::Single;
    t.lock = SimLock::AroundReads;
    t.Add<int()>(&S::GetCellularNetworkState, {}, {"5"});
    t.Fails({Call::connection_create, Call::connection_get_cellular_state}, {"0"});
    t.Add<int()>(&S::GetWifiNetworkState, {}, {"1"}).Fails({Call::connection_create, Call::connection_get_wifi_state}, {"0"});
    t.Add<int()>(&S::GetBTNetworkState, {}, {"2"}).Fails({Call::connection_create, Call::connection_get_bt_state}, {"0"});
    t.kind = Kind::Walk;
    t.Add<bool(bool, bool)>(&S::IsNetworkConnected, {"", 1}, {"true"});
    t.kind = Kind::Listener;
    t.AddRun({SymbolOf<void (S::*)(IDAConnectionStateListener*, void*)>(&S::SetConnectionEventListener),
                 SymbolOf(&C::wifi_device_state_changed), SymbolOf(&C::wifi_connection_state_changed),
                 SymbolOf(&C::OnConnectionStateChanged)},
        Listen<S>, {"packet false packet true device 1 connection 3 wifi false packet true flight true"});
}

template <class S>
std::string OpenAndClose(Session& session)
{
    const bool isOpen = S::GetInstance()->InitHandleList(&session.left);
    const unsigned count = session.left.count;
    return Tell(isOpen, count, S::GetInstance()->DeinitHandleList(&session.left));
}

/// SIM queries by slot or modem, of the facade as of its manager.
template <class S>
void AddSim(Table& t)
{
    constexpr Call kNames = Call::tel_get_cp_name_list, kModem = Call::tel_init, kStatus = Call::tel_get_sim_init_info;
    const std::string enter = "I > Enter", reading = "I > Before telephony_sim_get_subscriber_number",
                      read = "I > After telephony_sim_get_subscriber_number";
    t.file = "DASimManager.cpp";
    t.kind = Kind::Single;
    t.lock = SimLock::Whole;
    t.Add<char**()>(&S::GetCpNameList, {}, {"modem0 modem1"}).Fails({kNames}, {"null"});
    t.Add<bool(int, bool*)>(&S::GetRoamingStatus, {"", 1}, {"true false"});
    t.Fails({kOpen[0], Call::telephony_network_get_service_state, Call::telephony_network_get_roaming_status}, {"false true"});
    t.Add<bool(int, Status*)>(&S::IsAvaliableState, {"", 1}, {"true 3"}).Fails({kNames, kModem, kStatus}, {"false"});
    t.Add<bool(int, Status*, int*)>(&S::IsAvaliableSendSMS, {"", 1}, {"true 3 6", "E > NetworkSvc[6]"});
    t.Fails({kNames, kModem, Call::tel_get_property_int}, {"false"}).Fails({kStatus}, {"false", "E > Not available. ret[-77]"});
    t.Add<bool(char*, TelNetworkDefaultSubs_t*)>(&S::GetMainSimSubscription, {"modem1"}, {"true 0"});
    t.Fails({kModem, Call::tel_get_network_default_subscription}, {"false"});
    t.Add<bool(char*, TelCallPreferredVoiceSubs_t*)>(&S::GetCallPreferredSubscription, {"modem1"}, {"true 1"});
    t.Fails({kModem, Call::tel_get_call_preferred_voice_subscription}, {"false"});
    t.Add<bool(char*, TelNetworkDefaultDataSubs_t*)>(&S::GetDefaultDataSubscription, {"modem1"}, {"true 0"});
    t.Fails({kModem, Call::tel_get_network_default_data_subscription}, {"false"});
    t.Add<bool(char*, int*)>(&S::CheckSmsEnabled, {"modem1"}, {"true 1"});
    t.Fails({kModem, Call::tel_check_sms_device_status}, {"false"});
    t.Add<bool(Text, std::string*, std::string*, std::string*)>(&S::GetSimInfo, {"modem1"}, {"true 262 01 9876543210"});
    t.Fails({kModem}, {"false before before before", "E > tel_init error"});
    t.Fails({Call::tel_get_sim_imsi}, {"false before before before", "E > tel_get_sim_imsi errno [-77]"});
    t.Add<bool(telephony_data**, char**)>(&S::GetPhoneNumber, {}, {"true +821012345678", enter, reading, read});
    t.Fails(kNumber, {"false before*", enter, reading, "E > telephony_sim_get_subscriber_number errno [-77]"});
    t.WithoutMemory({"false before"});
    t.kind = Kind::Walk;
    t.AddRun({SymbolOf<bool (S::*)(Slots*)>(&S::InitHandleList), SymbolOf<bool (S::*)(Slots*)>(&S::DeinitHandleList)},
        OpenAndClose<S>, {"true 2 true"});
    t.Add<bool()>(&S::IsSimExist, {}, {"true"}).Fails({}, {"false", "E > SIM STATE[0] : TELEPHONY_SIM_STATE_LOCKED"});
    t.lock = SimLock::AroundReads;
    t.Add<bool(int, int, Status*)>(&S::IsAvaliableSimStateOnPolling, {"", 1},
        {"true 3", "I > current SIM Status[3]", "I > slotNum[1], result[1], status[3], time[0]"});
    t.Fails({}, {"false", "E > wait tel_init[1]", "E > TapiHandle is null. fail."});
    t.kind = Kind::Single;
    t.Add<bool(Status)>(&S::IsWaittingSimCheck, {"", 4}, {"true"}).WithoutMemory({"false"});
}

/// Country lookups, of the facade as of its manager.
template <class S>
void AddCountry(Table& t)
{
    t.Add<bool(char*)>(&S::IsValidMcc, {"450"}, {"true"}).WithoutMemory({"false"});
    t.Add<bool(Text)>(&S::IsMoSupportMcc, {"460"}, {"true"}).WithoutMemory({"false"});
    const std::tuple<void (S::*)(Text, char**), Text, Text> lookups[] = {{&S::GetCountryCodeFromMcc, "450", "kr"},
        {&S::GetCountryNameFromMcc, "262", "Germany"}, {&S::GetMccFromCountryCode, "kr", "450"},
        {&S::GetMccFromServiceCountryCode, "ko_KR", "450"}, {&S::GetServiceCountryCodeFromMcc, "450", "ko_KR"},
        {&S::GetCountryCallingCodeFromMcc, "450", "82"}, {&S::GetAlpha3CountryCodeFromMcc, "450", "KOR"},
        {&S::GetMccFromCountryCallingCode, "82", "450"}};
    for (const auto& [lookup, key, found] : lookups)
        t.Add(lookup, {key}, {found}).WithoutMemory({"null"});
}

using Noti = int(_KIV_NOTI_TYPE_E, Text, int, Text, Text, Text, Text);

/// What a call of the one subscriber comes to.
Story WalkOf(const std::string& function)
{
    const std::string place = "I DADBusManager.cpp " + function + " > ";
    return {"0", place + "begin", place + "busname: org.example.client", place + "objectpath: /client",
        place + "interface: org.example.Client", place + "end"};
}

std::string SendMulti(Session&)
{
    int ids[] = {5, 6};
    char on[] = "on";
    char* statuses[] = {on, on};
    return Tell(DASystem::GetInstance()->SendMultiOnOffNotiToServiceManager("450", 2, ids, statuses));
}

/// Queries of the facade over all slots.
void AddSlots(Table& t)
{
    using S = DASystem;
    t.kind = Kind::Walk;
    t.Add<bool()>(&S::IsSimAvailable, {}, {"true"}).Fails({}, {"false", kNotOpened, kNotAvailable});
    t.Add<bool()>(&S::IsDualSimAvailable, {}, {"true"});
    t.Fails({}, {"false", kNotOpened, kNotAvailable, "E > [Single Sim Device] Not support Dual Sim."});
    t.Add<int(char**)>(&S::GetIMEI, {}, {"0 356938035643809"});
    t.Fails(kOpen, {"0 000000000000000", kNotOpened, "E > telephony_init Failed. Start to get IMEI from current time"});
    t.WithoutMemory({"0 null"});

    using First = int (S::*)(char**);
    using Every = void (S::*)(std::vector<char*>*, int*);
    const std::tuple<First, Every, std::string, std::string, std::string> texts[] = {
        {&S::GetMCCFromSim, &S::GetMCCFromSim, "GetMCCFromSim > fail to get MCC", "450", "262"},
        {&S::GetMNCFromSim, &S::GetMNCFromSim, "GetMNCFromSim > fail to get MNC", "05", "01"},
        {&S::GetIMSIFromSim, &S::GetIMSIFromSim, "GetIMSIFromSim > fail to get imsi", "450050123456789", "262019876543210"},
        {&S::GetPhoneNumberFromSim, &S::GetPhoneNumberFromSim, "GetPhoneNumberFromSim > fail to get phoneNumber", "+821012345678",
            "+4915112345678"},
    };
    for (const auto& [first, every, line, slot0, slot1] : texts)
    {
        const std::string failed = "E DASimManager.cpp " + line;
        t.Add(first, {}, {"0 " + slot0}).Fails({}, {"4 before", kNotOpened, kNotAvailable, failed});
        t.WithoutMemory({"-39841791 before"});
        t.Add(every, {}, {"before " + slot0 + ' ' + slot1 + " 2"}).Fails({}, {"before 0", kNotOpened, kNotAvailable, failed});
    }
}

/// What the facade has beside its forwards.
void AddFacade(Table& t)
{
    using S = DASystem;
    constexpr Call kText = Call::system_settings_get_value_string, kSwitch = Call::runtime_info_get_value_bool;
    const Calls info{Call::system_info_get_platform_string};
    t.file = "DASystem.cpp";
    AddSlots(t);

    t.kind = Kind::Single;
    t.Add<bool(Text)>(&S::IsValidMcc, {"450"}, {"true"}).WithoutMemory({"false"});
    t.Add<void(Text, char**)>(&S::GetCountryNameFromCountryCallingCode, {"49"}, {"Germany"});
    t.Fails({}, {"before", "E > mcc is empty. GetCountryNameFromCountryCallingCode finish."}).WithoutMemory({"null"});
    t.Add<void(Text, char**)>(&S::GetCountryNameAlpha2FromCountryCallingCode, {"49", 0, true}, {"de"});
    t.Fails({}, {"before", "E > mcc is empty. GetCountryNameAlpha2FromCountryCallingCode finish."});

    t.Add<int(char**)>(&S::GetDeviceName, {}, {"0 Workbench"}).Fails({kText}, {"-77 null*"});
    t.Add<int(char**)>(&S::GetPlatformName, {}, {"0 Tizen"}).Fails(info, {"-77 null*"});
    t.Add<int(char**)>(&S::GetSWVersion, {}, {"0 2.3.1"}).Fails(info, {"-77 null*"});
    t.Add<int(char**)>(&S::GetModelName, {}, {"0 KM-200"}).Fails(info, {"-77 null*"});
    t.Add<int(char**)>(&S::GetTizenIdN, {}, {"0 h7q3kz0r5fT9wPq"});
    t.Fails(info, {"-77 before", "E > system_info_get_platform_string failed [-77]"}).WithoutMemory({"-12 before"});
    t.Add<int(int*)>(&S::GetFontSize, {}, {"0 1"}).Fails({Call::system_settings_get_value_int}, {"-77"});
    t.Add<int(tm*)>(&S::GetCurrentTime, {}, {"0 123 10 14 22 13 20 2 317"})
        .Fails({Call::alarm_get_current_time}, {"-77 0 0 0 0 0 0 0 0*"});
    t.Add<int(Text, char**)>(&S::GetPackageVersion, {"org.example.mail"}, {"0 3.0.17"});
    t.Fails({Call::package_info_create}, {"-77 before", "E > package_info_create failed [-77]"});
    t.Fails({Call::package_info_get_version}, {"-77 before"}).WithoutMemory({"-12 before"});
    t.Add<bool()>(&S::IsFlightMode, {}, {"true"}).Fails({kSwitch}, {"false*"});
    t.Add<bool()>(&S::IsDataRoamingEnabled, {}, {"true"}).Fails({kSwitch}, {"false*"});
    t.Add<bool()>(&S::IsMobileData, {}, {"true"}).Fails({Call::system_settings_get_value_bool}, {"false*"});
    t.Add<bool(char*)>(&S::IsPackageInstalled, {"org.example.mail"}, {"true"});
    t.Fails(
        {Call::package_manager_get_package_size_info}, {"false", "E > Other Error Case.. [package_manager_error_e] code is -77"});
    t.Add<bool(double)>(&S::IsSystemMemoryAvailable, {"", 4095.9}, {"true"});
    t.Fails({Call::storage_get_internal_memory_size64}, {"false", "E > Fail to get internal memory size"});
    t.Add<char*()>(&S::GetCSC, {}, {"KIV"}).Fails({Call::vconf_get_str}, {"null"});

    t.Add<int(char**, bool)>(&S::GetDeviceLanguageCode, {"", 1}, {"0 eng"}).Fails({kText}, {"-77 eng"}).WithoutMemory({"0 before"});
    t.Add<void(std::string, char**)>(&S::GetISO639LangCodeFromDeviceLang, {"KO", 0, true}, {"kor"});
    t.Add<int(std::string, std::string)>(&S::GetTagStartPosition, {"en_US"}, {"0"});
    t.Add<std::string(std::string, int, int)>(&S::GetValueFromPosition, {"abcdefghijklmnopqrstuvwxyz", 1}, {"b"});
    t.Add<char(char)>(&S::To_Capital, {"", 'k'}, {"K"});

    t.kind = Kind::Bus;
    Story policy = WalkOf("SendPolicyNotification"), statuses = WalkOf("SendStatusNotification");
    policy.insert(policy.begin() + 1, "I > noti type [5] service_id [5]");
    statuses.insert(statuses.end(), {statuses[1], statuses[5]}); // nobody subscribed to the other service
    t.Add<Noti>(&S::SendNotiToServiceManager, {"450", KIV_NOTI_TYPE_POLICY}, policy).WithoutMemory({"4"});
    t.AddRun({SymbolOf<int (S::*)(Text, int, int*, char**)>(&S::SendMultiOnOffNotiToServiceManager)}, SendMulti, statuses);
    t.Add<int(Text*)>(&S::GetDeviceUniqueID, {}, {"0 KIV0123456789", "I DADBusManager.cpp GetDeviceUniqueID > "});
    t.WithoutMemory({"4 null"});
}

template <class Char>
void AddReader(Table& t, int (DASimManager::*read)(Slots, int, Char**), const Calls& reads, const std::string& good,
    const std::string& bad, const std::string& line)
{
    t.Add(read, {"", 1}, {good}).Fails(kState, {bad, kNotAvailable, line}).Fails(reads, {bad, line});
}

std::string OpenAndDelete(Session&)
{
    Slots list{};
    const bool isOpen = DASimManager::GetInstance()->SuccessToInitTelephonyHandle(&list);
    const unsigned count = list.count;
    DASimManager::GetInstance()->DeleteTelephonyHandle(list);
    return Tell(isOpen, count);
}

/// What the SIM manager has beside what the facade forwards.
void AddSimManager(Table& t)
{
    using S = DASimManager;
    t.kind = Kind::Single;
    t.file = "DASimManager.cpp";
    t.AddRun({SymbolOf(&S::SuccessToInitTelephonyHandle), SymbolOf(&S::DeleteTelephonyHandle)}, OpenAndDelete, {"true 2"});
    t.Fails(kOpen, {"false 0", "E > telephony_init Failed."});
    t.Add<bool(Slots, int)>(&S::IsSimAvailable, {"", 1}, {"true"}).Fails(kState, {"false", "E > Sim is not available"});
    AddReader<const char>(t, &S::GetMCCFromSim, kImsi, "0 262", "4 null", "E > fail to get MCC");
    AddReader<char>(t, &S::GetMNCFromSim, kImsi, "0 01", "4 null", "E > fail to get MNC");
    AddReader<char>(t, &S::GetIMSIFromSim, kImsi, "0 262019876543210", "4 null", "E > fail to get imsi");
    AddReader<char>(t, &S::GetPhoneNumberFromSim, kNumber, "0 +4915112345678", "-39841791 null", "E > fail to get phoneNumber");
    t.lock = SimLock::Whole;
    t.Add<bool(telephony_data**, telephony_sim_state_e*)>(&S::GetSimState, {}, {"true 2"}).Fails(kState, {"false"});
}

std::string AskBoard(Session&)
{
    DADBusManager& manager = *DADBusManager::GetInstance();
    int error = 0;
    g_autoptr(GDBusConnection) connection = manager.InitDbusConnection(&error);
    g_autoptr(GDBusMessage) reply = connection ? manager.SendDbusMethodNReceiveDID(connection, &error) : nullptr;
    return Tell(error) + Take(reply ? manager.ParseDeviceUniqueID(reply, &error) : nullptr);
}

void AddBusManager(Table& t)
{
    using B = DADBusManager;
    t.kind = Kind::Bus;
    t.file = "DADBusManager.cpp";
    t.AddRun({SymbolOf(&B::InitDbusConnection), SymbolOf(&B::SendDbusMethodNReceiveDID), SymbolOf(&B::ParseDeviceUniqueID)},
        AskBoard, {"0 KIV0123456789"});
    t.Add<int(Text&)>(&B::GetDeviceUniqueID, {}, {"0 KIV0123456789", "I > "});
    t.Add<Noti>(&B::SendNotiToServiceManager, {"450", KIV_NOTI_TYPE_POLICY},
        {"0", "I > SendNotiToServiceManager start!! [5]", "I > SendNotiToServiceManager end!!"});
    t.Add<int(char*, int, Text, Text, Text, Text)>(&B::SendPolicyNotification, {"450", 5}, WalkOf("SendPolicyNotification"));
    t.Add<int(char*, int, Text)>(&B::SendStatusNotification, {"450", 5}, WalkOf("SendStatusNotification"));
    t.Add<int(char*, int)>(&B::SendAuthNotification, {"450", 1}, WalkOf("SendAuthNotification"));
    t.Add<int(char*, int)>(&B::SendActivatedNotification, {"450", 1}, WalkOf("SendActivatedNotification"));
    t.Add<int(char*, Text, Text, Text, Text)>(&B::SendNumberChangedNotification, {"450"}, WalkOf("SendNumberChangedNotification"));
    t.kind = Kind::Push;
    t.Add<int(Text, Text, Text, long long)>(&B::DeliverPushMessage, {"5", 7}, WalkOf("DeliverPushMessage"));
}

template <class S>
void AddInstance(Table& t, const char* file, const std::string& failure)
{
    static_assert(sizeof(S) == sizeof(void*) && std::has_virtual_destructor_v<S>, "no data, and a destructor that is virtual");
    t.file = file;
    t.AddRun({SymbolOf(&S::GetInstance)}, [](Session&) { return S::GetInstance() == nullptr ? " none" : " one"; }, {"one"});
    t.Fails({}, {"none", "E > " + failure + " failed."});
}

} // namespace

const std::vector<Operation>& Operations()
{
    static const std::vector<Operation> operations = []
    {
        Table t;
        AddInstance<DASystem>(t, "DASystem.cpp", "CoreSystem()");
        AddInstance<DASimManager>(t, "DASimManager.cpp", "SimManager()");
        AddInstance<DADBusManager>(t, "DADBusManager.cpp", "DBusManager()");
        AddInstance<DAConnectionManager>(t, "DAConnectionManager.cpp", "ConnectionManager()");
        AddConnection<DASystem>(t);
        AddConnection<DAConnectionManager>(t);
        AddSim<DASystem>(t);
        AddSim<DASimManager>(t);
        AddCountry<DASystem>(t);
        AddCountry<DASimManager>(t);
        AddFacade(t);
        AddSimManager(t);
        AddBusManager(t);
        return t.rows;
    }();
    return operations;
}

bool Operation::IsLockedAt(Call call) const
{
    return lock == SimLock::Whole || call == Call::telephony_sim_get_state || call == Call::telephony_sim_get_subscriber_number ||
           call == Call::tel_get_sim_imsi;
}

bool IsLong()
{
    return std::getenv("KIV_TEST_LONG") != nullptr;
}

Session::Session()
{
    telephony_init(&given);
}

Session::~Session()
{
    telephony_deinit(&given);
    telephony_deinit(&left);
}

World::World()
    : directory(mkdtemp((std::filesystem::temp_directory_path() / "kiv-sweep-XXXXXX").string().data())),
      board(bus, "org.tizen.system.deviced", Peer::Reply("('KIV0123456789',)")),
      serviceManager(bus, "org.tizen.servicemanager.service"),
      client(bus, "org.example.client")
{
    for (Peer* const peer : {&board, &serviceManager, &client})
        peer->Forget();
    setenv("KIV_SUBSCRIBERS", (directory + "/subscribers.db").c_str(), 1);
    std::string reason;
    const std::pair<const char*, const char*> events[] = {
        {"policy", "5"}, {"status", "5"}, {"auth", "all"}, {"activated", "all"}, {"number_changed", "all"}, {"push", "5"}};
    for (const auto& [kind, key] : events)
        DASubscriberStore().Add({kind, key, {client.Name(), "/client", "org.example.Client"}}, reason);
    setenv("TZ", "UTC", 1);
    tzset();
    Use("dual");
}

World::~World()
{
    platform::ResetDevice();
    std::filesystem::remove_all(directory);
}

void World::Use(const std::string& profile)
{
    platform::ResetDevice();
    platform::UseProfile(profile);
    platform::ChangeDevice(
        [](platform::Device& device)
        {
            device.currentTime = 1'700'000'000;
            device.flightMode = device.dataRoaming = true;
            device.bluetoothState = 2;
        });
}

} // namespace kiv::test
