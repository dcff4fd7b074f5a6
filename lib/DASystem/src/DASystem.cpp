#include "DASystem.h"

#include "CountryTables.h"
#include "DAConnectionManager.h"
#include "DADBusManager.h"
#include "DASimManager.h"
#include "Forward.h"
#include "GuardedLookup.h"
#include "Handles.h"
#include "Notifications.h"
#include "PlatformRead.h"
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

#include <cstdint>
#include <cstring>

using kiv::Ask;
using kiv::CopyOut;
using kiv::CString;
using kiv::GuardedLookup;
using kiv::HasKey;
using kiv::MccOfCallingCode;
using kiv::Place;
using kiv::Read;
using kiv::ReadSwitch;

DASystem* DASystem::__pInstance = nullptr;

DASystem* DASystem::GetInstance()
{
    return kiv::Singleton(__pInstance, KIV_HERE, "CoreSystem() failed.");
}

DASystem::DASystem() = default;
DASystem::~DASystem() = default;

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
    if (mcc == nullptr)
        return;
    char* found = nullptr;
    Ask(&DASimManager::GetCountryNameFromMcc, mcc.get(), &found);
    *countryName = found;
}

void DASystem::GetCountryNameAlpha2FromCountryCallingCode(const char* countryCallingCode, char** countryCode)
{
    const CString mcc = MccOfCallingCode(countryCallingCode, KIV_HERE);
    if (mcc == nullptr)
        return;
    // If two countries share an MCC, returns the last one.
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
    return sent == kNoManager ? KIV_RESULT_INVALID_ARGUMENT : KIV_RESULT_SUCCESS; // even if calls failed
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

/// Reads the IMEI of the first modem that answers, the platform's text without a copy.
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

/// Returns a substitute for the IMEI: the offset from UTC in seconds, padded with zeros to the same length.
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
