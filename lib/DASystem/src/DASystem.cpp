#include "DASystem.h"

#include "CountryTables.h"
#include "DAConnectionManager.h"
#include "DADBusManager.h"
#include "DASimManager.h"
#include "Forward.h"
#include "Handles.h"
#include "Notifications.h"
#include "Policy.h"
#include "Singleton.h"
#include "Slots.h"

#include <DAUtil.h>
#include <app_alarm.h>
#include <package_info.h>
#include <package_manager.h>
#include <runtime_info.h>
#include <storage.h>
#include <system_info.h>
#include <system_settings.h>
#include <vconf.h>

#include <cerrno>
#include <cstdint>
#include <cstring>
#include <utility>

using kiv::Ask;
using kiv::CString;
using kiv::Place;

DASystem* DASystem::__pInstance = nullptr;

DASystem* DASystem::GetInstance()
{
    return kiv::Singleton(__pInstance, KIV_HERE, "CoreSystem() failed.");
}

DASystem::DASystem() = default;
DASystem::~DASystem() = default;

// Forwards ---------------------------------------------------------------------------------------------------------------------

void DASystem::SetConnectionEventListener(IDAConnectionStateListener* listener, void* userData)
{
    Ask(&DAConnectionManager::SetConnectionEventListener, listener, userData);
}

int DASystem::GetCellularNetworkState()
{
    return Ask(KIV_CONNECTION_STATE_UNKNOWN, &DAConnectionManager::GetCellularNetworkState);
}

int DASystem::GetWifiNetworkState()
{
    return Ask(KIV_CONNECTION_STATE_UNKNOWN, &DAConnectionManager::GetWifiNetworkState);
}

int DASystem::GetBTNetworkState()
{
    return Ask(KIV_CONNECTION_STATE_UNKNOWN, &DAConnectionManager::GetBTNetworkState);
}

bool DASystem::IsNetworkConnected(bool checkWifi, bool checkBT)
{
    return Ask(false, &DAConnectionManager::IsNetworkConnected, checkWifi, checkBT);
}

bool DASystem::GetRoamingStatus(int slot, bool* roaming)
{
    return Ask(false, &DASimManager::GetRoamingStatus, slot, roaming);
}

bool DASystem::InitHandleList(telephony_handle_list_s* list)
{
    return Ask(false, &DASimManager::InitHandleList, list);
}

char** DASystem::GetCpNameList()
{
    return Ask<DASimManager, char**>(nullptr, &DASimManager::GetCpNameList);
}

bool DASystem::DeinitHandleList(telephony_handle_list_s* list)
{
    return Ask(false, &DASimManager::DeinitHandleList, list);
}

bool DASystem::IsAvaliableState(int slot, TelSimCardStatus_t* status)
{
    return Ask(false, &DASimManager::IsAvaliableState, slot, status);
}

bool DASystem::IsAvaliableSendSMS(int slot, TelSimCardStatus_t* status, int* serviceType)
{
    return Ask(false, &DASimManager::IsAvaliableSendSMS, slot, status, serviceType);
}

bool DASystem::IsAvaliableSimStateOnPolling(int slot, int unread, TelSimCardStatus_t* status)
{
    return Ask(false, &DASimManager::IsAvaliableSimStateOnPolling, slot, unread, status);
}

bool DASystem::IsWaittingSimCheck(TelSimCardStatus_t status)
{
    return Ask(false, &DASimManager::IsWaittingSimCheck, status);
}

bool DASystem::GetMainSimSubscription(char* cpName, TelNetworkDefaultSubs_t* subs)
{
    return Ask(false, &DASimManager::GetMainSimSubscription, cpName, subs);
}

bool DASystem::GetCallPreferredSubscription(char* cpName, TelCallPreferredVoiceSubs_t* subs)
{
    return Ask(false, &DASimManager::GetCallPreferredSubscription, cpName, subs);
}

bool DASystem::GetDefaultDataSubscription(char* cpName, TelNetworkDefaultDataSubs_t* subs)
{
    return Ask(false, &DASimManager::GetDefaultDataSubscription, cpName, subs);
}

bool DASystem::CheckSmsEnabled(char* cpName, int* status)
{
    return Ask(false, &DASimManager::CheckSmsEnabled, cpName, status);
}

bool DASystem::GetSimInfo(const char* cpName, std::string* mcc, std::string* mnc, std::string* msin)
{
    return Ask(false, &DASimManager::GetSimInfo, cpName, mcc, mnc, msin);
}

