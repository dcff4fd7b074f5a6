/// @file
/// Controls the simulated device, which implements the platform's C interfaces on a workstation. Sets the device's values, makes
/// its services fail, records calls, and reports misused handles. For tests and tools; the library never calls it. Any thread may
/// call any function here.
#ifndef KIV_DEVICE_DEVICECONTROL_H
#define KIV_DEVICE_DEVICECONTROL_H

#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <vector>

#pragma GCC visibility push(default)

namespace kiv::platform
{

/// The platform's functions except __dlog_print(), by name: Call::tel_init.
enum class Call
{
#define CALL(name) name,
#include "calls.inc"
#undef CALL
};

/// Returns the name of a function, such as "tel_init".
const char* NameOf(Call call);

/// @name The device
/// @{

/// A function of the device that fails: it returns the code and does nothing else. One that returns a pointer returns null.
struct BrokenCall
{
    Call call;
    int code;
    unsigned number = 0; ///< the only call that fails, counted from 1 since the device was set; 0 if every call fails
    unsigned seen = 0;   ///< number of calls so far
};

/// A text of the device; reading it fails if it is missing.
using Text = std::optional<std::string>;

struct SimSlot
{
    std::string cpName;
    std::vector<int> cardStatus{3}; ///< TelSimCardStatus_t for successive reads; the last one is repeated
    std::optional<int> simState;    ///< telephony_sim_state_e; if missing, follows the card status
    Text mcc, mnc, msin;            ///< reading the IMSI fails if one is missing
    Text number;                    ///< if missing, reading it succeeds and returns null
    Text imei;
    int serviceState = 0; ///< telephony_network_service_state_e
    bool roaming = false;
    int serviceType = 5; ///< TAPI_PROP_NETWORK_SERVICE_TYPE
    int smsStatus = 1;
    unsigned cardReads = 0; ///< number of reads of the card status: the position in cardStatus
};

/// The values of the device. Code may set any value, even one that device files must not contain.
struct Device
{
    std::string description;
    bool telephony = true; ///< false: telephony_init() fails, and there is no list of CP names
    int defaultNetwork = 0, preferredVoice = 0, defaultData = 0;
    std::vector<SimSlot> slots;

    Text tizenId, platformName, platformVersion, modelName, salesCode, serial;
    std::optional<std::int64_t> currentTime; ///< seconds since 1970; if missing, the host's clock
    Text deviceName, language;
    std::optional<int> fontSize = 1;
    bool mobileData = true;
    bool flightMode = false, packetData = true, dataRoaming = false;
    int wifiStatus = 0; ///< runtime_info_wifi_status_e
    int cellularState = 0, wifiState = 0, bluetoothState = 0;
    int wifiDeviceState = 0, wifiConnectionState = 0;
    std::uint32_t blockSize = 4096;
    std::uint64_t blocksAvailable = 0;
    std::map<std::string, std::string> packages; ///< version by package ID
    std::vector<BrokenCall> faults;              ///< the first that matches decides; those for a single call come first

    std::map<std::string, std::string> reasons; ///< why a value is missing, if known, by "GROUP.KEY" as in a device file
};

/// Returns the device as it is now. Initially it is the profile or device file that the environment variable KIV_PROFILE names, by
/// default the profile "dual". If that cannot be used, the device is empty and every platform call fails. The first failed call
/// prints the reason on standard error, unless DeviceTrouble() was called before.
Device GetDevice();

/// Replaces the device. Registered callbacks for each changed value run on this thread before it returns. The device no longer
/// follows a file.
void SetDevice(const Device& device);

/// Like SetDevice(), but modifies the present device, which continues to follow its file if it has one. `change` must not call the
/// platform or this control.
void ChangeDevice(const std::function<void(Device&)>& change);

/// Returns one of the device's `reasons`: why a value is missing or inexact; empty if unknown.
/// @param key  "GROUP.KEY" as in a device file
std::string ReasonFor(const std::string& key);

/// Returns what is wrong with the profile or file that KIV_PROFILE names; empty if it is valid.
std::string DeviceTrouble();

/// Restores the initial state: the environment's device, no registrations, faults, hooks, journal or misuses. Closes open handles.
void ResetDevice();

/// @}
/// @name Calls
/// @{

constexpr int kNoSlot = -1; ///< for calls without a slot, and for faults on every slot

/// The calls that a fault affects, counted from the moment when it is set. A fault for one slot counts only calls on that slot.
struct CallNumbers
{
    unsigned first;
    unsigned last;
};

constexpr CallNumbers kEveryCall{1, ~0U};
constexpr CallNumbers From(unsigned number)
{
    return {number, ~0U};
}
constexpr CallNumbers Only(unsigned number)
{
    return {number, number};
}

/// The effect of a call that fails on demand.
enum class Leavings
{
    Nothing,   ///< the call does nothing: out-parameters are unchanged
    ItsResults ///< the call does its work, and then reports the code
};

/// Makes calls of one function return `code`. Code 0 with Leavings::Nothing is an empty success: an out-parameter that stays null,
/// or a list without handles. A function that returns a pointer returns null and leaves nothing behind, whatever the code. Faults
/// add up; of those that affect a call, the first one set decides. They take precedence over Device::faults, which do not count the
/// calls that fail here. They remain when the device is replaced.
void FailCall(Call call, int code, CallNumbers which = kEveryCall, int slot = kNoSlot, Leavings leavings = Leavings::Nothing);

/// Removes all faults set by FailCall(), but not those of the device.
void ClearFaults();

/// Runs in every call, on the caller's thread, before the call does its work. The journal contains the text that it returns. It may
/// block, and may call other functions of the platform, which then run without the hook. Null removes the hook.
using CallHook = std::function<std::string(Call call, int slot)>;
void SetCallHook(CallHook hook);

/// One call, recorded when it returns.
struct JournalEntry
{
    Call call;
    int slot;         ///< kNoSlot for a call without a slot
    int result;       ///< the code; for a function that returns a pointer, the code of its failure
    std::string note; ///< text from the hook
};

/// Starts to keep an entry for every call, and drops earlier entries. Initially off.
void StartJournal();

/// Returns the entries kept since StartJournal() or the last TakeJournal().
std::vector<JournalEntry> TakeJournal();
void StopJournal();

/// @}
/// @name Handles: telephony handle lists and handles, TAPI handles, package and connection handles
/// @{

/// Describes each open handle: its kind, its slot, and where it was opened.
std::vector<std::string> OpenHandles();

/// Returns and removes the descriptions of misused handles: closed twice, used after closing, passed to another service, or never
/// opened. Such a call does nothing and returns an error code.
std::vector<std::string> TakeMisuses();

/// @}
} // namespace kiv::platform

#pragma GCC visibility pop

#endif
