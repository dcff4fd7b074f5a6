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

/// The facade of the library: what the agent asks about device, SIMs, countries and network, and what it has to tell.
///
/// It keeps no state: nothing is remembered from one call to the next. Results are copies that the caller releases with free()
/// unless a member says otherwise. Any thread may call any member, SetConnectionEventListener() as told there. When a manager
/// behind the facade can not be made for want of memory, a member gives its failure result: false, null, a code of 4, a connection
/// state of 0; what always returns 0 still does.
class KIV_SYSTEM_API DASystem
{
public:
    /// The one instance, made on first use, never deleted; null when there is no memory for it, and the next call tries again.
    /// Any thread; holds a lock of its own.
    static DASystem* GetInstance();

    DASystem();          ///< holds nothing; GetInstance() gives the one to ask
    virtual ~DASystem(); ///< releases nothing

    /// @name Connection state
    /// As DAConnectionManager tells of the members of the same names.
    /// @{

    /// Registers the listener of connection changes; null unregisters.
    void SetConnectionEventListener(IDAConnectionStateListener* listener, void* userData);

    /// @return a connection_cellular_state_e; KIV_CONNECTION_STATE_UNKNOWN, which is -1, when it cannot be read
    int GetCellularNetworkState();

    /// @return a connection_wifi_state_e; KIV_CONNECTION_STATE_UNKNOWN when it cannot be read
    int GetWifiNetworkState();

    /// @return a connection_bt_state_e; KIV_CONNECTION_STATE_UNKNOWN when it cannot be read
    int GetBTNetworkState();

    /// @return whether the cellular connection or another selected one is up
    bool IsNetworkConnected(bool checkWifi, bool checkBT);
    /// @}

    /// @name Telephony and SIM by slot or modem
    /// As DASimManager tells of the members of the same names.
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

    /// Waits until a card is usable or never will be, without a bound once its modem is open; the second argument is not read.
    /// @return whether it is usable
    bool IsAvaliableSimStateOnPolling(int slot, int, TelSimCardStatus_t* status);

    /// @return whether a card of that status may become usable by waiting
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

    /// Reads the subscriber number behind one handle.
    bool GetPhoneNumber(telephony_data** handle, char** number);

    /// @return whether the SIM of at least one slot is available
    bool IsSimExist();
    /// @}

    /// @name SIM queries over all slots
    /// Each opens the handles itself, asks the slots in ascending order and closes them again. Blocks on the modems.
    /// @{

    /// @return whether the SIM of some slot is available
    bool IsSimAvailable();

    /// @return whether the device has two slots at least and the SIMs of slots 0 and 1 are available
    bool IsDualSimAvailable();

    /// The MCC of the first SIM that answers.
    /// @return 0; 4 when no SIM answers, telephony can not be opened or there is no memory for the copy, and the out-parameter is
    ///         untouched
    int GetMCCFromSim(char** mcc);

    /// The MNC of the first SIM that answers. @return as GetMCCFromSim()
    int GetMNCFromSim(char** mnc);

    /// The IMSI of the first SIM that answers. @return as GetMCCFromSim()
    int GetIMSIFromSim(char** imsi);

    /// The subscriber number of the first SIM that answers.
    /// @return 0; 4 when telephony can not be opened or there is no memory for the copy, TELEPHONY_ERROR_SIM_NOT_AVAILABLE when no
    ///         SIM answers, and the out-parameter is untouched
    int GetPhoneNumberFromSim(char** number);

    /// Appends the MCC of every SIM that answers; a SIM that does not leaves no gap.
    /// @param values  each text appended is released with free()
    /// @param count   receives the number appended by this call; like the vector untouched when telephony can not be opened
    void GetMCCFromSim(std::vector<char*>* values, int* count);

    /// Appends the MNC of every SIM that answers, as the MCC one does.
    void GetMNCFromSim(std::vector<char*>* values, int* count);

    /// Appends the IMSI of every SIM that answers, as the MCC one does.
    void GetIMSIFromSim(std::vector<char*>* values, int* count);

    /// Appends the subscriber number of every SIM that answers, as the MCC one does.
    void GetPhoneNumberFromSim(std::vector<char*>* values, int* count);
    /// @}

    /// @name Country lookups
    /// As DASimManager tells of the members of the same names, with a guard: a null or empty key is logged, gives false, and
    /// leaves the out-parameter as it was.
    /// @{

    /// @return whether the MCC is one of a country
    bool IsValidMcc(char* mcc);

    /// @return whether the MCC is one of a country
    bool IsValidMcc(const char* mcc);

    /// @return whether the MCC is one of those that support mobile-originated messages
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

    /// Calling code to English country name; the out-parameter is untouched when no country has that calling code.
    void GetCountryNameFromCountryCallingCode(const char* countryCallingCode, char** countryName);

    /// Calling code to alpha-2 code, despite the name; the out-parameter is untouched when no country has that calling code.
    /// @param countryCallingCode  bare digits
    /// @param countryCode         receives constant text of the library, which the caller neither frees nor changes
    void GetCountryNameAlpha2FromCountryCallingCode(const char* countryCallingCode, char** countryCode);
    /// @}