bool DASystem::GetPhoneNumber(telephony_data** handle, char** number)
{
    return Ask(false, &DASimManager::GetPhoneNumber, handle, number);
}

bool DASystem::IsSimExist()
{
    return Ask(false, &DASimManager::IsSimExist);
}

int DASystem::GetDeviceUniqueID(const char** id)
{
    const char* uniqueId = nullptr;
    const int code =
        Ask<DADBusManager, int, const char*&>(KIV_RESULT_INVALID_ARGUMENT, &DADBusManager::GetDeviceUniqueID, uniqueId);
    *id = uniqueId;
    return code;
}

// SIM queries over all slots ---------------------------------------------------------------------------------------------------

bool DASystem::IsSimAvailable()
{
    const kiv::Slots slots;
    for (int slot = 0; slot < slots.Count(); ++slot)
    {
        if (slots.IsAvailable(slot))
            return true;
    }
    return false;
}

bool DASystem::IsDualSimAvailable()
{
    const kiv::Slots slots;
    if (!slots)
        return false;
    if (slots.Count() < 2)
    {
        KIV_ERROR("[Single Sim Device] Not support Dual Sim.");
        return false;
    }
    return slots.IsAvailable(0) && slots.IsAvailable(1);
}

int DASystem::GetMCCFromSim(char** mcc)
{
    return kiv::FirstAnswer(&DASimManager::GetMCCFromSim, mcc);
}

int DASystem::GetMNCFromSim(char** mnc)
{
    return kiv::FirstAnswer(&DASimManager::GetMNCFromSim, mnc);
}

int DASystem::GetIMSIFromSim(char** imsi)
{
    return kiv::FirstAnswer(&DASimManager::GetIMSIFromSim, imsi);
}

int DASystem::GetPhoneNumberFromSim(char** number)
{
    return kiv::FirstAnswer(&DASimManager::GetPhoneNumberFromSim, number);
}

void DASystem::GetMCCFromSim(std::vector<char*>* values, int* count)
{
    kiv::EveryAnswer(&DASimManager::GetMCCFromSim, values, count);
}

void DASystem::GetMNCFromSim(std::vector<char*>* values, int* count)
{
    kiv::EveryAnswer(&DASimManager::GetMNCFromSim, values, count);
}

void DASystem::GetIMSIFromSim(std::vector<char*>* values, int* count)
{
    kiv::EveryAnswer(&DASimManager::GetIMSIFromSim, values, count);
}

void DASystem::GetPhoneNumberFromSim(std::vector<char*>* values, int* count)
{
    kiv::EveryAnswer(&DASimManager::GetPhoneNumberFromSim, values, count);
}

// Country lookups --------------------------------------------------------------------------------------------------------------

namespace
{

/// Whether there is a key to look up; logs that there is none.
bool HasKey(const char* key, const char* keyName, const Place& here)
{
    if (key != nullptr && *key != '\0')
        return true;
    KIV_ERROR_AT(here, "%s is empty. %s finish.", keyName, here.function);
    return false;
}

using StringLookup = void (DASimManager::*)(const char*, char**);

/// A string lookup of the manager behind the guard.
void GuardedLookup(StringLookup lookup, const char* key, char** out, const char* keyName, const Place& here)
{
    if (!HasKey(key, keyName, here))
        return;
    char* found = nullptr;
    Ask(lookup, key, &found);
    *out = found;
}

/// The MCC of a calling code behind the guard; null, and logged, when there is none.
CString MccOfCallingCode(const char* countryCallingCode, const Place& here)
{
    if (!HasKey(countryCallingCode, "countryCallingCode", here))
        return nullptr;
    char* mcc = nullptr;
    Ask(&DASimManager::GetMccFromCountryCallingCode, countryCallingCode, &mcc);
    CString owner(mcc);
    return HasKey(mcc, "mcc", here) ? std::move(owner) : nullptr;
}

} // namespace

bool DASystem::IsValidMcc(char* mcc)
{
    return HasKey(mcc, "mcc", KIV_HERE) && Ask(false, &DASimManager::IsValidMcc, mcc);
}

bool DASystem::IsValidMcc(const char* mcc)
{
    return IsValidMcc(const_cast<char*>(mcc));
}

bool DASystem::IsMoSupportMcc(const char* mcc)
{
    return HasKey(mcc, "mcc", KIV_HERE) && Ask(false, &DASimManager::IsMoSupportMcc, mcc);
}

