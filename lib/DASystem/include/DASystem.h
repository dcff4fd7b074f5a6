#ifndef DASYSTEM_H
#define DASYSTEM_H

#include "DATypes.h"
#include "IDAConnectionStateListener.h"
#include "ResultCode.h"

#include <ITapiCall.h>
#include <ITapiNetText.h>
#include <ITapiNetwork.h>
#include <ITapiSim.h>
#include <TapiUtility.h>
#include <telephony.h>

#include <ctime>
#include <string>
#include <vector>

/// The facade of the library: answers the agent's queries about device, SIMs, countries and network, and sends its notifications.
///
/// It keeps no state between calls. Results are copies, released with free(), unless documented otherwise. Any thread may call any
/// member; SetConnectionEventListener() has restrictions. When there is no memory for a manager, a member that calls the manager
/// returns its failure result: false, null, code 4 or KIV_CONNECTION_STATE_UNKNOWN. A member that always returns 0 also returns 0
/// then.
class KIV_SYSTEM_API DASystem
{
public:
    /// Returns the single instance. The first call creates it, and it is never deleted. Null when there is no memory for it; then
    /// the next call tries again. Any thread; holds a separate lock.
    static DASystem* GetInstance();

    DASystem();          ///< holds nothing; use GetInstance() instead
    virtual ~DASystem(); ///< releases nothing

    /// @name Connection state
    /// See the members of the same name in DAConnectionManager.
    /// @{

    /// Registers the listener of connection changes; null unregisters.
    void SetConnectionEventListener(IDAConnectionStateListener* listener, void* userData);

    /// @return a connection_cellular_state_e, or KIV_CONNECTION_STATE_UNKNOWN (-1) when it cannot be read
    int GetCellularNetworkState();

    /// @return a connection_wifi_state_e, or KIV_CONNECTION_STATE_UNKNOWN (-1) when it cannot be read
    int GetWifiNetworkState();

    /// @return a connection_bt_state_e, or KIV_CONNECTION_STATE_UNKNOWN (-1) when it cannot be read
    int GetBTNetworkState();

    /// @return whether the cellular connection or a selected other one is up
    bool IsNetworkConnected(bool checkWifi, bool checkBT);
    /// @}

    /// @name Telephony and SIM by slot or modem
    /// See the members of the same name in DASimManager.
    /// @{

    /// Reads whether the device is roaming on a slot that is in service. @return whether it was read; false for a null pointer
    bool GetRoamingStatus(int slot, bool* roaming);

    /// Opens the telephony handles of all slots, closed with DeinitHandleList().
    bool InitHandleList(telephony_handle_list_s* list);

    /// @return the names of the modems, null-terminated, released with g_strfreev(); or null
    char** GetCpNameList();

    /// Closes what InitHandleList() opened.
    bool DeinitHandleList(telephony_handle_list_s* list);

    /// Reads a card status. @return whether the card's initialisation is completed
    bool IsAvaliableState(int slot, TelSimCardStatus_t* status);

    /// @return whether an SMS can be sent on a slot
    bool IsAvaliableSendSMS(int slot, TelSimCardStatus_t* status, int* serviceType);

    /// Waits until a card is usable or never will be, without a time limit once its modem is open. Ignores the second argument.
    /// @return whether it is usable
    bool IsAvaliableSimStateOnPolling(int slot, int, TelSimCardStatus_t* status);

    /// @return whether a card with that status may become usable later
    bool IsWaittingSimCheck(TelSimCardStatus_t status);

    /// Reads which SIM is the default one for the network.
    bool GetMainSimSubscription(char* cpName, TelNetworkDefaultSubs_t* subs);

    /// Reads which SIM is preferred for voice calls.
    bool GetCallPreferredSubscription(char* cpName, TelCallPreferredVoiceSubs_t* subs);

    /// Reads which SIM carries mobile data.
    bool GetDefaultDataSubscription(char* cpName, TelNetworkDefaultDataSubs_t* subs);

    /// Reads the ready status of a modem's SMS service.
    bool CheckSmsEnabled(char* cpName, int* status);

    /// Reads the parts of the IMSI by modem name.
    bool GetSimInfo(const char* cpName, std::string* mcc, std::string* mnc, std::string* msin);

    /// Reads the subscriber number by handle.
    bool GetPhoneNumber(telephony_data** handle, char** number);

    /// @return whether the SIM of at least one slot is available
    bool IsSimExist();
    /// @}

    /// @name SIM queries over all slots
    /// Each opens the telephony handles, queries the slots in ascending order, and closes the handles. Each blocks on the modems.
    /// @{

