// That every member of the interface is there under its type: one that is not does not compile or does not link.
#include <DAConnectionManager.h>
#include <DADBusManager.h>
#include <DASimManager.h>
#include <DASystem.h>

#include <gtest/gtest.h>

#include <set>
#include <string>

namespace
{

using Handles = telephony_handle_list_s;
using Status = TelSimCardStatus_t;
using Text = const char*;

/// The addresses of members of one class, each listed under its type.
template <class Class>
struct Members
{
    template <class Type>
    void Have(std::initializer_list<Type Class::*> members)
    {
        for (const auto member : members)
            addresses.emplace(reinterpret_cast<const char*>(&member), sizeof member);
    }

    std::set<std::string> addresses;
};

/// What the facade forwards to the connection manager as it is.
template <class S>
void ListConnectionMembers(Members<S>& all)
{
    all.template Have<void(IDAConnectionStateListener*, void*)>({&S::SetConnectionEventListener});
    all.template Have<int()>({&S::GetCellularNetworkState, &S::GetWifiNetworkState, &S::GetBTNetworkState});
    all.template Have<bool(bool, bool)>({&S::IsNetworkConnected});
}

/// What the facade forwards to the SIM manager, as it is or behind a guard.
template <class S>
void ListSimMembers(Members<S>& all)
{
    all.template Have<bool(int, bool*)>({&S::GetRoamingStatus});
    all.template Have<bool(Handles*)>({&S::InitHandleList, &S::DeinitHandleList});
    all.template Have<char**()>({&S::GetCpNameList});
    all.template Have<bool(int, Status*)>({&S::IsAvaliableState});
    all.template Have<bool(int, Status*, int*)>({&S::IsAvaliableSendSMS});
    all.template Have<bool(int, int, Status*)>({&S::IsAvaliableSimStateOnPolling});
    all.template Have<bool(Status)>({&S::IsWaittingSimCheck});
    all.template Have<bool(char*, TelNetworkDefaultSubs_t*)>({&S::GetMainSimSubscription});
    all.template Have<bool(char*, TelCallPreferredVoiceSubs_t*)>({&S::GetCallPreferredSubscription});
    all.template Have<bool(char*, TelNetworkDefaultDataSubs_t*)>({&S::GetDefaultDataSubscription});
    all.template Have<bool(char*, int*)>({&S::CheckSmsEnabled});
    all.template Have<bool(Text, std::string*, std::string*, std::string*)>({&S::GetSimInfo});
    all.template Have<bool(telephony_data**, char**)>({&S::GetPhoneNumber});
    all.template Have<bool()>({&S::IsSimExist});
    all.template Have<bool(char*)>({&S::IsValidMcc});
    all.template Have<bool(Text)>({&S::IsMoSupportMcc});
    all.template Have<void(Text, char**)>({&S::GetCountryCodeFromMcc, &S::GetCountryNameFromMcc, &S::GetMccFromCountryCode,
        &S::GetMccFromServiceCountryCode, &S::GetServiceCountryCodeFromMcc, &S::GetCountryCallingCodeFromMcc,
        &S::GetAlpha3CountryCodeFromMcc, &S::GetMccFromCountryCallingCode});
}

using Noti = int(_KIV_NOTI_TYPE_E, Text, int, Text, Text, Text, Text);

TEST(EveryMember, OfTheFacadeHasItsDeclaredType)
{
    using S = DASystem;
    Members<S> all;
    ListConnectionMembers(all);
    ListSimMembers(all);
    all.Have<Noti>({&S::SendNotiToServiceManager});
    all.Have<bool(Text)>({&S::IsValidMcc});
    all.Have<void(Text, char**)>({&S::GetCountryNameFromCountryCallingCode, &S::GetCountryNameAlpha2FromCountryCallingCode});
    all.Have<int(Text*)>({&S::GetDeviceUniqueID});
    all.Have<int(Text, int, int*, char**)>({&S::SendMultiOnOffNotiToServiceManager});
    all.Have<void(std::vector<char*>*, int*)>(
        {&S::GetMCCFromSim, &S::GetMNCFromSim, &S::GetIMSIFromSim, &S::GetPhoneNumberFromSim});
    all.Have<int(char**)>({&S::GetMCCFromSim, &S::GetMNCFromSim, &S::GetIMSIFromSim, &S::GetPhoneNumberFromSim, &S::GetDeviceName,
        &S::GetTizenIdN, &S::GetPlatformName, &S::GetSWVersion, &S::GetModelName, &S::GetIMEI});
    all.Have<bool()>({&S::IsSimAvailable, &S::IsDualSimAvailable, &S::IsFlightMode, &S::IsDataRoamingEnabled, &S::IsMobileData});
    all.Have<int(int*)>({&S::GetFontSize});
    all.Have<int(tm*)>({&S::GetCurrentTime});
    all.Have<int(Text, char**)>({&S::GetPackageVersion});
    all.Have<bool(char*)>({&S::IsPackageInstalled});
    all.Have<bool(double)>({&S::IsSystemMemoryAvailable});
    all.Have<char*()>({&S::GetCSC});
    all.Have<int(char**, bool)>({&S::GetDeviceLanguageCode});
    all.Have<void(std::string, char**)>({&S::GetISO639LangCodeFromDeviceLang});
    all.Have<int(std::string, std::string)>({&S::GetTagStartPosition});
    all.Have<std::string(std::string, int, int)>({&S::GetValueFromPosition});
    all.Have<char(char)>({&S::To_Capital});
    EXPECT_EQ(66U, all.addresses.size());
}

TEST(EveryMember, OfTheManagersHasItsDeclaredType)
{
    Members<DAConnectionManager> connection;
    ListConnectionMembers(connection);
    EXPECT_EQ(5U, connection.addresses.size());

    using S = DASimManager;
    Members<S> sim;
    ListSimMembers(sim);
    sim.Have<bool(Handles*)>({&S::SuccessToInitTelephonyHandle});
    sim.Have<void(Handles)>({&S::DeleteTelephonyHandle});
    sim.Have<bool(telephony_data**, telephony_sim_state_e*)>({&S::GetSimState});
    sim.Have<bool(Handles, int)>({&S::IsSimAvailable});
    sim.Have<int(Handles, int, Text*)>({&S::GetMCCFromSim});
    sim.Have<int(Handles, int, char**)>({&S::GetMNCFromSim, &S::GetIMSIFromSim, &S::GetPhoneNumberFromSim});
    EXPECT_EQ(33U, sim.addresses.size());

    using B = DADBusManager;
    Members<B> bus;
    bus.Have<Noti>({&B::SendNotiToServiceManager});
    bus.Have<GDBusConnection*(int*)>({&B::InitDbusConnection});
    bus.Have<GDBusMessage*(GDBusConnection*, int*)>({&B::SendDbusMethodNReceiveDID});
    bus.Have<char*(GDBusMessage*, int*)>({&B::ParseDeviceUniqueID});
    bus.Have<int(Text&)>({&B::GetDeviceUniqueID});
    bus.Have<int(char*, int, Text, Text, Text, Text)>({&B::SendPolicyNotification});
    bus.Have<int(char*, int, Text)>({&B::SendStatusNotification});
    bus.Have<int(char*, int)>({&B::SendAuthNotification, &B::SendActivatedNotification});
    bus.Have<int(char*, Text, Text, Text, Text)>({&B::SendNumberChangedNotification});
    bus.Have<int(Text, Text, Text, long long)>({&B::DeliverPushMessage});
    EXPECT_EQ(11U, bus.addresses.size());
}

} // namespace