void DASystem::GetCountryCodeFromMcc(const char* mcc, char** countryCode)
{
    GuardedLookup(&DASimManager::GetCountryCodeFromMcc, mcc, countryCode, "mcc", KIV_HERE);
}

void DASystem::GetCountryNameFromMcc(const char* mcc, char** countryName)
{
    GuardedLookup(&DASimManager::GetCountryNameFromMcc, mcc, countryName, "mcc", KIV_HERE);
}

void DASystem::GetMccFromCountryCode(const char* countryCode, char** mcc)
{
    GuardedLookup(&DASimManager::GetMccFromCountryCode, countryCode, mcc, "countryCode", KIV_HERE);
}

void DASystem::GetMccFromServiceCountryCode(const char* serviceCountryCode, char** mcc)
{
    GuardedLookup(&DASimManager::GetMccFromServiceCountryCode, serviceCountryCode, mcc, "serviceCountryCode", KIV_HERE);
}

void DASystem::GetServiceCountryCodeFromMcc(const char* mcc, char** serviceCountryCode)
{
    GuardedLookup(&DASimManager::GetServiceCountryCodeFromMcc, mcc, serviceCountryCode, "mcc", KIV_HERE);
}

void DASystem::GetCountryCallingCodeFromMcc(const char* mcc, char** countryCallingCode)
{
    GuardedLookup(&DASimManager::GetCountryCallingCodeFromMcc, mcc, countryCallingCode, "mcc", KIV_HERE);
}

void DASystem::GetAlpha3CountryCodeFromMcc(const char* mcc, char** alpha3CountryCode)
{
    GuardedLookup(&DASimManager::GetAlpha3CountryCodeFromMcc, mcc, alpha3CountryCode, "mcc", KIV_HERE);
}

void DASystem::GetMccFromCountryCallingCode(const char* countryCallingCode, char** mcc)
{
    GuardedLookup(&DASimManager::GetMccFromCountryCallingCode, countryCallingCode, mcc, "countryCallingCode", KIV_HERE);
}

void DASystem::GetCountryNameFromCountryCallingCode(const char* countryCallingCode, char** countryName)
{
    const CString mcc = MccOfCallingCode(countryCallingCode, KIV_HERE);
    if (!mcc)
        return;
    char* found = nullptr;
    Ask(&DASimManager::GetCountryNameFromMcc, mcc.get(), &found);
    *countryName = found;
}

void DASystem::GetCountryNameAlpha2FromCountryCallingCode(const char* countryCallingCode, char** countryCode)
{
    const CString mcc = MccOfCallingCode(countryCallingCode, KIV_HERE);
    if (!mcc)
        return;
    // An MCC that two countries share is answered by the last of them.
    const std::size_t row = kiv::CountryInfoTable::mcc.LastRow(mcc.get());
    *countryCode = row == kiv::kNoRow ? nullptr : const_cast<char*>(kiv::CountryInfoTable::countryCode[row]);
}

// Notifications ----------------------------------------------------------------------------------------------------------------

int DASystem::SendNotiToServiceManager(_KIV_NOTI_TYPE_E type, const char* imsi, int service_id, const char* ServiceStatus,
    const char* PolicyFeature, const char* PolicyVersion, const char* PolicyDocURL)
{
    KIV_INFO("noti type [%d] service_id [%d]", type, service_id);
    g_autofree char* copy = g_strdup(imsi);

    const kiv::NotificationType* const row = kiv::FindType(type);
    if (row == nullptr)
    {
        KIV_ERROR("noti type error [%d]", type);
        return KIV_RESULT_INVALID_ARGUMENT;
    }
    constexpr int kNoManager = -1;
    int sent = kNoManager;
    switch (row->body)
    {
    case kiv::Body::Flag:
        sent = Ask(kNoManager, row->sendFlag, copy, row->flag);
        break;
    case kiv::Body::Status:
        sent = Ask(kNoManager, &DADBusManager::SendStatusNotification, copy, service_id, row->status);
        break;
    case kiv::Body::Policy:
        if (!kiv::HavePolicyTexts(KIV_HERE, ServiceStatus, PolicyFeature, PolicyVersion, PolicyDocURL))
            return KIV_RESULT_INVALID_ARGUMENT;
        sent = Ask(kNoManager, &DADBusManager::SendPolicyNotification, copy, service_id, ServiceStatus, PolicyFeature,
            PolicyVersion, PolicyDocURL);
        break;
    case kiv::Body::Number:
        sent = Ask(kNoManager, &DADBusManager::SendNumberChangedNotification, copy, ServiceStatus, PolicyFeature, PolicyVersion,
            PolicyDocURL);
        break;
    }
    return sent == kNoManager ? KIV_RESULT_INVALID_ARGUMENT : KIV_RESULT_SUCCESS; // what became of the calls is not told
}

