#include "Reports.h"

#include "ITapiSim.h"
#include "ReportTables.h"
#include "Reported.h"
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

// An empty part of a report is a missing text.
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

// No rule says how many digits of an IMSI are the MNC. The operator's code does.
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

// The state of a modem's device in NetworkManager; unmanaged if NetworkManager does not know it.
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

// The state of the radios of one kind.
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

// Why a service reports nothing; null if it reports.
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
