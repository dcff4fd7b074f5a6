#include "Reports.h"

#include "ITapiSim.h"
#include "net_connection.h"
#include "runtime_info.h"
#include "telephony.h"
#include "wifi.h"

#include <algorithm>
#include <cstring>
#include <utility>
#include <vector>

namespace kiv::platform
{

namespace
{

constexpr char kModem[] = "org.freedesktop.ModemManager1.Modem";
constexpr char kModem3gpp[] = "org.freedesktop.ModemManager1.Modem.Modem3gpp";
constexpr char kMessaging[] = "org.freedesktop.ModemManager1.Modem.Messaging";
constexpr char kSim[] = "org.freedesktop.ModemManager1.Sim";
constexpr char kNetwork[] = "org.freedesktop.NetworkManager";
constexpr char kNetworkPath[] = "/org/freedesktop/NetworkManager";
constexpr char kNetworkDevice[] = "org.freedesktop.NetworkManager.Device";
constexpr char kActive[] = "org.freedesktop.NetworkManager.Connection.Active";
constexpr char kSettings[] = "org.freedesktop.NetworkManager.Settings.Connection";
constexpr char kMobileSettings[] = "gsm"; // a group of a connection's settings
constexpr char kAdapter[] = "org.bluez.Adapter1";
constexpr char kNone[] = "/"; // path of an object that is not there

template <std::size_t count>
int Lookup(const std::pair<int, int> (&table)[count], int key, int fallback)
{
    const auto* const found = std::find_if(table, table + count, [key](const auto& row) { return row.first == key; });
    return found == table + count ? fallback : found->second;
}

// Enumerations of ModemManager and NetworkManager are those of their D-Bus interfaces, which never change a number.
// clang-format off

// MMModemState, but for "failed" and "locked", which depend on more.
constexpr std::pair<int, int> kCardOfState[] = {
    {0,  TAPI_SIM_STATUS_UNKNOWN},
    {1,  TAPI_SIM_STATUS_SIM_INITIALIZING},
    {3,  TAPI_SIM_STATUS_SIM_INIT_COMPLETED}, // disabled
    {4,  TAPI_SIM_STATUS_SIM_INIT_COMPLETED}, // disabling
    {5,  TAPI_SIM_STATUS_SIM_INIT_COMPLETED}, // enabling
    {6,  TAPI_SIM_STATUS_SIM_INIT_COMPLETED}, // enabled
    {7,  TAPI_SIM_STATUS_SIM_INIT_COMPLETED}, // searching
    {8,  TAPI_SIM_STATUS_SIM_INIT_COMPLETED}, // registered
    {9,  TAPI_SIM_STATUS_SIM_INIT_COMPLETED}, // disconnecting
    {10, TAPI_SIM_STATUS_SIM_INIT_COMPLETED}, // connecting
    {11, TAPI_SIM_STATUS_SIM_INIT_COMPLETED}, // connected
};
constexpr int kFailed = -1, kLocked = 2, kConnected = 11;

// MMModemStateFailedReason
constexpr std::pair<int, int> kCardOfFailure[] = {
    {0, TAPI_SIM_STATUS_CARD_ERROR},
    {1, TAPI_SIM_STATUS_CARD_ERROR},       // unknown
    {2, TAPI_SIM_STATUS_CARD_NOT_PRESENT}, // no SIM
    {3, TAPI_SIM_STATUS_CARD_ERROR},       // a SIM that fails
    {4, TAPI_SIM_STATUS_CARD_ERROR},       // a modem of unknown capabilities
    {5, TAPI_SIM_STATUS_CARD_NOT_PRESENT}, // an eSIM without a profile
};

// MMModemLock of a modem whose state is "locked"
constexpr std::pair<int, int> kCardOfLock[] = {
    {0,  TAPI_SIM_STATUS_UNKNOWN},
    {1,  TAPI_SIM_STATUS_SIM_INITIALIZING},  // none: just unlocked
    {2,  TAPI_SIM_STATUS_SIM_PIN_REQUIRED},
    {3,  TAPI_SIM_STATUS_SIM_INIT_COMPLETED}, // PIN2, which few functions need
    {4,  TAPI_SIM_STATUS_SIM_PUK_REQUIRED},
    {5,  TAPI_SIM_STATUS_SIM_INIT_COMPLETED}, // PUK2
    {6,  TAPI_SIM_STATUS_SIM_SPCK_REQUIRED},  // service provider
    {7,  TAPI_SIM_STATUS_SIM_SPCK_REQUIRED},
    {8,  TAPI_SIM_STATUS_SIM_NCK_REQUIRED},   // network
    {9,  TAPI_SIM_STATUS_SIM_NCK_REQUIRED},
    {10, TAPI_SIM_STATUS_SIM_LOCK_REQUIRED},  // the SIM's phone
    {11, TAPI_SIM_STATUS_SIM_CCK_REQUIRED},   // corporate
    {12, TAPI_SIM_STATUS_SIM_CCK_REQUIRED},
    {13, TAPI_SIM_STATUS_SIM_LOCK_REQUIRED},  // the very first SIM
    {14, TAPI_SIM_STATUS_SIM_LOCK_REQUIRED},
    {15, TAPI_SIM_STATUS_SIM_NSCK_REQUIRED},  // network subset
    {16, TAPI_SIM_STATUS_SIM_NSCK_REQUIRED},
};

constexpr int kServiceNone = 1, kServiceEmergency = 2, kServiceSearching = 3; // "org.tizen.telephony.Network:service_type"

// MMModem3gppRegistrationState
struct Registration
{
    int service;
    bool isRoaming;
    int type; // of service; 0 for that of the access technology
    int cellular;
};
constexpr Registration kRegistrations[] = {
    /* idle */            {TELEPHONY_NETWORK_SERVICE_STATE_OUT_OF_SERVICE, false, kServiceNone,      CONNECTION_CELLULAR_STATE_OUT_OF_SERVICE},
    /* home */            {TELEPHONY_NETWORK_SERVICE_STATE_IN_SERVICE,     false, 0,                 CONNECTION_CELLULAR_STATE_AVAILABLE},
    /* searching */       {TELEPHONY_NETWORK_SERVICE_STATE_OUT_OF_SERVICE, false, kServiceSearching, CONNECTION_CELLULAR_STATE_OUT_OF_SERVICE},
    /* denied */          {TELEPHONY_NETWORK_SERVICE_STATE_OUT_OF_SERVICE, false, kServiceNone,      CONNECTION_CELLULAR_STATE_OUT_OF_SERVICE},
    /* unknown */         {TELEPHONY_NETWORK_SERVICE_STATE_OUT_OF_SERVICE, false, kServiceNone,      CONNECTION_CELLULAR_STATE_OUT_OF_SERVICE},
    /* roaming */         {TELEPHONY_NETWORK_SERVICE_STATE_IN_SERVICE,     true,  0,                 CONNECTION_CELLULAR_STATE_ROAMING},
    /* home, SMS only */  {TELEPHONY_NETWORK_SERVICE_STATE_IN_SERVICE,     false, 0,                 CONNECTION_CELLULAR_STATE_CALL_ONLY_AVAILABLE},
    /* roaming, SMS */    {TELEPHONY_NETWORK_SERVICE_STATE_IN_SERVICE,     true,  0,                 CONNECTION_CELLULAR_STATE_CALL_ONLY_AVAILABLE},
    /* emergency only */  {TELEPHONY_NETWORK_SERVICE_STATE_EMERGENCY_ONLY, false, kServiceEmergency, CONNECTION_CELLULAR_STATE_OUT_OF_SERVICE},
    /* home, no CSFB */   {TELEPHONY_NETWORK_SERVICE_STATE_IN_SERVICE,     false, 0,                 CONNECTION_CELLULAR_STATE_AVAILABLE},
    /* roaming, no CSFB */{TELEPHONY_NETWORK_SERVICE_STATE_IN_SERVICE,     true,  0,                 CONNECTION_CELLULAR_STATE_ROAMING},
    /* restricted */      {TELEPHONY_NETWORK_SERVICE_STATE_EMERGENCY_ONLY, false, kServiceEmergency, CONNECTION_CELLULAR_STATE_OUT_OF_SERVICE},
};
constexpr int kUnregistered = 4; // where nothing is said

// MMModemAccessTechnology, the bits of a generation; the latest one that is there counts
struct Generation
{
    std::uint32_t technologies;
    int type;
};
constexpr Generation kGenerations[] = {
    {1U << 15,                                                       10}, // 5G
    {1U << 14 | 1U << 16 | 1U << 17,                                  9}, // LTE, LTE-M, NB-IoT
    {1U << 6 | 1U << 7 | 1U << 8 | 1U << 9,                           8}, // HSPA
    {1U << 5 | 1U << 11 | 1U << 12 | 1U << 13,                        7}, // UMTS, EVDO
    {1U << 4,                                                         6}, // EDGE
    {1U << 3 | 1U << 10,                                              5}, // GPRS, 1xRTT
    {~0U,                                                             4}, // GSM, or not known
};

// NMDeviceState of a Wi-Fi device; below, it is not connected
constexpr std::pair<int, int> kWifiConnections[] = {
    {40,  WIFI_CONNECTION_STATE_ASSOCIATION},   // prepare
    {50,  WIFI_CONNECTION_STATE_ASSOCIATION},   // config
    {60,  WIFI_CONNECTION_STATE_ASSOCIATION},   // needs a secret
    {70,  WIFI_CONNECTION_STATE_CONFIGURATION}, // IP configuration
    {80,  WIFI_CONNECTION_STATE_CONFIGURATION}, // IP check
    {90,  WIFI_CONNECTION_STATE_CONFIGURATION}, // secondary connections
    {100, WIFI_CONNECTION_STATE_CONNECTED},
    {120, WIFI_CONNECTION_STATE_FAILURE},
};
// clang-format on
constexpr int kUnmanaged = 10, kUnavailable = 20, kActivated = 100;    // NMDeviceState
constexpr int kWifiDevice = 2, kBluetoothDevice = 5, kModemDevice = 8; // NMDeviceType
constexpr int kPowerOff = 1, kPowerLow = 2;                            // MMModemPowerState

// One interface of one object. What was not reported, or is of another type, is the fallback.
class Reported
{
public:
    Reported(const Objects& objects, const std::string& path, const char* interface)
    {
        const auto object = objects.find(path);
        if (object == objects.end())
            return;
        const auto found = object->second.find(interface);
        properties_ = found == object->second.end() ? nullptr : &found->second;
    }