int DASystem::SendMultiOnOffNotiToServiceManager(const char* imsi, int count, int* service_ids, char** statuses)
{
    if (count < 1 || service_ids == nullptr || statuses == nullptr)
    {
        KIV_ERROR("Invalid parameter");
        return 0;
    }
    for (int i = 0; i < count; ++i)
        Ask(0, &DADBusManager::SendStatusNotification, const_cast<char*>(imsi), service_ids[i], statuses[i]);
    return 0;
}

// Device and platform ----------------------------------------------------------------------------------------------------------

namespace
{

/// Reads one value of a platform service: stored in every case, zero or null when the service wrote none.
template <class Key, class Value>
int Read(int (*read)(Key, Value*), Key key, Value* out)
{
    Value value{};
    const int code = read(key, &value);
    *out = value;
    return code;
}

/// Reads a switch of a platform service; off when the service wrote none.
template <class Key>
bool ReadSwitch(int (*read)(Key, bool*), Key key)
{
    bool isOn = false;
    Read(read, key, &isOn);
    return isOn;
}

/// Hands out a copy of a platform's text; a service that succeeds without one gives null.
int CopyOut(const char* text, char** out)
{
    char* const copy = text == nullptr ? nullptr : strdup(text);
    if (text != nullptr && copy == nullptr)
        return -ENOMEM;
    *out = copy;
    return 0;
}

/// The IMEI of the first modem that answers, the platform's own text.
/// @return whether one answered
bool FirstImei(const Place& here, char** imei)
{
    const kiv::Slots slots;
    if (!slots)
        KIV_ERROR_AT(here, "telephony_init Failed. Start to get IMEI from current time");
    for (int slot = 0; slot < slots.Count(); ++slot)
    {
        char* value = nullptr;
        const int code = telephony_modem_get_imei(slots.Handle(slot), &value);
        CString owner(value);
        if (code == 0)
        {
            *imei = owner.release();
            return true;
        }
    }
    return false;
}

/// What stands in for an IMEI: the offset from UTC in seconds, filled up with zeros to the length of one.
char* FallbackImei()
{
    return kiv::NoThrow<char*>(nullptr,
        []
        {
            constexpr std::size_t kImeiLength = 15;
            const time_t now = time(nullptr);
            tm local = {};
            localtime_r(&now, &local);
            std::string text = DAUtil::GetInstance()->intToStr(static_cast<int>(local.tm_gmtoff));
            if (text.size() < kImeiLength)
                text.append(kImeiLength - text.size(), '0');
            return strdup(text.c_str());
        });
}

} // namespace

int DASystem::GetDeviceName(char** name)
{
    return Read(system_settings_get_value_string, SYSTEM_SETTINGS_KEY_DEVICE_NAME, name);
}

int DASystem::GetTizenIdN(char** id)
{
    char* value = nullptr;
    const int code = system_info_get_platform_string("tizen.org/system/tizenid", &value);
    const CString owner(value);
    if (code != 0)
    {
        KIV_ERROR("system_info_get_platform_string failed [%d]", code);
        return code;
    }
    return CopyOut(value, id);
}

int DASystem::GetFontSize(int* size)
{
    return Read(system_settings_get_value_int, SYSTEM_SETTINGS_KEY_FONT_SIZE, size);
}

int DASystem::GetCurrentTime(tm* now)
{
    tm local = {};
    const int code = alarm_get_current_time(&local);
    *now = local;
    return code;
}

int DASystem::GetPlatformName(char** name)
{
    return Read(system_info_get_platform_string, "tizen.org/system/platform.name", name);
}

int DASystem::GetSWVersion(char** version)
{
    return Read(system_info_get_platform_string, "tizen.org/feature/platform.version", version);
}

int DASystem::GetModelName(char** model)
{
    return Read(system_info_get_platform_string, "tizen.org/system/model_name", model);
}

int DASystem::GetPackageVersion(const char* packageId, char** version)
{
    package_info_h created = nullptr;
    int code = package_info_create(packageId, &created);
    if (code != 0)
    {
        KIV_ERROR("package_info_create failed [%d]", code);
        return code;
    }
    if (created == nullptr)
        return CopyOut(nullptr, version);
    kiv::Owned<std::remove_pointer_t<package_info_h>, package_info_destroy> info(created);
    char* value = nullptr;
    code = package_info_get_version(info.get(), &value);
    const CString owner(value);
    info.reset();
    return code != 0 ? code : CopyOut(value, version);
}