    /// @return whether the SIM of at least one slot is available
    bool IsSimAvailable();

    /// @return whether the SIMs of slots 0 and 1 are both available
    bool IsDualSimAvailable();

    /// Reads the MCC of the first SIM that answers.
    /// @return 0, or 4 when no SIM answers, telephony cannot be opened or there is no memory for the copy; then the out-parameter
    ///         is unchanged
    int GetMCCFromSim(char** mcc);

    /// Reads the MNC of the first SIM that answers. @return as GetMCCFromSim()
    int GetMNCFromSim(char** mnc);

    /// Reads the IMSI of the first SIM that answers. @return as GetMCCFromSim()
    int GetIMSIFromSim(char** imsi);

    /// Reads the subscriber number of the first SIM that answers.
    /// @return 0; TELEPHONY_ERROR_SIM_NOT_AVAILABLE when no SIM answers; 4 when telephony cannot be opened or there is no memory
    ///         for the copy. On failure the out-parameter is unchanged.
    int GetPhoneNumberFromSim(char** number);

    /// Appends the MCC of every SIM that answers, and nothing for the others.
    /// @param values  release each appended text with free()
    /// @param count   receives the number of appended texts; unchanged, like the vector, when telephony cannot be opened
    void GetMCCFromSim(std::vector<char*>* values, int* count);

    /// Appends the MNC of every SIM that answers. See GetMCCFromSim().
    void GetMNCFromSim(std::vector<char*>* values, int* count);

    /// Appends the IMSI of every SIM that answers. See GetMCCFromSim().
    void GetIMSIFromSim(std::vector<char*>* values, int* count);

    /// Appends the subscriber number of every SIM that answers. See GetMCCFromSim().
    void GetPhoneNumberFromSim(std::vector<char*>* values, int* count);
    /// @}

    /// @name Country lookups
    /// See the members of the same name in DASimManager. In addition, a null or empty key is logged and refused: the result is
    /// false or the out-parameter is unchanged.
    /// @{

    /// @return whether the MCC belongs to a country
    bool IsValidMcc(char* mcc);

    /// @return whether the MCC belongs to a country
    bool IsValidMcc(const char* mcc);

    /// @return whether the country with that MCC supports mobile-originated messages
    bool IsMoSupportMcc(const char* mcc);

    /// MCC to alpha-2 code.
    void GetCountryCodeFromMcc(const char* mcc, char** countryCode);

    /// MCC to English country name.
    void GetCountryNameFromMcc(const char* mcc, char** countryName);

    /// Alpha-2 code to MCC.
    void GetMccFromCountryCode(const char* countryCode, char** mcc);

    /// Service country code to MCC.
    void GetMccFromServiceCountryCode(const char* serviceCountryCode, char** mcc);

    /// MCC to service country code.
    void GetServiceCountryCodeFromMcc(const char* mcc, char** serviceCountryCode);

    /// MCC to calling code.
    void GetCountryCallingCodeFromMcc(const char* mcc, char** countryCallingCode);

    /// MCC to alpha-3 code.
    void GetAlpha3CountryCodeFromMcc(const char* mcc, char** alpha3CountryCode);

    /// Calling code to MCC.
    void GetMccFromCountryCallingCode(const char* countryCallingCode, char** mcc);

    /// Calling code to English country name; the out-parameter is unchanged when no country has that calling code.
    void GetCountryNameFromCountryCallingCode(const char* countryCallingCode, char** countryName);

    /// Calling code to alpha-2 code, despite the name; the out-parameter is unchanged when no country has that calling code.
    /// @param countryCallingCode  digits without a prefix
    /// @param countryCode         receives constant text of the library; do not free or change it
    void GetCountryNameAlpha2FromCountryCallingCode(const char* countryCallingCode, char** countryCode);
    /// @}

    /// @name Bus
    /// @{

    /// Requests the device unique ID, which is the board serial number. Nothing is cached.
    /// @param id  always written: receives a text, released with g_free(), or null
    /// @return a result code of DADBusManager
    /// Blocks on the bus, once connected at most 25 seconds.
    int GetDeviceUniqueID(const char** id);

