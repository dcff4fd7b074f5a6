/// @file
/// The remote control of the simulated device that stands behind the platform's C interfaces on a workstation: what the device
/// is, which of its services fail, what was asked of it, and what was done wrong with its handles. For tests and tools; the
/// product never calls it. Any thread may call anything here.
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

/// The platform's functions but __dlog_print(), each under its own name: Call::tel_init.
enum class Call
{
#define CALL(name) name,
#include "calls.inc"
#undef CALL
};

/// "tel_init" of Call::tel_init.
const char* NameOf(Call call);

/// @name The device
/// @{

/// A function of the device that fails: it returns the code and does nothing else. One that returns a pointer returns null.
struct BrokenCall
{
    Call call;
    int code;
    unsigned number = 0; ///< the only call that fails, counted from 1 since this device is in place; 0 when every call fails
    unsigned seen = 0;   ///< how many calls there were
};

/// A text that the device may lack: then reading it fails.
using Text = std::optional<std::string>;

struct SimSlot
{
    std::string cpName;
    std::vector<int> cardStatus{3}; ///< TelSimCardStatus_t over successive reads of it; the last one stays
    std::optional<int> simState;    ///< telephony_sim_state_e; without one it follows the card status
    Text mcc, mnc, msin;            ///< reading the IMSI fails unless all three are there
    Text number;                    ///< without one, reading it succeeds and gives null
    Text imei;
    int serviceState = 0; ///< telephony_network_service_state_e
    bool roaming = false;
    int serviceType = 5; ///< TAPI_PROP_NETWORK_SERVICE_TYPE
    int smsStatus = 1;
    unsigned cardReads = 0; ///< how often the card status was read, which is where its script stands
};

/// All that the device answers from. Code may set any value, also one that no device file may hold.
struct Device
{
    std::string description;
    bool telephony = true; ///< false: telephony_init() fails, and there is no list of CP names
    int defaultNetwork = 0, preferredVoice = 0, defaultData = 0;
    std::vector<SimSlot> slots;

    Text tizenId, platformName, platformVersion, modelName, salesCode, serial;
    std::optional<std::int64_t> currentTime; ///< seconds since 1970; without one it is the host's clock
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
    std::vector<BrokenCall> faults;              ///< the first that fits decides, one for a single call before one for every call

    std::map<std::string, std::string> reasons; ///< why a value is missing, by "GROUP.KEY" as in a device file, where that is known
};

/// The device as it is. Before anything was set, it is what the environment variable KIV_PROFILE names, a profile or a device
/// file, and the profile "dual" without it. If that cannot be used, this is a device without anything, and every platform call
/// fails. The first of them prints the reason on standard error, unless somebody has read it from DeviceTrouble().
Device GetDevice();

/// Replaces the device. Registered callbacks for each value that differs run before it returns, on this thread. The device
/// follows no file from then on.
void SetDevice(const Device& device);

/// As SetDevice(), with what `change` makes of the device as it is; a device that follows a file goes on following it. `change`
/// calls nothing of the platform or of this control.
void ChangeDevice(const std::function<void(Device&)>& change);

/// Why the device has no such value, or cannot know it better: one of its `reasons`; empty where none is known.
/// @param key  "GROUP.KEY" as in a device file
std::string ReasonFor(const std::string& key);

/// What is wrong with the profile or file that KIV_PROFILE names; empty when nothing is.
std::string DeviceTrouble();

/// Back to the beginning: the environment's device, no registrations, faults, hooks, journal, misuses. Handles that are still
/// open are closed.
void ResetDevice();

/// @}
/// @name Calls
/// @{

constexpr int kNoSlot = -1; ///< the slot of a call that concerns none, or of a fault for calls on every slot

/// Which calls a fault hits, counted from its arming and, if it is for one slot, among the calls on that slot.
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

/// What a call that is made to fail leaves behind.
enum class Leavings
{
    Nothing,   ///< the call does nothing: out-parameters stay untouched
    ItsResults ///< the call does its work, and then reports the code
};

/// Makes calls of one function give `code`. A code of 0 with no leavings is a success that brings nothing: an out-parameter
/// that stays null, a list of no handles. A function that gives a pointer gives null and leaves nothing, whatever the code.
/// Faults add up; the first armed that hits decides. They come before those of the device (Device::faults), which do not count
/// the calls that end here, and stay when the device is replaced.
void FailCall(Call call, int code, CallNumbers which = kEveryCall, int slot = kNoSlot, Leavings leavings = Leavings::Nothing);

/// Disarms all that FailCall() armed; those of the device stay.
void ClearFaults();

/// Runs within every call, on the caller's thread, before the call does its work; the text that it gives stands in the
/// journal. It may block and may call other functions of the platform, whose calls then run without it. Null ends it.
using CallHook = std::function<std::string(Call call, int slot)>;
void SetCallHook(CallHook hook);

/// One call, written down when it returns.
struct JournalEntry
{
    Call call;
    int slot;         ///< kNoSlot where the call concerns none
    int result;       ///< the code; of a function that gives a pointer, what its failure stood for
    std::string note; ///< what the hook gave
};

/// Keeps an entry for every call from now on; entries kept before are dropped. Off until then.
void StartJournal();

/// The entries kept since StartJournal() or the last TakeJournal().
std::vector<JournalEntry> TakeJournal();
void StopJournal();

/// @}
/// @name Handles: telephony handle lists and handles, TAPI handles, package and connection handles
/// @{

/// Each handle that is open: its kind, its slot, and where it was opened.
std::vector<std::string> OpenHandles();

/// Each wrong use of a handle so far: closed twice, used after closing, given to another service, never one. Such a call does
/// nothing else, and gives an error code. Forgets what it gives.
std::vector<std::string> TakeMisuses();

/// @}
} // namespace kiv::platform

#pragma GCC visibility pop

#endif
