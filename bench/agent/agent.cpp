// An agent that makes each call of the facade once.
#include "../BareBus.h"
#include "Peak.h"

#include <DADBusManager.h>
#include <DASystem.h>

#include <gio/gio.h>

#include <cstdlib>

using namespace kiv::bench;

namespace
{

class SilentListener : public IDAConnectionStateListener
{
public:
    void OnWifiDeviceStateChanged(wifi_device_state_e, void*) override {}
    void OnWifiConnectionStateChanged(wifi_connection_state_e, void*, void*) override {}
    void OnFlightModeChanged(bool, void*) override {}
    void OnPacketDataChanged(bool, void*) override {}
    void OnWifiConnectedChanged(bool, void*) override {}
};

void AskForConnection(DASystem& system)
{
    SilentListener listener;
    system.SetConnectionEventListener(&listener, nullptr);
    system.GetCellularNetworkState();
    system.GetWifiNetworkState();
    system.GetBTNetworkState();
    system.IsNetworkConnected(true, true);
    system.SetConnectionEventListener(nullptr, nullptr);
}

void AskForSlots(DASystem& system)
{
    telephony_handle_list_s slots = {};
    system.InitHandleList(&slots);
    char* number = nullptr;
    system.GetPhoneNumber(slots.handle, &number);
    std::free(number);
    system.DeinitHandleList(&slots);

    bool roaming = false;
    system.GetRoamingStatus(0, &roaming);
    TelSimCardStatus_t status{};
    int serviceType = 0;
    system.IsAvaliableState(0, &status);
    system.IsAvaliableSendSMS(0, &status, &serviceType);
    system.IsAvaliableSimStateOnPolling(0, 0, &status);
    system.IsWaittingSimCheck(status);
    system.IsSimExist();

    char** const names = system.GetCpNameList();
    TelNetworkDefaultSubs_t network{};
    TelCallPreferredVoiceSubs_t voice{};
    TelNetworkDefaultDataSubs_t data{};
    std::string mcc, mnc, msin;
    system.GetMainSimSubscription(names[0], &network);
    system.GetCallPreferredSubscription(names[0], &voice);
    system.GetDefaultDataSubscription(names[0], &data);
    system.CheckSmsEnabled(names[0], &serviceType);
    system.GetSimInfo(names[0], &mcc, &mnc, &msin);
    g_strfreev(names);
}

/// Calls members that return a copy.
template <class... Members>
void AskForCopies(DASystem& system, Members... members)
{
    const auto ask = [&](auto member)
    {
        char* text = nullptr;
        (system.*member)(&text);
        std::free(text);
    };
    (ask(members), ...);
}

/// Calls members that return a copy per slot.
template <class... Members>
void AskForAll(DASystem& system, Members... members)
{
    const auto ask = [&](auto member)
    {
        std::vector<char*> texts;
        int count = 0;
        (system.*member)(&texts, &count);
        for (char* const text : texts)
            std::free(text);
    };
    (ask(members), ...);
}

void AskForSims(DASystem& system)
{
    using One = int (DASystem::*)(char**);
    using All = void (DASystem::*)(std::vector<char*>*, int*);
    system.IsSimAvailable();
    system.IsDualSimAvailable();
    AskForCopies(system, One{&DASystem::GetMCCFromSim}, One{&DASystem::GetMNCFromSim}, One{&DASystem::GetIMSIFromSim},
        One{&DASystem::GetPhoneNumberFromSim});
    AskForAll(system, All{&DASystem::GetMCCFromSim}, All{&DASystem::GetMNCFromSim}, All{&DASystem::GetIMSIFromSim},
        All{&DASystem::GetPhoneNumberFromSim});
}

void LookUp(DASystem& system)
{
    const auto ask = [&](auto member, const char* key)
    {
        char* text = nullptr;
        (system.*member)(key, &text);
        std::free(text);
    };
    system.IsValidMcc("450");
    system.IsMoSupportMcc("450");
    for (const auto member :
        {&DASystem::GetCountryCodeFromMcc, &DASystem::GetCountryNameFromMcc, &DASystem::GetServiceCountryCodeFromMcc,
            &DASystem::GetCountryCallingCodeFromMcc, &DASystem::GetAlpha3CountryCodeFromMcc})
        ask(member, "450");
    ask(&DASystem::GetMccFromCountryCode, "kr");
    ask(&DASystem::GetMccFromServiceCountryCode, "ko_KR");
    ask(&DASystem::GetMccFromCountryCallingCode, "82");
    ask(&DASystem::GetCountryNameFromCountryCallingCode, "82");
    char* constant = nullptr;
    system.GetCountryNameAlpha2FromCountryCallingCode("82", &constant);
    system.GetISO639LangCodeFromDeviceLang("EN", &constant);
}

void AskForDevice(DASystem& system)
{
    AskForCopies(system, &DASystem::GetDeviceName, &DASystem::GetTizenIdN, &DASystem::GetPlatformName, &DASystem::GetSWVersion,
        &DASystem::GetModelName, &DASystem::GetIMEI);
    int size = 0;
    system.GetFontSize(&size);
    tm now = {};
    system.GetCurrentTime(&now);
    char package[] = "org.example.mail";
    char* text = nullptr;
    system.GetPackageVersion(package, &text);
    std::free(text);
    system.IsPackageInstalled(package);
    system.IsFlightMode();
    system.IsDataRoamingEnabled();
    system.IsMobileData();
    system.IsSystemMemoryAvailable(1);
    std::free(system.GetCSC());
    text = nullptr;
    system.GetDeviceLanguageCode(&text, true);
    std::free(text);
    system.GetValueFromPosition("en_US", system.GetTagStartPosition("en_US", "_"), 4);
    system.To_Capital('a');
}

void UseBus(DASystem& system)
{
    const char* id = nullptr;
    system.GetDeviceUniqueID(&id);
    g_free(const_cast<char*>(id));
    system.SendNotiToServiceManager(KIV_NOTI_TYPE_STATUS_ON, kImsi, 1, nullptr, nullptr, nullptr, nullptr);
    int service = 1;
    char on[] = "on";
    char* status = on;
    system.SendMultiOnOffNotiToServiceManager(kImsi, 1, &service, &status);
    DADBusManager::GetInstance()->DeliverPushMessage("1", "data", "message", kPushTime);
}

} // namespace

int main()
{
    [[maybe_unused]] g_autoptr(GDBusConnection) connection = g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr);
    DASystem& system = *DASystem::GetInstance();
    AskForConnection(system);
    AskForSlots(system);
    AskForSims(system);
    LookUp(system);
    AskForDevice(system);
    UseBus(system);
    // The library does not report the end of a push; this is far longer than it takes.
    [[maybe_unused]] g_autoptr(GMainLoop) loop = g_main_loop_new(nullptr, FALSE);
    g_timeout_add_once(
        250, [](gpointer running) { g_main_loop_quit(static_cast<GMainLoop*>(running)); }, loop);
    g_main_loop_run(loop);
    PrintPeak();
}