    /// @name Bus
    /// @{

    /// Asks for the device unique ID, the board serial number, afresh on each call.
    /// @param id  receives a text released with g_free(), or null; written in every case
    /// @return a result code of DADBusManager. Blocks on the bus, 25 seconds at most once connected.
    int GetDeviceUniqueID(const char** id);

    /// Tells every client service that subscribed to the event, one after the other. The service manager is told with the member
    /// of DADBusManager of the same name.
    /// @param type        what it is about
    /// @param imsi        subscriber identity of the SIM concerned
    /// @param service_id  of types 3, 4 and 5
    /// @param ServiceStatus,PolicyFeature,PolicyVersion,PolicyDocURL  texts of types 5 and 8, all four required
    /// @return 0 once dispatched, whatever became of the calls; 4 when the type is unknown or a text of type 5 is null
    /// Blocks until the last subscriber answered or left the bus, without a time limit.
    int SendNotiToServiceManager(_KIV_NOTI_TYPE_E type, const char* imsi, int service_id, const char* ServiceStatus,
        const char* PolicyFeature, const char* PolicyVersion, const char* PolicyDocURL);

    /// Sends one status notification an entry, in order.
    /// @param imsi         subscriber identity of the SIM concerned
    /// @param count        number of entries of both arrays, at least 1
    /// @param service_ids  one service a notification
    /// @param statuses     one status text a notification
    /// @return 0
    /// Blocks as SendNotiToServiceManager() does.
    int SendMultiOnOffNotiToServiceManager(const char* imsi, int count, int* service_ids, char** statuses);
    /// @}

    /// @name Device and platform
    /// An int result is the platform's own code, 0 on success; -ENOMEM when there is no memory for a copy. A platform that succeeds
    /// without a text gives null. Texts are released with free(). Each blocks on the platform.
    /// @{

    /// The device's name; null when the platform gives none.
    int GetDeviceName(char** name);

    /// The platform's device ID; untouched on failure.
    int GetTizenIdN(char** id);

    /// The font size setting; not meaningful on failure.
    int GetFontSize(int* size);

    /// The current local time; all zero when the platform gives none, as after 19 January 2038 where its time_t has 32 bits.
    int GetCurrentTime(tm* now);

    /// The platform's name; null when the platform gives none.
    int GetPlatformName(char** name);

    /// The platform's version; null when the platform gives none.
    int GetSWVersion(char** version);

    /// The device's model name; null when the platform gives none.
    int GetModelName(char** model);

    /// The version of an installed package; untouched on failure, null when the platform succeeds without one.
    int GetPackageVersion(const char* packageId, char** version);

    /// The IMEI of the first modem that answers; when none does, a text of 15 characters at least that is made of the local
    /// time's offset from UTC in seconds, followed by zeros; null when there is no memory for it. That text does not identify the
    /// device: all devices in a time zone have the same one, and it starts with a minus sign west of Greenwich.
    /// @return 0
    int GetIMEI(char** imei);

    /// @return whether flight mode is on; false when the platform does not tell
    bool IsFlightMode();

    /// @return whether data roaming is on; false when the platform does not tell
    bool IsDataRoamingEnabled();

    /// @return whether mobile data is on; false when the platform does not tell
    bool IsMobileData();

    /// @return whether a package of that name is installed; false for a null or empty name, and when the platform does not tell
    bool IsPackageInstalled(char* packageName);

    /// @param requiredMiB  in mebibytes of 1,048,576 bytes
    /// @return whether more than that is free in the internal storage; false when the platform does not tell
    bool IsSystemMemoryAvailable(double requiredMiB);

    /// @return the sales code; null when it can not be read
    char* GetCSC();
    /// @}

    /// @name Device language
    /// None blocks but the first.
    /// @{

    /// The language that the device is set to; "en_us" stands in for a setting that can not be read.
    /// @param languageCode  receives a copy released with free(); untouched when the language has no ISO 639-2 code here, or there
    ///                      is no memory
    /// @param isISO639      true for the ISO 639-2 code ("eng"), false for the language part of the setting in upper case ("EN")
    /// @return the platform's code of reading the setting. Blocks on the platform.
    int GetDeviceLanguageCode(char** languageCode, bool isISO639);

    /// ISO 639-1 code in upper case to ISO 639-2 code.
    /// @param deviceLang      ISO 639-1, upper case
    /// @param iso639LangCode  receives constant text of the library, which the caller must not free; null when there is none
    void GetISO639LangCodeFromDeviceLang(std::string deviceLang, char** iso639LangCode);

    /// @return the index of the first place where the whole of tag stands in source; -1 when there is none
    int GetTagStartPosition(std::string source, std::string tag);

    /// @return the part of source between the two positions, both included; to its end when the end stands further before the
    ///         start than by one
    /// Throws std::out_of_range when the start lies beyond the end of source or is negative: the one member that may throw.
    std::string GetValueFromPosition(std::string source, int startPosition, int endPosition);

    /// @return the capital of a lower-case ASCII letter, any other byte unchanged
    char To_Capital(char ch);
    /// @}

    static DASystem* __pInstance; ///< the instance, null until it is made
};

#endif
