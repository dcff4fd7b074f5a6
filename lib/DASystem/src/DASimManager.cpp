#include "DASimManager.h"

#include "CardStatus.h"
#include "CountryTables.h"
#include "Handles.h"
#include "ResultCode.h"
#include "SimAccess.h"
#include "Singleton.h"

#include <cstdio>
#include <cstring>
#include <glib.h>
#include <unistd.h>
#include <utility>

using kiv::Alpha3CountryCodeTable;
using kiv::CountryCallingCodeTable;
using kiv::CountryInfoTable;
using kiv::CString;
using kiv::Place;
using kiv::ServiceCountryCodeTable;
using kiv::SimAccess;
using kiv::Tapi;

DASimManager* DASimManager::__pInstance = nullptr;

// Country tables ---------------------------------------------------------------------------------------------------------------

namespace
{

/// Copies the result cell of the first row with this key; null, and logs, when there is none.
template <class Keys, class Cells>
char* Lookup(const Keys& keys, const char* key, const Cells& cells, const Place& here, const char* failure)
{
    const std::size_t row = keys.FirstRow(key);
    if (row != kiv::kNoRow)
        return strdup(cells[row]);
    KIV_ERROR_AT(here, "%s", failure);
    return nullptr;
}

} // namespace

DASimManager* DASimManager::GetInstance()
{
    return kiv::Singleton(__pInstance, KIV_HERE, "SimManager() failed.");
}

DASimManager::DASimManager() = default;
DASimManager::~DASimManager() = default;

bool DASimManager::IsValidMcc(char* mcc)
{
    if (CountryInfoTable::mcc.FirstRow(mcc) != kiv::kNoRow)
        return true;
    KIV_ERROR("mcc is invalid");
    return false;
}

bool DASimManager::IsMoSupportMcc(const char* mcc)
{
    return kiv::MoSupportMccTable::mcc.FirstRow(mcc) != kiv::kNoRow;
}

void DASimManager::GetCountryCodeFromMcc(const char* mcc, char** countryCode)
{
    *countryCode = Lookup(CountryInfoTable::mcc, mcc, CountryInfoTable::countryCode, KIV_HERE, "fail to get countrycode");
}

void DASimManager::GetCountryNameFromMcc(const char* mcc, char** countryName)
{
    *countryName = Lookup(CountryInfoTable::mcc, mcc, CountryInfoTable::countryName, KIV_HERE, "fail to get countryName");
}

void DASimManager::GetMccFromCountryCode(const char* countryCode, char** mcc)
{
    *mcc = Lookup(CountryInfoTable::countryCode, countryCode, CountryInfoTable::mcc, KIV_HERE, "fail to get mcc");
}

void DASimManager::GetMccFromServiceCountryCode(const char* serviceCountryCode, char** mcc)
{
    *mcc = Lookup(
        ServiceCountryCodeTable::serviceCountryCode, serviceCountryCode, ServiceCountryCodeTable::mcc, KIV_HERE, "fail to get mcc");
}

void DASimManager::GetMccFromCountryCallingCode(const char* countryCallingCode, char** mcc)
{
    *mcc = Lookup(
        CountryCallingCodeTable::countryCallingCode, countryCallingCode, CountryCallingCodeTable::mcc, KIV_HERE, "fail to get mcc");
}

void DASimManager::GetServiceCountryCodeFromMcc(const char* mcc, char** serviceCountryCode)
{
    *serviceCountryCode = Lookup(
        ServiceCountryCodeTable::mcc, mcc, ServiceCountryCodeTable::serviceCountryCode, KIV_HERE, "fail to get serviceCountryCode");
}

void DASimManager::GetCountryCallingCodeFromMcc(const char* mcc, char** countryCallingCode)
{
    *countryCallingCode = Lookup(
        CountryCallingCodeTable::mcc, mcc, CountryCallingCodeTable::countryCallingCode, KIV_HERE, "fail to get countryCallingCode");
}