    explicit operator bool() const { return properties_ != nullptr; }

    int Number(const char* name, int fallback = 0) const
    {
        GVariant* const value = Find(name);
        if (value != nullptr && g_variant_is_of_type(value, G_VARIANT_TYPE_INT32) != FALSE)
            return g_variant_get_int32(value);
        if (value != nullptr && g_variant_is_of_type(value, G_VARIANT_TYPE_UINT32) != FALSE)
            return static_cast<int>(g_variant_get_uint32(value));
        return fallback;
    }

    bool Flag(const char* name) const
    {
        GVariant* const value = Find(name);
        return value != nullptr && g_variant_is_of_type(value, G_VARIANT_TYPE_BOOLEAN) != FALSE &&
               g_variant_get_boolean(value) != FALSE;
    }

    // A text or path, or the first of an array of those; empty when there is none.
    std::string Text(const char* name) const
    {
        GVariant* const value = Find(name);
        if (value == nullptr)
            return {};
        if (g_variant_is_of_type(value, G_VARIANT_TYPE_STRING) != FALSE ||
            g_variant_is_of_type(value, G_VARIANT_TYPE_OBJECT_PATH) != FALSE)
            return g_variant_get_string(value, nullptr);
        const bool isList = g_variant_is_of_type(value, G_VARIANT_TYPE_STRING_ARRAY) != FALSE ||
                            g_variant_is_of_type(value, G_VARIANT_TYPE_OBJECT_PATH_ARRAY) != FALSE;
        if (!isList || g_variant_n_children(value) == 0)
            return {};
        const Variant first(g_variant_get_child_value(value, 0), g_variant_unref);
        return g_variant_get_string(first.get(), nullptr);
    }

private:
    GVariant* Find(const char* name) const
    {
        if (properties_ == nullptr)
            return nullptr;
        const auto found = properties_->find(name);
        return found == properties_->end() ? nullptr : found->second.get();
    }