int DASystem::GetIMEI(char** imei)
{
    if (!FirstImei(KIV_HERE, imei))
        *imei = FallbackImei();
    return 0;
}

bool DASystem::IsFlightMode()
{
    return ReadSwitch(runtime_info_get_value_bool, RUNTIME_INFO_KEY_FLIGHT_MODE_ENABLED);
}

bool DASystem::IsDataRoamingEnabled()
{
    return ReadSwitch(runtime_info_get_value_bool, RUNTIME_INFO_KEY_DATA_ROAMING_ENABLED);
}

bool DASystem::IsMobileData()
{
    return ReadSwitch(system_settings_get_value_bool, SYSTEM_SETTINGS_KEY_3G_DATA_NETWORK_ENABLED);
}

bool DASystem::IsPackageInstalled(char* packageName)
{
    if (!HasKey(packageName, "PackageName", KIV_HERE))
        return false;

    const int code = package_manager_get_package_size_info(packageName, nullptr, nullptr);
    if (code == PACKAGE_MANAGER_ERROR_NONE)
        return true;
    if (code == PACKAGE_MANAGER_ERROR_NO_SUCH_PACKAGE)
        KIV_ERROR("No Such Package [%s]", packageName);
    else
        KIV_ERROR("Other Error Case.. [package_manager_error_e] code is %d", code);
    return false;
}

bool DASystem::IsSystemMemoryAvailable(double requiredMiB)
{
    struct statvfs stats = {};
    static_assert(sizeof stats.f_bavail == sizeof(std::uint64_t), "the platform writes the record with 64-bit counts");
    if (storage_get_internal_memory_size64(&stats) < 0)
    {
        KIV_ERROR("Fail to get internal memory size");
        return false;
    }
    constexpr double kMiB = 1024.0 * 1024.0;
    const double freeMiB =
        static_cast<double>(static_cast<std::uint32_t>(stats.f_bsize)) * static_cast<double>(stats.f_bavail) / kMiB;
    if (freeMiB > requiredMiB)
        return true;
    KIV_ERROR("Total mem under %lf", requiredMiB);
    return false;
}

char* DASystem::GetCSC()
{
    return vconf_get_str("db/csc/salescode");
}

// Device language --------------------------------------------------------------------------------------------------------------

int DASystem::GetDeviceLanguageCode(char** languageCode, bool isISO639)
{
    char* value = nullptr;
    const int code = system_settings_get_value_string(SYSTEM_SETTINGS_KEY_LOCALE_LANGUAGE, &value);
    const CString owner(value);
    const char* const setting = code == 0 && value != nullptr ? value : "en_us";

    return kiv::NoThrow(code,
        [&]
        {
            const int end = GetTagStartPosition(setting, "_");
            std::string language = GetValueFromPosition(setting, 0, end - 1);
            for (char& ch : language)
                ch = To_Capital(ch);

            char* iso = nullptr;
            if (isISO639)
                GetISO639LangCodeFromDeviceLang(language, &iso);
            const char* const answer = isISO639 ? iso : language.c_str();
            if (answer != nullptr)
                CopyOut(answer, languageCode);
            return code;
        });
}

void DASystem::GetISO639LangCodeFromDeviceLang(std::string deviceLang, char** iso639LangCode)
{
    const std::size_t row = kiv::ISO639LangCodeTable::deviceLangCode.FirstRow(deviceLang.c_str());
    *iso639LangCode = row == kiv::kNoRow ? nullptr : const_cast<char*>(kiv::ISO639LangCodeTable::iso639LangCode[row]);
}

int DASystem::GetTagStartPosition(std::string source, std::string tag)
{
    const auto position = source.find(tag);
    return position == std::string::npos ? -1 : static_cast<int>(position);
}

std::string DASystem::GetValueFromPosition(std::string source, int startPosition, int endPosition)
{
    // Widened first: a negative length becomes one that reaches to the end.
    const long long length = static_cast<long long>(endPosition) - startPosition + 1;
    return source.substr(static_cast<std::size_t>(startPosition), static_cast<std::size_t>(length));
}

char DASystem::To_Capital(char ch)
{
    return ch >= 'a' && ch <= 'z' ? static_cast<char>(ch - ('a' - 'A')) : ch;
}