void DASimManager::GetAlpha3CountryCodeFromMcc(const char* mcc, char** alpha3CountryCode)
{
    *alpha3CountryCode = Lookup(
        Alpha3CountryCodeTable::mcc, mcc, Alpha3CountryCodeTable::alpha3CountryCode, KIV_HERE, "fail to get alpha3CountryCode");
}

// Locks and handles ------------------------------------------------------------------------------------------------------------

bool DASimManager::SuccessToInitTelephonyHandle(telephony_handle_list_s* list)
{
    telephony_handle_list_s opened = {};
    if (telephony_init(&opened) == 0 && opened.count != 0)
    {
        *list = opened;
        return true;
    }
    KIV_ERROR("telephony_init Failed.");
    return false;
}

void DASimManager::DeleteTelephonyHandle(telephony_handle_list_s list)
{
    telephony_deinit(&list);
}

bool DASimManager::InitHandleList(telephony_handle_list_s* list)
{
    const SimAccess access;
    return access && telephony_init(list) == 0;
}

bool DASimManager::DeinitHandleList(telephony_handle_list_s* list)
{
    const SimAccess access;
    return access && telephony_deinit(list) == 0;
}

char** DASimManager::GetCpNameList()
{
    const SimAccess access;
    return access ? tel_get_cp_name_list() : nullptr;
}

// SIM state --------------------------------------------------------------------------------------------------------------------

namespace
{

/// Opens a modem that may still be starting; null after 100 attempts, one per second.
Tapi WaitForModem(const Place& here, int slot)
{
    constexpr int kAttempts = 100;
    const kiv::CpNames names;
    for (int attempt = 1; attempt <= kAttempts; ++attempt)
    {
        if (Tapi modem = names.Open(slot))
            return modem;
        KIV_ERROR_AT(here, "wait tel_init[%d]", attempt);
        sleep(1);
    }
    KIV_ERROR_AT(here, "TapiHandle is null. fail.");
    return nullptr;
}

} // namespace

bool DASimManager::GetSimState(telephony_data** handle, telephony_sim_state_e* state)
{
    const SimAccess access;
    return access && telephony_sim_get_state(*handle, state) == 0;
}

bool DASimManager::IsSimExist()
{
    const SimAccess access;
    if (!access)
        return false;

    bool exists = false;
    const kiv::HandleList list;
    for (int slot = 0; slot < list.Count(); ++slot)
    {
        telephony_sim_state_e state = TELEPHONY_SIM_STATE_UNKNOWN;
        if (telephony_sim_get_state(list[slot], &state) != 0)
            continue;
        if (state == TELEPHONY_SIM_STATE_AVAILABLE)
            exists = true;
        else
            KIV_ERROR("SIM STATE[%d] : %s", slot, kiv::NameOf(state));
    }
    return exists;
}

bool DASimManager::IsSimAvailable(telephony_handle_list_s list, int slot)
{
    telephony_sim_state_e state = TELEPHONY_SIM_STATE_UNKNOWN;
    const bool isRead =
        kiv::HasSlot(list, slot) && kiv::UnderSimAccess([&] { return telephony_sim_get_state(list.handle[slot], &state); }) == 0;
    if (isRead && state == TELEPHONY_SIM_STATE_AVAILABLE)
        return true;
    KIV_ERROR("Sim is not available");
    return false;
}

bool DASimManager::IsAvaliableState(int slot, TelSimCardStatus_t* status)
{
    const SimAccess access;
    if (!access)
        return false;
    const Tapi modem = kiv::CpNames().Open(slot);
    return modem && kiv::ReadCardStatus(modem, status) == 0 && kiv::Judge(*status).isUsable;
}