    const Properties* properties_ = nullptr;
};

// A part of the report that is empty is one that no text stands for.
Text Given(const std::string& text)
{
    return text.empty() ? Text() : Text(text);
}

// Paths of the objects that have the interface; those of modems in the order of the slots.
std::vector<std::string> PathsWith(const Objects& objects, const char* interface)
{
    std::vector<std::string> paths;
    for (const auto& [path, interfaces] : objects)
        if (interfaces.count(interface) != 0)
            paths.push_back(path);
    std::stable_sort(paths.begin(), paths.end(),
        [&](const std::string& one, const std::string& other)
        {
            const auto compare = [&](const char* property)
            {
                return strverscmp(Reported(objects, one, interface).Text(property).c_str(),
                    Reported(objects, other, interface).Text(property).c_str());
            };
            const int device = compare("Device");
            return device != 0 ? device < 0 : compare("PrimaryPort") < 0;
        });
    return paths;
}

int CardStatusOf(const Objects& objects, const Reported& modem)
{
    const int state = modem.Number("State");
    const std::string sim = modem.Text("Sim");
    if (state == kFailed)
        return Lookup(kCardOfFailure, modem.Number("StateFailedReason"), TAPI_SIM_STATUS_CARD_ERROR);
    if (modem.Number("PowerState") == kPowerOff)
        return TAPI_SIM_STATUS_CARD_POWEROFF;
    const int card = state == kLocked ? Lookup(kCardOfLock, modem.Number("UnlockRequired"), TAPI_SIM_STATUS_SIM_LOCK_REQUIRED)
                                      : Lookup(kCardOfState, state, TAPI_SIM_STATUS_UNKNOWN);
    if (card != TAPI_SIM_STATUS_SIM_INIT_COMPLETED)
        return card;
    if (sim.empty() || sim == kNone)
        return TAPI_SIM_STATUS_CARD_NOT_PRESENT;
    return objects.count(sim) != 0 ? card : TAPI_SIM_STATUS_SIM_INITIALIZING; // ready is a card whose record is here
}

// How many digits of an IMSI are the MNC, no rule tells; the operator's code does.
bool SplitImsi(const std::string& imsi, const std::string& operatorCode, SimSlot& slot)
{
    constexpr std::size_t kMcc = 3, kMostDigits = 15, kMostMsin = 10;
    const std::size_t code = operatorCode.size();
    if (code < kMcc + 2 || code > kMcc + 3 || imsi.compare(0, code, operatorCode) != 0)
        return false;
    if (imsi.size() <= code || imsi.size() > kMostDigits || imsi.size() - code > kMostMsin)
        return false;
    slot.mcc = imsi.substr(0, kMcc);
    slot.mnc = operatorCode.substr(kMcc);
    slot.msin = imsi.substr(code);
    return true;
}

const Registration& RegistrationOf(const Objects& objects, const std::string& path)
{
    const int state = Reported(objects, path, kModem3gpp).Number("RegistrationState", kUnregistered);
    return kRegistrations[state >= 0 && state < static_cast<int>(std::size(kRegistrations)) ? state : kUnregistered];
}

SimSlot DescribeSlot(const Objects& objects, const std::string& path)
{
    const Reported modem(objects, path, kModem);
    const Reported network(objects, path, kModem3gpp);
    const Reported sim(objects, modem.Text("Sim"), kSim);
    const Registration& registration = RegistrationOf(objects, path);
    SimSlot slot;
    slot.cpName = modem.Text("PrimaryPort");
    slot.cardStatus = {CardStatusOf(objects, modem)};
    if (!SplitImsi(sim.Text("Imsi"), sim.Text("OperatorIdentifier"), slot))
        SplitImsi(sim.Text("Imsi"), network.Text("OperatorCode"), slot);
    slot.number = Given(modem.Text("OwnNumbers"));
    slot.imei = Given(modem.Text("EquipmentIdentifier"));
    slot.serviceState = registration.service;
    slot.roaming = registration.isRoaming;
    slot.serviceType = registration.type;
    const auto technologies = static_cast<std::uint32_t>(modem.Number("AccessTechnologies"));
    if (slot.serviceType == 0)
        slot.serviceType = std::find_if(std::begin(kGenerations), std::end(kGenerations) - 1,
            [technologies](const Generation& generation) {
                return (generation.technologies & technologies) != 0;
            })->type;
    const bool isRegistered = registration.service == TELEPHONY_NETWORK_SERVICE_STATE_IN_SERVICE;
    slot.smsStatus = Reported(objects, path, kMessaging) && isRegistered ? 1 : 0;
    return slot;
}

void DescribeModems(const Objects& modems, Device& device)
{
    for (const std::string& path : PathsWith(modems, kModem))
    {
        const std::string group = "sim" + std::to_string(device.slots.size());
        device.slots.push_back(DescribeSlot(modems, path));
        if (!device.slots.back().mcc)
            device.reasons[group + ".mcc"] = "the SIM does not tell which network issued it";
        if (!device.slots.back().number)
            device.reasons[group + ".number"] = "the SIM holds none";
    }
    const int defaultSlot = device.slots.size() == 1 ? 0 : kNoSlot;
    device.defaultNetwork = device.preferredVoice = device.defaultData = defaultSlot;
}

// State of the NetworkManager device that stands for a modem; unmanaged where NetworkManager does not know it.
int NetworkStateOf(const Objects& network, const std::string& modemPath)
{
    for (const std::string& path : PathsWith(network, kNetworkDevice))
        if (const Reported device(network, path, kNetworkDevice); device.Text("Udi") == modemPath)
            return device.Number("State");
    return kUnmanaged;
}

int CellularStateOf(const Reports& reports, const std::string& modem)
{
    const int state = NetworkStateOf(reports.network.objects, modem);
    const bool isManaged = state > kUnmanaged;
    const bool isConnected =
        isManaged ? state == kActivated : Reported(reports.modems.objects, modem, kModem).Number("State") == kConnected;
    return isConnected ? CONNECTION_CELLULAR_STATE_CONNECTED : RegistrationOf(reports.modems.objects, modem).cellular;
}

// The best of the modems' states.
int CellularState(const Reports& reports)
{
    constexpr int kBestFirst[] = {CONNECTION_CELLULAR_STATE_CONNECTED, CONNECTION_CELLULAR_STATE_AVAILABLE,
        CONNECTION_CELLULAR_STATE_ROAMING, CONNECTION_CELLULAR_STATE_CALL_ONLY_AVAILABLE};
    std::vector<int> states;
    for (const std::string& modem : PathsWith(reports.modems.objects, kModem))
        states.push_back(CellularStateOf(reports, modem));
    for (const int state : kBestFirst)
        if (std::find(states.begin(), states.end(), state) != states.end())
            return state;
    return CONNECTION_CELLULAR_STATE_OUT_OF_SERVICE;
}

// The devices of one type: whether there are any, and how far their connections are.
struct Kind
{
    Kind(const Objects& network, int type)
    {
        for (const std::string& path : PathsWith(network, kNetworkDevice))
        {
            const Reported device(network, path, kNetworkDevice);
            if (device.Number("DeviceType") != type)
                continue;
            const int state = device.Number("State");
            exists = true;
            isUsable = isUsable || state > kUnavailable;
            const int its = Lookup(kWifiConnections, state, WIFI_CONNECTION_STATE_DISCONNECTED);
            connection = connection == WIFI_CONNECTION_STATE_DISCONNECTED ? its : std::max(connection, its);
        }
    }