    /// Notifies every client service that subscribed to the event, one after the other. To notify the service manager, call the
    /// member of the same name in DADBusManager.
    /// @param type        the event
    /// @param imsi        subscriber identity of the SIM concerned
    /// @param service_id  for types 3, 4 and 5
    /// @param ServiceStatus,PolicyFeature,PolicyVersion,PolicyDocURL  for types 5 and 8, which require all four
    /// @return 0, even if calls failed; 4 when the type is unknown or a text of type 5 is null
    /// Blocks until the last subscriber has answered or left the bus, without a time limit.
    int SendNotiToServiceManager(_KIV_NOTI_TYPE_E type, const char* imsi, int service_id, const char* ServiceStatus,
        const char* PolicyFeature, const char* PolicyVersion, const char* PolicyDocURL);

    /// Sends one status notification per entry, in order.
    /// @param imsi         subscriber identity of the SIM concerned
    /// @param count        number of entries in each array, at least 1
    /// @param service_ids  one service per notification
    /// @param statuses     one status text per notification
    /// @return 0
    /// Blocks like SendNotiToServiceManager().
    int SendMultiOnOffNotiToServiceManager(const char* imsi, int count, int* service_ids, char** statuses);
    /// @}

    /// @name Device and platform
    /// An int result is the platform's own code, 0 on success, or -ENOMEM when there is no memory for a copy. When the platform
    /// succeeds without a text, the out-parameter receives null. Texts are released with free(). Each blocks on the platform.
    /// @{

    /// Reads the device's name; null when the platform returns none.
    int GetDeviceName(char** name);

    /// Reads the platform's device ID; unchanged on failure.
    int GetTizenIdN(char** id);

    /// Reads the font size setting; not meaningful on failure.
    int GetFontSize(int* size);

    /// Reads the current local time; all zero when the platform returns none, as after 19 January 2038 with a 32-bit time_t.
    int GetCurrentTime(tm* now);

    /// Reads the platform's name; null when the platform returns none.
    int GetPlatformName(char** name);

    /// Reads the platform's version; null when the platform returns none.
    int GetSWVersion(char** version);

    /// Reads the device's model name; null when the platform returns none.
    int GetModelName(char** model);

    /// Reads the version of an installed package; unchanged on failure, null when the platform succeeds without one.
    int GetPackageVersion(const char* packageId, char** version);

    /// Reads the IMEI of the first modem that answers. When none does, returns a text of at least 15 characters: the local time's
    /// offset from UTC in seconds, followed by zeros; null when there is no memory for it. That text does not identify the device:
    /// all devices in a time zone have the same one, and west of Greenwich it starts with a minus sign.
    /// @return 0
    int GetIMEI(char** imei);

    /// @return whether flight mode is on; false also when the query fails
    bool IsFlightMode();

    /// @return whether data roaming is on; false also when the query fails
    bool IsDataRoamingEnabled();

    /// @return whether mobile data is on; false also when the query fails
    bool IsMobileData();

    /// @return whether a package of that name is installed; false also for a null or empty name, and when the query fails
    bool IsPackageInstalled(char* packageName);

    /// @param requiredMiB  in mebibytes of 1,048,576 bytes
    /// @return whether more than that is free in the internal storage; false also when the query fails
    bool IsSystemMemoryAvailable(double requiredMiB);

    /// @return the sales code; null when it cannot be read
    char* GetCSC();
    /// @}

    /// @name Device language
    /// Only the first one blocks.
    /// @{

    /// Reads the language setting of the device; uses "en_us" if it cannot be read.
    /// @param languageCode  receives a copy, released with free(); unchanged when the language has no known ISO 639-2 code, or
    ///                      when there is no memory
    /// @param isISO639      true for the ISO 639-2 code ("eng"), false for the language part of the setting in upper case ("EN")
    /// @return the platform's code for reading the setting. Blocks on the platform.
    int GetDeviceLanguageCode(char** languageCode, bool isISO639);

    /// ISO 639-1 code in upper case to ISO 639-2 code.
    /// @param deviceLang      ISO 639-1, upper case
    /// @param iso639LangCode  receives constant text of the library, or null; do not free or change it
    void GetISO639LangCodeFromDeviceLang(std::string deviceLang, char** iso639LangCode);

    /// @return the index at which tag first occurs in source; -1 when it does not
    int GetTagStartPosition(std::string source, std::string tag);

    /// @return the part of source from startPosition to endPosition, both included; empty when endPosition is startPosition - 1,
    ///         and up to the end of source when it is even lower
    /// Throws std::out_of_range when startPosition is negative or beyond the end of source. No other member throws.
    std::string GetValueFromPosition(std::string source, int startPosition, int endPosition);

    /// @return the capital of a lower-case ASCII letter; any other byte unchanged
    char To_Capital(char ch);
    /// @}

    static DASystem* __pInstance; ///< the instance; null until it is made
};

#endif