bool DASimManager::IsAvaliableSimStateOnPolling(int slot, int, TelSimCardStatus_t* status)
{
    const Tapi modem = WaitForModem(KIV_HERE, slot);
    if (modem == nullptr)
        return false;

    int pauses = 0;
    kiv::OnPolling verdict = kiv::OnPolling::Wait;
    for (;;)
    {
        if (kiv::ReadCardStatus(modem, status) == 0)
        {
            KIV_INFO("current SIM Status[%d]", *status);
            verdict = kiv::Judge(*status).onPolling;
            if (verdict != kiv::OnPolling::Wait)
                break;
        }
        ++pauses;
        sleep(1);
    }
    const bool isUsable = verdict == kiv::OnPolling::Usable;
    KIV_INFO("slotNum[%d], result[%d], status[%d], time[%d]", slot, static_cast<int>(isUsable), *status, pauses);
    return isUsable;
}

bool DASimManager::IsWaittingSimCheck(TelSimCardStatus_t status)
{
    return kiv::Judge(status).isWaiting;
}

// SIM identity -----------------------------------------------------------------------------------------------------------------

namespace
{

/// Reads the IMSI record of a slot's modem.
bool ReadImsiRecord(int slot, TelSimImsiInfo_t& record)
{
    const Tapi modem = kiv::CpNames().Open(slot);
    return modem && kiv::UnderSimAccess([&] { return tel_get_sim_imsi(modem.get(), &record); }) == 0;
}

/// Reads a text from the IMSI record of a slot.
/// @param text  makes the text from a record, with strdup()
template <class Char, class Text>
int ReadImsiText(DASimManager& manager, const telephony_handle_list_s& list, int slot, Char** out, Text text, const Place& here,
    const char* failure)
{
    TelSimImsiInfo_t record = {};
    *out = manager.IsSimAvailable(list, slot) && ReadImsiRecord(slot, record) ? text(record) : nullptr;
    if (*out != nullptr)
        return 0;
    KIV_ERROR_AT(here, "%s", failure);
    return KIV_RESULT_INVALID_ARGUMENT;
}

} // namespace

int DASimManager::GetMCCFromSim(telephony_handle_list_s list, int slot, const char** mcc)
{
    const auto text = [](const TelSimImsiInfo_t& record) { return strdup(record.szMcc); };
    return ReadImsiText(*this, list, slot, mcc, text, KIV_HERE, "fail to get MCC");
}

int DASimManager::GetMNCFromSim(telephony_handle_list_s list, int slot, char** mnc)
{
    const auto text = [](const TelSimImsiInfo_t& record) { return strdup(record.szMnc); };
    return ReadImsiText(*this, list, slot, mnc, text, KIV_HERE, "fail to get MNC");
}

int DASimManager::GetIMSIFromSim(telephony_handle_list_s list, int slot, char** imsi)
{
    const auto text = [](const TelSimImsiInfo_t& record)
    {
        char joined[sizeof record];
        std::snprintf(joined, sizeof joined, "%s%s%s", record.szMcc, record.szMnc, record.szMsin);
        return strdup(joined);
    };
    return ReadImsiText(*this, list, slot, imsi, text, KIV_HERE, "fail to get imsi");
}

int DASimManager::GetPhoneNumberFromSim(telephony_handle_list_s list, int slot, char** number)
{
    *number = nullptr;
    if (IsSimAvailable(list, slot))
    {
        char* text = nullptr;
        const int code = kiv::UnderSimAccess([&] { return telephony_sim_get_subscriber_number(list.handle[slot], &text); });
        const CString owner(text);
        if (code == 0 && text != nullptr)
            *number = strdup(text);
    }
    if (*number != nullptr)
        return 0;
    KIV_ERROR("fail to get phoneNumber");
    return TELEPHONY_ERROR_SIM_NOT_AVAILABLE;
}

bool DASimManager::GetPhoneNumber(telephony_data** handle, char** number)
{
    KIV_INFO("Enter");
    const SimAccess access;
    if (!access)
        return false;

    KIV_INFO("Before telephony_sim_get_subscriber_number");
    const int code = telephony_sim_get_subscriber_number(*handle, number);
    if (code != 0)
    {
        KIV_ERROR("telephony_sim_get_subscriber_number errno [%d]", code);
        return false;
    }
    KIV_INFO("After telephony_sim_get_subscriber_number");
    return true;
}