    bool exists = false;
    bool isUsable = false;
    int connection = WIFI_CONNECTION_STATE_DISCONNECTED; ///< of the device that is furthest
};

// What the radios of one kind are.
struct Radio
{
    bool exists;
    bool isOn;
};

Radio WwanRadio(const Reports& reports)
{
    const std::vector<std::string> modems = PathsWith(reports.modems.objects, kModem);
    const Reported network(reports.network.objects, kNetworkPath, kNetwork);
    const bool exists = !modems.empty() || Kind(reports.network.objects, kModemDevice).exists;
    if (network)
        return {exists, exists && network.Flag("WwanEnabled") && network.Flag("WwanHardwareEnabled")};
    const auto isPowered = [&](const std::string& modem)
    {
        const int power = Reported(reports.modems.objects, modem, kModem).Number("PowerState");
        return power != kPowerOff && power != kPowerLow;
    };
    return {exists, std::any_of(modems.begin(), modems.end(), isPowered)};
}

Radio WifiRadio(const Objects& objects, const Kind& wifi)
{
    const Reported network(objects, kNetworkPath, kNetwork);
    return {wifi.exists, wifi.exists && network.Flag("WirelessEnabled") && network.Flag("WirelessHardwareEnabled")};
}

Radio BluetoothRadio(const Objects& adapters, const Kind& bluetooth)
{
    const std::vector<std::string> paths = PathsWith(adapters, kAdapter);
    const bool isPowered = std::any_of(
        paths.begin(), paths.end(), [&](const std::string& path) { return Reported(adapters, path, kAdapter).Flag("Powered"); });
    return {!paths.empty() || bluetooth.exists, isPowered || bluetooth.isUsable};
}

// Off, on without a connection, or connected: the same numbers in all three enumerations.
static_assert(
    CONNECTION_WIFI_STATE_CONNECTED == 2 && CONNECTION_BT_STATE_CONNECTED == 2 && RUNTIME_INFO_WIFI_STATUS_CONNECTED == 2);
int StateOf(const Radio& radio, const Kind& kind)
{
    if (!radio.isOn)
        return CONNECTION_WIFI_STATE_DEACTIVATED;
    return kind.connection == WIFI_CONNECTION_STATE_CONNECTED ? CONNECTION_WIFI_STATE_CONNECTED
                                                              : CONNECTION_WIFI_STATE_DISCONNECTED;
}

void DescribeNetwork(const Reports& reports, Device& device)
{
    const Objects& objects = reports.network.objects;
    const Kind wifi(objects, kWifiDevice);
    const Kind bluetooth(objects, kBluetoothDevice);
    const Radio wwanRadio = WwanRadio(reports);
    const Radio wifiRadio = WifiRadio(objects, wifi);
    const Radio bluetoothRadio = BluetoothRadio(reports.bluetooth.objects, bluetooth);

    const bool anyExists = wwanRadio.exists || wifiRadio.exists || bluetoothRadio.exists;
    device.flightMode = anyExists && !wwanRadio.isOn && !wifiRadio.isOn && !bluetoothRadio.isOn;
    device.mobileData = device.packetData = wwanRadio.isOn && !objects.empty();
    device.cellularState = device.flightMode ? CONNECTION_CELLULAR_STATE_FLIGHT_MODE : CellularState(reports);
    device.wifiState = device.wifiStatus = StateOf(wifiRadio, wifi);
    device.wifiDeviceState = wifiRadio.isOn ? WIFI_DEVICE_STATE_ACTIVATED : WIFI_DEVICE_STATE_DEACTIVATED;
    device.wifiConnectionState = wifi.connection;
    device.bluetoothState = StateOf(bluetoothRadio, bluetooth);

    device.dataRoaming = false;
    for (const auto& [path, call] : DetailsOfNetwork(objects))
        if (const Reported connection(objects, path, kMobileSettings); connection)
            device.dataRoaming = device.dataRoaming || !connection.Flag("home-only");
}

// Why a service tells nothing; null when it does.
const char* Silence(Presence presence, const char* whenAbsent)
{
    if (presence == Presence::Present)
        return nullptr;
    return presence == Presence::Denied ? "not permitted" : whenAbsent;
}

void GiveReasons(const Reports& reports, Device& device)
{
    const char* const noModems = Silence(reports.modems.presence, "ModemManager does not run");
    const char* const noNetwork = Silence(reports.network.presence, "NetworkManager does not run");
    const char* const modem = noModems != nullptr ? noModems : device.slots.empty() ? "no modem" : nullptr;
    const std::pair<const char*, const char*> reasons[] = {
        {"telephony.available", modem},
        {"network.cellular", modem},
        {"settings.mobile-data", noNetwork != nullptr ? noNetwork : modem},
        {"runtime.data-roaming", noNetwork != nullptr ? noNetwork : modem},
        {"runtime.flight-mode", noNetwork},
        {"network.wifi", noNetwork},
        {"network.bluetooth", noNetwork},
    };
    for (const auto& [key, reason] : reasons)
        if (reason != nullptr)
            device.reasons[key] = reason;

    const std::string carrier = Reported(reports.network.objects, kNetworkPath, kNetwork).Text("PrimaryConnectionType");
    if (carrier == "802-3-ethernet")
        device.reasons["network"] = "a wired connection carries the traffic, and does not count here";
}

} // namespace

const char* const kUsedProperties[] = {"AccessTechnologies", "ActiveConnection", "AvailableConnections", "Connection", "Device",
    "DeviceType", "EquipmentIdentifier", "Imsi", "OperatorCode", "OperatorIdentifier", "OwnNumbers", "PowerState", "Powered",
    "PrimaryConnectionType", "PrimaryPort", "RegistrationState", "Sim", "State", "StateFailedReason", "Udi", "UnlockRequired",
    "WirelessEnabled", "WirelessHardwareEnabled", "WwanEnabled", "WwanHardwareEnabled", "home-only", nullptr};

std::map<std::string, DetailCall> DetailsOfModems(const Objects& modems)
{
    std::map<std::string, DetailCall> calls;
    for (const std::string& path : PathsWith(modems, kModem))
        if (const std::string sim = Reported(modems, path, kModem).Text("Sim"); !sim.empty() && sim != kNone)
            calls[sim] = {"org.freedesktop.DBus.Properties", "GetAll", kSim};
    return calls;
}

std::map<std::string, DetailCall> DetailsOfNetwork(const Objects& network)
{
    std::map<std::string, DetailCall> calls;
    for (const std::string& path : PathsWith(network, kNetworkDevice))
    {
        const Reported device(network, path, kNetworkDevice);
        if (device.Number("DeviceType") != kModemDevice)
            continue;
        std::string connection = Reported(network, device.Text("ActiveConnection"), kActive).Text("Connection");
        if (connection.empty())
            connection = device.Text("AvailableConnections");
        if (!connection.empty())
            calls[connection] = {kSettings, "GetSettings", nullptr};
    }
    return calls;
}

void Describe(const Reports& reports, Device& device)
{
    device.telephony = reports.modems.presence == Presence::Present;
    DescribeModems(reports.modems.objects, device);
    DescribeNetwork(reports, device);
    GiveReasons(reports, device);
}

} // namespace kiv::platform
