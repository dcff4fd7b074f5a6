#include "sweep/Operations.h"

#include "sweep/Members.h"

#include <DAConnectionManager.h>
#include <DADBusManager.h>
#include <DASimManager.h>
#include <DASystem.h>

#include <cstring>
#include <cxxabi.h>
#include <dlfcn.h>

namespace kiv::test
{

namespace
{

/// Returns the readable symbol of a member: "DASystem::GetIMEI(char**)".
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

using Rows = std::vector<Operation>;

/// What operations by modem or by slot are given.
struct Subject
{
    Given modem, slot;
};

/// The row added last.
class Row
{
public:
    Row(Operation& operation, const char* file, const Story& good) : operation_(operation), file_(file)
    {
        operation_.good = Complete(good);
    }

    /// Sets the outcome when one of these calls fails.
    Row Fails(const Calls& calls, const Story& story) const
    {
        operation_.failing.push_back({calls, Complete(story)});
        return *this;
    }

    void WithoutMemory(const std::vector<std::string>& results) const { operation_.noMemory = results; }

private:
    /// Inserts the place of the member into its own lines, which are given as "E > text".
    Story Complete(Story story) const
    {
        const std::string& name = operation_.name;
        const std::size_t begin = name.find("::") + 2;
        const std::string place = std::string(" ") + file_ + ' ' + name.substr(begin, name.find('(') - begin);
        for (std::size_t i = 1; i < story.size(); ++i)
            story[i].insert(1, story[i][2] == '>' ? place : "");
        return story;
    }

    Operation& operation_;
    const char* file_;
};

/// The common values of rows; every row names its group.
struct Group
{
    /// Adds a member of exactly this type.
    template <class Type, class Class>
    Row Add(Type Class::*member, const Given& given, const Story& good) const
    {
        const auto run = [member, given](Session& session) { return CallMember(member, given, session); };
        const Row row = AddRun({SymbolOf(member)}, run, good);
        rows.back().needsHandle = TakesHandle(member);
        return row;
    }

    /// Adds members that one function calls.
    Row AddRun(const std::vector<std::string>& symbols, const std::function<std::string(Session&)>& run, const Story& good) const
    {
        const auto withoutBlank = [run](Session& session)
        {
            const std::string told = run(session);
            return told.empty() ? told : told.substr(1);
        };
        rows.push_back({symbols, symbols[0], kind, lock, false, withoutBlank, {}, {}, {}});
        return {rows.back(), file, good};
    }