bool DASimManager::GetSimInfo(const char* cpName, std::string* mcc, std::string* mnc, std::string* msin)
{
    const SimAccess access;
    if (!access)
        return false;

    const Tapi modem(tel_init(cpName));
    if (modem == nullptr)
    {
        KIV_ERROR("tel_init error");
        return false;
    }
    TelSimImsiInfo_t record = {};
    const int code = tel_get_sim_imsi(modem.get(), &record);
    if (code != 0)
    {
        KIV_ERROR("tel_get_sim_imsi errno [%d]", code);
        return false;
    }
    // Copies all texts first and then moves them, so that the caller's three texts stay unchanged when there is no memory.
    return kiv::NoThrow(false,
        [&]
        {
            std::string parts[] = {record.szMcc, record.szMnc, record.szMsin};
            *mcc = std::move(parts[0]);
            *mnc = std::move(parts[1]);
            *msin = std::move(parts[2]);
            return true;
        });
}

bool DASimManager::GetRoamingStatus(int slot, bool* roaming)
{
    const SimAccess access;
    if (!access || roaming == nullptr)
        return false;

    const kiv::HandleList list;
    telephony_network_service_state_e state = TELEPHONY_NETWORK_SERVICE_STATE_OUT_OF_SERVICE;
    if (!list.Has(slot) || telephony_network_get_service_state(list[slot], &state) != 0 ||
        state != TELEPHONY_NETWORK_SERVICE_STATE_IN_SERVICE)
        return false;

    bool isRoaming = false;
    if (telephony_network_get_roaming_status(list[slot], &isRoaming) != 0)
        return false;
    *roaming = isRoaming;
    return true;
}

// Subscriptions and SMS readiness ----------------------------------------------------------------------------------------------

namespace
{

/// Reads one value of a modem, by the modem's name.
template <class Value>
bool ReadFromModem(const char* cpName, int (*read)(TapiHandle*, Value*), Value* value)
{
    const SimAccess access;
    if (!access)
        return false;
    const Tapi modem(tel_init(cpName));
    return modem && read(modem.get(), value) == 0;
}

} // namespace

bool DASimManager::GetMainSimSubscription(char* cpName, TelNetworkDefaultSubs_t* subs)
{
    return ReadFromModem(cpName, tel_get_network_default_subscription, subs);
}

bool DASimManager::GetCallPreferredSubscription(char* cpName, TelCallPreferredVoiceSubs_t* subs)
{
    return ReadFromModem(cpName, tel_get_call_preferred_voice_subscription, subs);
}

bool DASimManager::GetDefaultDataSubscription(char* cpName, TelNetworkDefaultDataSubs_t* subs)
{
    return ReadFromModem(cpName, tel_get_network_default_data_subscription, subs);
}

bool DASimManager::CheckSmsEnabled(char* cpName, int* status)
{
    return ReadFromModem(cpName, tel_check_sms_device_status, status);
}

bool DASimManager::IsAvaliableSendSMS(int slot, TelSimCardStatus_t* status, int* serviceType)
{
    constexpr int kSearching = 3; // a modem with a higher service type has service
    const SimAccess access;
    if (!access)
        return false;

    const Tapi modem = kiv::CpNames().Open(slot);
    if (modem == nullptr)
        return false;
    const int code = kiv::ReadCardStatus(modem, status);
    if (code != 0)
    {
        KIV_ERROR("Not available. ret[%d]", code);
        return false;
    }
    if (tel_get_property_int(modem.get(), TAPI_PROP_NETWORK_SERVICE_TYPE, serviceType) != 0)
        return false;
    KIV_ERROR("NetworkSvc[%d]", *serviceType);
    return *serviceType > kSearching;
}
