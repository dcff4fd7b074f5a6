#ifndef DASIMMANAGER_H
#define DASIMMANAGER_H

#include "DATypes.h"

#include <ITapiCall.h>
#include <ITapiNetText.h>
#include <ITapiNetwork.h>
#include <ITapiSim.h>
#include <TapiUtility.h>
#include <telephony.h>

#include <string>

/// Reads SIM state, identity and subscriptions, opens telephony handles, and searches the country tables.
///
/// A slot is a 0-based index, the same in the handle list and in the list of modem (CP) names. A read fails if either list
/// lacks the slot. Every operation blocks on the modem unless documented otherwise, and may be called from any thread: the named
/// lock "CORE_MUTEX_NAME_SIM_ACCESS" serialises SIM access. Each operation documents whether it holds the lock throughout or per
/// read.
class KIV_SYSTEM_API DASimManager
{
public:
    /// Returns the single instance. The first call creates it, and it is never deleted. Null when there is no memory for it; then
    /// the next call tries again. Any thread; holds a separate lock.
    static DASimManager* GetInstance();

    DASimManager();          ///< holds nothing; use GetInstance() instead
    virtual ~DASimManager(); ///< releases nothing

    /// @name Telephony handles
    /// @{

    /// Opens the telephony handles of all slots.
    /// @param list  receives one handle per slot, at least one, released with DeleteTelephonyHandle(); unchanged on failure
    /// @return whether they were opened. Takes no lock.
    bool SuccessToInitTelephonyHandle(telephony_handle_list_s* list);

    /// Closes what SuccessToInitTelephonyHandle() opened. Takes no lock.
    void DeleteTelephonyHandle(telephony_handle_list_s list);

    /// Opens the telephony handles of all slots, closed with DeinitHandleList().
    /// @return whether the platform opened them. Holds the lock.
    bool InitHandleList(telephony_handle_list_s* list);

    /// Closes what InitHandleList() opened.
    /// @return whether the platform closed them. Holds the lock.
    bool DeinitHandleList(telephony_handle_list_s* list);

    /// @return the names of the modems, null-terminated, released with g_strfreev(); null when there are none. Holds the lock.
    char** GetCpNameList();
    /// @}

    /// @name SIM state
    /// @{

    /// Reads the SIM state by handle.
    /// @return whether it was read. Holds the lock.
    bool GetSimState(telephony_data** handle, telephony_sim_state_e* state);

    /// @return whether the SIM of at least one slot is available. Holds the lock.
    bool IsSimExist();

    /// @param list  open handle list; borrowed, stays open
    /// @param slot  0-based
    /// @return whether the SIM of that slot is available. Holds the lock during the read.
    bool IsSimAvailable(telephony_handle_list_s list, int slot);

    /// Reads the card status of a slot.
    /// @param slot    0-based
    /// @param status  receives the status on success
    /// @return whether the card's initialisation is completed. Holds the lock.
    bool IsAvaliableState(int slot, TelSimCardStatus_t* status);

    /// Reads the card status of a slot once per second until the card is usable or never will be.
    /// @param slot    0-based
    /// @param status  receives the last status read
    /// @return whether the card's initialisation is completed; false also when 100 attempts to open the modem failed
    /// Once the modem is open, waits without a time limit, for example for a card's PIN. Makes 100 attempts also for a slot that
    /// does not exist. Ignores the second argument. Takes no lock.
    bool IsAvaliableSimStateOnPolling(int slot, int, TelSimCardStatus_t* status);

    /// @return whether a card with that status may become usable later. Does not block; takes no lock.
    bool IsWaittingSimCheck(TelSimCardStatus_t status);
    /// @}

    /// @name SIM identity
    /// Each reads one slot of an open handle list, which is borrowed and stays open. The texts are copies, released with free();
    /// null on failure. Each holds the lock during each of its reads, not between them.
    /// @{

    /// Reads the mobile country code.
    /// @return 0, or 4 when the slot has no usable SIM or the read fails
    int GetMCCFromSim(telephony_handle_list_s list, int slot, const char** mcc);

    /// Reads the mobile network code, of 2 or 3 digits.
    /// @return 0, or 4 when the slot has no usable SIM or the read fails
    int GetMNCFromSim(telephony_handle_list_s list, int slot, char** mnc);