    Rows& rows;
    const char* file; ///< source file of their own lines
    Kind kind;
    SimLock lock;
};

const Calls kOpen{Call::telephony_init}, kState{Call::telephony_sim_get_state}, kNumber{Call::telephony_sim_get_subscriber_number},
    kImsi{Call::tel_get_cp_name_list, Call::tel_init, Call::tel_get_sim_imsi};
const std::string kNotOpened = "E DASimManager.cpp SuccessToInitTelephonyHandle > telephony_init Failed.";
const std::string kNotAvailable = "E DASimManager.cpp IsSimAvailable > Sim is not available";

/// Records changes: what changed, and the new value.
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

/// Connection states, of the facade and of its manager.
template <class S>
void AddConnection(Rows& rows)
{
    using C = DAConnectionManager;
    const Group single{rows, "DAConnectionManager.cpp", Kind::Single, SimLock::AroundReads};
    const Group walk{rows, "DAConnectionManager.cpp", Kind::Walk, SimLock::AroundReads};
    const Group listener{rows, "DAConnectionManager.cpp", Kind::Listener, SimLock::AroundReads};
    single.Add<int()>(&S::GetCellularNetworkState, {}, {"5"})
        .Fails({Call::connection_create, Call::connection_get_cellular_state}, {"-1"});
    single.Add<int()>(&S::GetWifiNetworkState, {}, {"1"}).Fails({Call::connection_create, Call::connection_get_wifi_state}, {"-1"});
    single.Add<int()>(&S::GetBTNetworkState, {}, {"2"}).Fails({Call::connection_create, Call::connection_get_bt_state}, {"-1"});
    walk.Add<bool(bool, bool)>(&S::IsNetworkConnected, {"", 1}, {"true"});
    listener.AddRun({SymbolOf<void (S::*)(IDAConnectionStateListener*, void*)>(&S::SetConnectionEventListener),
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

/// SIM queries by slot or modem, of the facade and of its manager.
template <class S>
void AddSim(Rows& rows, const Subject& subject)
{
    const Group locked{rows, "DASimManager.cpp", Kind::Single, SimLock::Whole};
    const Group lockedWalk{rows, "DASimManager.cpp", Kind::Walk, SimLock::Whole};
    const Group walk{rows, "DASimManager.cpp", Kind::Walk, SimLock::AroundReads};
    const Group single{rows, "DASimManager.cpp", Kind::Single, SimLock::AroundReads};
    constexpr Call kNames = Call::tel_get_cp_name_list, kModem = Call::tel_init, kStatus = Call::tel_get_sim_init_info;
    const std::string enter = "I > Enter", reading = "I > Before telephony_sim_get_subscriber_number",
                      read = "I > After telephony_sim_get_subscriber_number";
    locked.Add<char**()>(&S::GetCpNameList, {}, {"modem0 modem1"}).Fails({kNames}, {"null"});
    locked.Add<bool(int, bool*)>(&S::GetRoamingStatus, subject.slot, {"true false"})
        .Fails({kOpen[0], Call::telephony_network_get_service_state, Call::telephony_network_get_roaming_status}, {"false true"});
    locked.Add<bool(int, Status*)>(&S::IsAvaliableState, subject.slot, {"true 3"}).Fails({kNames, kModem, kStatus}, {"false"});
    locked.Add<bool(int, Status*, int*)>(&S::IsAvaliableSendSMS, subject.slot, {"true 3 6", "E > NetworkSvc[6]"})
        .Fails({kNames, kModem, Call::tel_get_property_int}, {"false"})
        .Fails({kStatus}, {"false", "E > Not available. ret[-77]"});
    locked.Add<bool(char*, TelNetworkDefaultSubs_t*)>(&S::GetMainSimSubscription, subject.modem, {"true 0"})
        .Fails({kModem, Call::tel_get_network_default_subscription}, {"false"});
    locked.Add<bool(char*, TelCallPreferredVoiceSubs_t*)>(&S::GetCallPreferredSubscription, subject.modem, {"true 1"})
        .Fails({kModem, Call::tel_get_call_preferred_voice_subscription}, {"false"});
    locked.Add<bool(char*, TelNetworkDefaultDataSubs_t*)>(&S::GetDefaultDataSubscription, subject.modem, {"true 0"})
        .Fails({kModem, Call::tel_get_network_default_data_subscription}, {"false"});
    locked.Add<bool(char*, int*)>(&S::CheckSmsEnabled, subject.modem, {"true 1"})
        .Fails({kModem, Call::tel_check_sms_device_status}, {"false"});
    locked.Add<bool(Text, std::string*, std::string*, std::string*)>(&S::GetSimInfo, subject.modem, {"true 262 01 9876543210"})
        .Fails({kModem}, {"false before before before", "E > tel_init error"})
        .Fails({Call::tel_get_sim_imsi}, {"false before before before", "E > tel_get_sim_imsi errno [-77]"});
    locked.Add<bool(telephony_data**, char**)>(&S::GetPhoneNumber, {}, {"true +821012345678", enter, reading, read})
        .Fails(kNumber, {"false before*", enter, reading, "E > telephony_sim_get_subscriber_number errno [-77]"})
        .WithoutMemory({"false before"});
    lockedWalk.AddRun({SymbolOf<bool (S::*)(Slots*)>(&S::InitHandleList), SymbolOf<bool (S::*)(Slots*)>(&S::DeinitHandleList)},
        OpenAndClose<S>, {"true 2 true"});
    lockedWalk.Add<bool()>(&S::IsSimExist, {}, {"true"}).Fails({}, {"false", "E > SIM STATE[0] : TELEPHONY_SIM_STATE_LOCKED"});
    walk.Add<bool(int, int, Status*)>(&S::IsAvaliableSimStateOnPolling, subject.slot,
            {"true 3", "I > current SIM Status[3]", "I > slotNum[1], result[1], status[3], time[0]"})
        .Fails({}, {"false", "E > wait tel_init[1]", "E > TapiHandle is null. fail."});
    single.Add<bool(Status)>(&S::IsWaittingSimCheck, {"", 4}, {"true"}).WithoutMemory({"false"});
}

/// Country lookups, of the facade and of its manager.
template <class S>
void AddCountry(Rows& rows)
{
    const Group single{rows, "DASimManager.cpp", Kind::Single, SimLock::AroundReads};
    single.Add<bool(char*)>(&S::IsValidMcc, {"450"}, {"true"}).WithoutMemory({"false"});
    single.Add<bool(Text)>(&S::IsMoSupportMcc, {"460"}, {"true"}).WithoutMemory({"false"});
    const std::tuple<void (S::*)(Text, char**), Text, Text> lookups[] = {{&S::GetCountryCodeFromMcc, "450", "kr"},
        {&S::GetCountryNameFromMcc, "262", "Germany"}, {&S::GetMccFromCountryCode, "kr", "450"},
        {&S::GetMccFromServiceCountryCode, "ko_KR", "450"}, {&S::GetServiceCountryCodeFromMcc, "450", "ko_KR"},
        {&S::GetCountryCallingCodeFromMcc, "450", "82"}, {&S::GetAlpha3CountryCodeFromMcc, "450", "KOR"},
        {&S::GetMccFromCountryCallingCode, "82", "450"}};
    for (const auto& [lookup, key, found] : lookups)
        single.Add(lookup, {key}, {found}).WithoutMemory({"null"});
}

using Noti = int(_KIV_NOTI_TYPE_E, Text, int, Text, Text, Text, Text);

/// The outcome of a call of the one subscriber.
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
void AddSlots(Rows& rows)
{
    using S = DASystem;
    const Group walk{rows, "DASystem.cpp", Kind::Walk, SimLock::AroundReads};
    walk.Add<bool()>(&S::IsSimAvailable, {}, {"true"}).Fails({}, {"false", kNotOpened, kNotAvailable});
    walk.Add<bool()>(&S::IsDualSimAvailable, {}, {"true"})
        .Fails({}, {"false", kNotOpened, kNotAvailable, "E > [Single Sim Device] Not support Dual Sim."});
    walk.Add<int(char**)>(&S::GetIMEI, {}, {"0 356938035643809"})
        .Fails(kOpen, {"0 000000000000000", kNotOpened, "E > telephony_init Failed. Start to get IMEI from current time"})
        .WithoutMemory({"0 null"});

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
        walk.Add(first, {}, {"0 " + slot0})
            .Fails({}, {"4 before", kNotOpened, kNotAvailable, failed})
            .WithoutMemory({"-39841791 before"});
        walk.Add(every, {}, {"before " + slot0 + ' ' + slot1 + " 2"}).Fails({}, {"before 0", kNotOpened, kNotAvailable, failed});
    }
}

/// The facade's members that do not forward.
void AddFacade(Rows& rows)
{
    using S = DASystem;
    const Group single{rows, "DASystem.cpp", Kind::Single, SimLock::AroundReads};
    const Group bus{rows, "DASystem.cpp", Kind::Bus, SimLock::AroundReads};
    constexpr Call kText = Call::system_settings_get_value_string, kSwitch = Call::runtime_info_get_value_bool;
    const Calls info{Call::system_info_get_platform_string};
    AddSlots(rows);

    single.Add<bool(Text)>(&S::IsValidMcc, {"450"}, {"true"}).WithoutMemory({"false"});
    single.Add<void(Text, char**)>(&S::GetCountryNameFromCountryCallingCode, {"49"}, {"Germany"})
        .Fails({}, {"before", "E > mcc is empty. GetCountryNameFromCountryCallingCode finish."})
        .WithoutMemory({"null"});
    single.Add<void(Text, char**)>(&S::GetCountryNameAlpha2FromCountryCallingCode, {"49", 0, true}, {"de"})
        .Fails({}, {"before", "E > mcc is empty. GetCountryNameAlpha2FromCountryCallingCode finish."});

    single.Add<int(char**)>(&S::GetDeviceName, {}, {"0 Workbench"}).Fails({kText}, {"-77 null*"});
    single.Add<int(char**)>(&S::GetPlatformName, {}, {"0 Tizen"}).Fails(info, {"-77 null*"});
    single.Add<int(char**)>(&S::GetSWVersion, {}, {"0 2.3.1"}).Fails(info, {"-77 null*"});
    single.Add<int(char**)>(&S::GetModelName, {}, {"0 KM-200"}).Fails(info, {"-77 null*"});
    single.Add<int(char**)>(&S::GetTizenIdN, {}, {"0 h7q3kz0r5fT9wPq"})
        .Fails(info, {"-77 before", "E > system_info_get_platform_string failed [-77]"})
        .WithoutMemory({"-12 before"});
    single.Add<int(int*)>(&S::GetFontSize, {}, {"0 1"}).Fails({Call::system_settings_get_value_int}, {"-77"});
    single.Add<int(tm*)>(&S::GetCurrentTime, {}, {"0 196 9 2 7 6 40 2 275"})
        .Fails({Call::alarm_get_current_time}, {"-77 0 0 0 0 0 0 0 0*"});
    single.Add<int(Text, char**)>(&S::GetPackageVersion, {"org.example.mail"}, {"0 3.0.17"})
        .Fails({Call::package_info_create}, {"-77 before", "E > package_info_create failed [-77]"})
        .Fails({Call::package_info_get_version}, {"-77 before"})
        .WithoutMemory({"-12 before"});
    single.Add<bool()>(&S::IsFlightMode, {}, {"true"}).Fails({kSwitch}, {"false*"});
    single.Add<bool()>(&S::IsDataRoamingEnabled, {}, {"true"}).Fails({kSwitch}, {"false*"});
    single.Add<bool()>(&S::IsMobileData, {}, {"true"}).Fails({Call::system_settings_get_value_bool}, {"false*"});
    single.Add<bool(char*)>(&S::IsPackageInstalled, {"org.example.mail"}, {"true"})
        .Fails({Call::package_manager_get_package_size_info},
            {"false", "E > Other Error Case.. [package_manager_error_e] code is -77"});
    single.Add<bool(double)>(&S::IsSystemMemoryAvailable, {"", 4095.9}, {"true"})
        .Fails({Call::storage_get_internal_memory_size64}, {"false", "E > Fail to get internal memory size"});
    single.Add<char*()>(&S::GetCSC, {}, {"KIV"}).Fails({Call::vconf_get_str}, {"null"});

    single.Add<int(char**, bool)>(&S::GetDeviceLanguageCode, {"", 1}, {"0 eng"})
        .Fails({kText}, {"-77 eng"})
        .WithoutMemory({"0 before"});
    single.Add<void(std::string, char**)>(&S::GetISO639LangCodeFromDeviceLang, {"KO", 0, true}, {"kor"});
    single.Add<int(std::string, std::string)>(&S::GetTagStartPosition, {"en_US"}, {"0"});
    single.Add<std::string(std::string, int, int)>(&S::GetValueFromPosition, {"abcdefghijklmnopqrstuvwxyz", 1}, {"b"});
    single.Add<char(char)>(&S::To_Capital, {"", 'k'}, {"K"});

    Story policy = WalkOf("SendPolicyNotification"), statuses = WalkOf("SendStatusNotification");
    policy.insert(policy.begin() + 1, "I > noti type [5] service_id [5]");
    statuses.insert(statuses.end(), {statuses[1], statuses[5]}); // the other service has no subscribers
    bus.Add<Noti>(&S::SendNotiToServiceManager, {"450", KIV_NOTI_TYPE_POLICY}, policy).WithoutMemory({"4"});
    bus.AddRun({SymbolOf<int (S::*)(Text, int, int*, char**)>(&S::SendMultiOnOffNotiToServiceManager)}, SendMulti, statuses);
    bus.Add<int(Text*)>(&S::GetDeviceUniqueID, {}, {"0 KIV0123456789", "I DADBusManager.cpp GetDeviceUniqueID > "})
        .WithoutMemory({"4 null"});
}

template <class Char>
void AddReader(const Group& group, const Given& slot, int (DASimManager::*read)(Slots, int, Char**), const Calls& reads,
    const std::string& good, const std::string& bad, const std::string& line)
{
    group.Add(read, slot, {good}).Fails(kState, {bad, kNotAvailable, line}).Fails(reads, {bad, line});
}

std::string OpenAndDelete(Session&)
{
    Slots list{};
    const bool isOpen = DASimManager::GetInstance()->SuccessToInitTelephonyHandle(&list);
    const unsigned count = list.count;
    DASimManager::GetInstance()->DeleteTelephonyHandle(list);
    return Tell(isOpen, count);
}

/// The SIM manager's members without a forward in the facade.
void AddSimManager(Rows& rows, const Subject& subject)
{
    using S = DASimManager;
    const Group single{rows, "DASimManager.cpp", Kind::Single, SimLock::AroundReads};
    const Group locked{rows, "DASimManager.cpp", Kind::Single, SimLock::Whole};
    single.AddRun({SymbolOf(&S::SuccessToInitTelephonyHandle), SymbolOf(&S::DeleteTelephonyHandle)}, OpenAndDelete, {"true 2"})
        .Fails(kOpen, {"false 0", "E > telephony_init Failed."});
    single.Add<bool(Slots, int)>(&S::IsSimAvailable, subject.slot, {"true"}).Fails(kState, {"false", "E > Sim is not available"});
    AddReader<const char>(single, subject.slot, &S::GetMCCFromSim, kImsi, "0 262", "4 null", "E > fail to get MCC");
    AddReader<char>(single, subject.slot, &S::GetMNCFromSim, kImsi, "0 01", "4 null", "E > fail to get MNC");
    AddReader<char>(single, subject.slot, &S::GetIMSIFromSim, kImsi, "0 262019876543210", "4 null", "E > fail to get imsi");
    AddReader<char>(single, subject.slot, &S::GetPhoneNumberFromSim, kNumber, "0 +4915112345678", "-39841791 null",
        "E > fail to get phoneNumber");
    locked.Add<bool(telephony_data**, telephony_sim_state_e*)>(&S::GetSimState, {}, {"true 2"}).Fails(kState, {"false"});
}

std::string AskBoard(Session&)
{
    DADBusManager& manager = *DADBusManager::GetInstance();
    int error = 0;
    g_autoptr(GDBusConnection) connection = manager.InitDbusConnection(&error);
    g_autoptr(GDBusMessage) reply = connection ? manager.SendDbusMethodNReceiveDID(connection, &error) : nullptr;
    return Tell(error) + Take(reply ? manager.ParseDeviceUniqueID(reply, &error) : nullptr);
}

void AddBusManager(Rows& rows)
{
    using B = DADBusManager;
    const Group bus{rows, "DADBusManager.cpp", Kind::Bus, SimLock::AroundReads};
    const Group push{rows, "DADBusManager.cpp", Kind::Push, SimLock::AroundReads};
    bus.AddRun({SymbolOf(&B::InitDbusConnection), SymbolOf(&B::SendDbusMethodNReceiveDID), SymbolOf(&B::ParseDeviceUniqueID)},
        AskBoard, {"0 KIV0123456789"});
    bus.Add<int(Text&)>(&B::GetDeviceUniqueID, {}, {"0 KIV0123456789", "I > "});
    bus.Add<Noti>(&B::SendNotiToServiceManager, {"450", KIV_NOTI_TYPE_POLICY},
        {"0", "I > SendNotiToServiceManager start!! [5]", "I > SendNotiToServiceManager end!!"});
    bus.Add<int(char*, int, Text, Text, Text, Text)>(&B::SendPolicyNotification, {"450", 5}, WalkOf("SendPolicyNotification"));
    bus.Add<int(char*, int, Text)>(&B::SendStatusNotification, {"450", 5}, WalkOf("SendStatusNotification"));
    bus.Add<int(char*, int)>(&B::SendAuthNotification, {"450", 1}, WalkOf("SendAuthNotification"));
    bus.Add<int(char*, int)>(&B::SendActivatedNotification, {"450", 1}, WalkOf("SendActivatedNotification"));
    bus.Add<int(char*, Text, Text, Text, Text)>(
        &B::SendNumberChangedNotification, {"450"}, WalkOf("SendNumberChangedNotification"));
    push.Add<int(Text, Text, Text, long long)>(&B::DeliverPushMessage, {"5", 7}, WalkOf("DeliverPushMessage"));
}

template <class S>
void AddInstance(Rows& rows, const char* file, const std::string& failure)
{
    static_assert(sizeof(S) == sizeof(void*) && std::has_virtual_destructor_v<S>, "no data, and a destructor that is virtual");
    const Group single{rows, file, Kind::Single, SimLock::AroundReads};
    single.AddRun({SymbolOf(&S::GetInstance)}, [](Session&) { return S::GetInstance() == nullptr ? " none" : " one"; }, {"one"})
        .Fails({}, {"none", "E > " + failure + " failed."});
}

} // namespace

const std::vector<Operation>& Operations(const char* modem, int slot)
{
    static const std::vector<Operation> operations = [modem, slot]
    {
        const Subject subject{{modem}, {"", static_cast<double>(slot)}};
        Rows all;
        AddInstance<DASystem>(all, "DASystem.cpp", "CoreSystem()");
        AddInstance<DASimManager>(all, "DASimManager.cpp", "SimManager()");
        AddInstance<DADBusManager>(all, "DADBusManager.cpp", "DBusManager()");
        AddInstance<DAConnectionManager>(all, "DAConnectionManager.cpp", "ConnectionManager()");
        AddConnection<DASystem>(all);
        AddConnection<DAConnectionManager>(all);
        AddSim<DASystem>(all, subject);
        AddSim<DASimManager>(all, subject);
        AddCountry<DASystem>(all);
        AddCountry<DASimManager>(all);
        AddFacade(all);
        AddSimManager(all, subject);
        AddBusManager(all);
        return all;
    }();
    return operations;
}

bool Operation::IsLockedAt(Call call) const
{
    return lock == SimLock::Whole || call == Call::telephony_sim_get_state || call == Call::telephony_sim_get_subscriber_number ||
           call == Call::tel_get_sim_imsi;
}

} // namespace kiv::test
