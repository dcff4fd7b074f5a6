// Members of the facade that only forward. They log nothing themselves, so no log line contains this file's name.
#include "DASystem.h"

#include "DAConnectionManager.h"
#include "DADBusManager.h"
#include "DASimManager.h"
#include "Forward.h"
#include "ResultCode.h"

using kiv::Ask;

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