    /// Reads the IMSI: MCC, MNC and MSIN joined.
    /// @return 0, or 4 when the slot has no usable SIM or the read fails
    int GetIMSIFromSim(telephony_handle_list_s list, int slot, char** imsi);

    /// Reads the subscriber number, possibly an empty text.
    /// @return 0, or TELEPHONY_ERROR_SIM_NOT_AVAILABLE when the slot has no usable SIM or the modem returns no number
    int GetPhoneNumberFromSim(telephony_handle_list_s list, int slot, char** number);
    /// @}

    /// Reads the subscriber number by handle.
    /// @param handle  one of an open handle list; borrowed, stays open
    /// @param number  receives the platform's text, possibly null, released with free()
    /// @return whether the platform answered. Holds the lock.
    bool GetPhoneNumber(telephony_data** handle, char** number);

    /// Reads the parts of the IMSI by modem name; the three texts are unchanged on failure.
    /// @return whether they were read. Holds the lock.
    bool GetSimInfo(const char* cpName, std::string* mcc, std::string* mnc, std::string* msin);

    /// Reads whether the device is roaming on a slot that is in service.
    /// @param slot     0-based
    /// @param roaming  written on success only
    /// @return whether it was read; false also without service and for a null pointer. Holds the lock.
    bool GetRoamingStatus(int slot, bool* roaming);

    /// @name Subscriptions and SMS readiness
    /// Each reads one value of a modem by its CP name, and passes the platform's value on unchanged. Each returns whether it was
    /// read, and holds the lock.
    /// @{

    /// Reads which SIM is the default one for the network.
    bool GetMainSimSubscription(char* cpName, TelNetworkDefaultSubs_t* subs);

    /// Reads which SIM is preferred for voice calls.
    bool GetCallPreferredSubscription(char* cpName, TelCallPreferredVoiceSubs_t* subs);

    /// Reads which SIM carries mobile data.
    bool GetDefaultDataSubscription(char* cpName, TelNetworkDefaultDataSubs_t* subs);

    /// Reads the ready status of the modem's SMS service.
    bool CheckSmsEnabled(char* cpName, int* status);
    /// @}

    /// Checks whether an SMS can be sent on a slot.
    /// @param slot         0-based
    /// @param status       receives the card status, which does not affect the result
    /// @param serviceType  receives the network service type: 0 unknown, 1 none, 2 emergency only, 3 searching, 4 and above normal
    /// @return whether the card status was read and the service type is above 3. Holds the lock.
    bool IsAvaliableSendSMS(int slot, TelSimCardStatus_t* status, int* serviceType);

    /// @name Country lookups
    /// Forms of keys and results: MCC of three digits (ITU-T E.212), alpha-2 code in lower case and alpha-3 code in upper case
    /// (ISO 3166-1), calling code as digits without a prefix (ITU-T E.164), service country code such as "en_GB". A key must match
    /// exactly; if several rows match, the first is used. The result is a copy, released with free(); null when nothing matches
    /// (logged, also for a null key) or there is no memory. None of them blocks.
    /// @{

    /// @return whether the MCC belongs to a country; logged when not
    bool IsValidMcc(char* mcc);

    /// @return whether the country with that MCC supports mobile-originated messages; never logged
    bool IsMoSupportMcc(const char* mcc);

    /// MCC to alpha-2 code.
    void GetCountryCodeFromMcc(const char* mcc, char** countryCode);

    /// MCC to English country name.
    void GetCountryNameFromMcc(const char* mcc, char** countryName);

    /// Alpha-2 code to MCC.
    void GetMccFromCountryCode(const char* countryCode, char** mcc);

    /// Service country code to MCC.
    void GetMccFromServiceCountryCode(const char* serviceCountryCode, char** mcc);

    /// Calling code to MCC.
    void GetMccFromCountryCallingCode(const char* countryCallingCode, char** mcc);

    /// MCC to service country code.
    void GetServiceCountryCodeFromMcc(const char* mcc, char** serviceCountryCode);

    /// MCC to calling code.
    void GetCountryCallingCodeFromMcc(const char* mcc, char** countryCallingCode);

    /// MCC to alpha-3 code.
    void GetAlpha3CountryCodeFromMcc(const char* mcc, char** alpha3CountryCode);
    /// @}

    static DASimManager* __pInstance; ///< the instance; null until it is made
};

#endif
