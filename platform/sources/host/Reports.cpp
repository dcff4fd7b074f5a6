#include "Reports.h"

#include "ReportTables.h"
#include "runtime_info.h"

#include <cstring>

namespace kiv::platform
{

namespace
{

const Object& Find(const Objects& objects, const std::string& path)
{
    static const Object kNothing;
    const auto found = objects.find(path);
    return found == objects.end() ? kNothing : found->second;
}

const Registration& RegistrationOf(const Reports& reports, const std::string& modem)
{
    const auto state = static_cast<std::size_t>(Find(reports.registrations, modem).registration);
    return kRegistrations[state < std::size(kRegistrations) ? state : kUnregistered];
}

int CardStatusOf(const Object& modem, const Objects& sims)
{
    if (modem.state == kFailed)
        return Lookup(kCardOfFailure, modem.failure, TAPI_SIM_STATUS_CARD_ERROR);
    if (modem.power == kPowerOff)
        return TAPI_SIM_STATUS_CARD_POWEROFF;
    const int card = modem.state == kLocked ? Lookup(kCardOfLock, modem.lock, TAPI_SIM_STATUS_SIM_LOCK_REQUIRED)
                                            : Lookup(kCardOfState, modem.state, TAPI_SIM_STATUS_UNKNOWN);
    if (card != TAPI_SIM_STATUS_SIM_INIT_COMPLETED || sims.count(modem.sim) != 0) // ready is a card whose record is here
        return card;
    return modem.sim.empty() ? TAPI_SIM_STATUS_CARD_NOT_PRESENT : TAPI_SIM_STATUS_SIM_INITIALIZING;
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

SimSlot SlotOf(const Reports& reports, const std::string& path)
{
    const Object& modem = Find(reports.modems, path);
    const Object& sim = Find(reports.sims, modem.sim);
    const Registration& registration = RegistrationOf(reports, path);
    const auto isOf = [technologies = static_cast<std::uint32_t>(modem.technologies)](const Generation& generation)
    { return (generation.technologies & technologies) != 0; };
    SimSlot slot;
    slot.cpName = modem.port;
    slot.cardStatus = {CardStatusOf(modem, reports.sims)};
    if (!SplitImsi(sim.imsi, sim.operatorCode, slot))
        SplitImsi(sim.imsi, Find(reports.registrations, path).operatorCode, slot);
    if (!modem.number.empty())
        slot.number = modem.number;
    if (!modem.imei.empty())
        slot.imei = modem.imei;
    slot.serviceState = registration.service;
    slot.roaming = registration.isRoaming;
    slot.serviceType = registration.type;
    if (slot.serviceType == 0)
        slot.serviceType = std::find_if(std::begin(kGenerations), std::end(kGenerations) - 1, isOf)->type;
    const bool isRegistered = registration.service == TELEPHONY_NETWORK_SERVICE_STATE_IN_SERVICE;
    slot.smsStatus = isRegistered && reports.messaging.count(path) != 0 ? 1 : 0;
    return slot;
}

void DescribeSlots(const Reports& reports, Device& device)
{
    const auto isBefore = [](const std::string& one, const std::string& other)
    { return strverscmp(one.c_str(), other.c_str()) < 0; };
    std::map<std::string, std::string, decltype(isBefore)> paths(isBefore); // by device and port
    for (const auto& [path, modem] : reports.modems)
        paths[modem.device + " " + modem.port + " " + path] = path;
    for (const auto& [place, path] : paths)
    {
        const std::string group = "sim" + std::to_string(device.slots.size());
        const SimSlot& slot = device.slots.emplace_back(SlotOf(reports, path));
        if (!slot.mcc)
            device.reasons[group + ".mcc"] = "the SIM does not tell which network issued it";
        if (!slot.number)
            device.reasons[group + ".number"] = "the SIM holds none";
    }
    device.defaultNetwork = device.preferredVoice = device.defaultData = device.slots.size() == 1 ? 0 : kNoSlot;
}

// The best of the modems' states. ModemManager says "connected" although no data flows: NetworkManager decides where it can.
int CellularStateOf(const Reports& reports)
{
    constexpr int kBestFirst[] = {CONNECTION_CELLULAR_STATE_CONNECTED, CONNECTION_CELLULAR_STATE_AVAILABLE,
        CONNECTION_CELLULAR_STATE_ROAMING, CONNECTION_CELLULAR_STATE_CALL_ONLY_AVAILABLE, CONNECTION_CELLULAR_STATE_OUT_OF_SERVICE};
    const int* best = std::end(kBestFirst) - 1;
    for (const auto& [path, modem] : reports.modems)
    {
        bool isConnected = modem.state == kConnected;
        for (const auto& [devicePath, device] : reports.devices)
            if (device.modem == path && device.state > kUnmanaged)
                isConnected = device.state == kActivated;
        const int state = isConnected ? CONNECTION_CELLULAR_STATE_CONNECTED : RegistrationOf(reports, path).cellular;
        best = std::find(std::begin(kBestFirst), best, state);
    }
    return *best;
}

// The radios of one type, and the connection of the device that is furthest.
struct Radio
{
    Radio(const Objects& devices, int type)
    {
        for (const auto& [path, device] : devices)
        {
            if (device.type != type)
                continue;
            exists = true;
            isOn = isOn || device.state > kUnavailable;
            const int its = Lookup(kWifiConnections, device.state, WIFI_CONNECTION_STATE_DISCONNECTED);
            connection = connection == WIFI_CONNECTION_STATE_DISCONNECTED ? its : std::max(connection, its);
        }
    }

    bool exists = false, isOn = false;
    int connection = WIFI_CONNECTION_STATE_DISCONNECTED;
};

// Off, on without a connection, or connected: the same numbers in all three enumerations.
static_assert(
    CONNECTION_WIFI_STATE_CONNECTED == 2 && CONNECTION_BT_STATE_CONNECTED == 2 && RUNTIME_INFO_WIFI_STATUS_CONNECTED == 2);
int StateOf(const Radio& radio)
{
    const bool isConnected = radio.connection == WIFI_CONNECTION_STATE_CONNECTED;
    const int whenOn = isConnected ? CONNECTION_WIFI_STATE_CONNECTED : CONNECTION_WIFI_STATE_DISCONNECTED;
    return radio.isOn ? whenOn : CONNECTION_WIFI_STATE_DEACTIVATED;
}

void DescribeNetwork(const Reports& reports, Device& device)
{
    const Object& network = Find(reports.network, kNetworkPath);
    Radio wwan(reports.devices, kModemDevice), wifi(reports.devices, kWifiDevice), bluetooth(reports.devices, kBluetoothDevice);
    wwan.exists = wwan.exists || !reports.modems.empty();
    const bool mayUseModems = wwan.exists && network.wwanEnabled != FALSE && network.wwanAllowed != FALSE;
    wwan.isOn = mayUseModems;
    for (const auto& [path, modem] : reports.modems)
        if (reports.network.empty() && modem.power != kPowerOff && modem.power != kPowerLow)
            wwan.isOn = true;
    wifi.isOn = wifi.exists && network.wifiEnabled != FALSE && network.wifiAllowed != FALSE;
    bluetooth.exists = bluetooth.exists || !reports.adapters.empty();
    for (const auto& [path, adapter] : reports.adapters)
        bluetooth.isOn = bluetooth.isOn || adapter.powered != FALSE;

    const bool anyExists = wwan.exists || wifi.exists || bluetooth.exists;
    device.flightMode = anyExists && !wwan.isOn && !wifi.isOn && !bluetooth.isOn;
    device.mobileData = device.packetData = mayUseModems;
    device.cellularState = device.flightMode ? CONNECTION_CELLULAR_STATE_FLIGHT_MODE : CellularStateOf(reports);
    device.wifiState = device.wifiStatus = StateOf(wifi);
    device.wifiDeviceState = wifi.isOn ? WIFI_DEVICE_STATE_ACTIVATED : WIFI_DEVICE_STATE_DEACTIVATED;
    device.wifiConnectionState = wifi.connection;
    device.bluetoothState = StateOf(bluetooth);
    device.dataRoaming = std::any_of(reports.settings.begin(), reports.settings.end(),
        [](const auto& connection) { return connection.second.homeOnly == FALSE; });
}

void GiveReasons(const Reports& reports, Device& device)
{
    const auto silence = [](Presence presence, const char* absent, const char* present) {
        return presence == Presence::Absent ? absent : presence == Presence::Denied ? "not permitted" : present;
    };
    const char* const network = silence(reports.networkManager, "NetworkManager does not run", nullptr);
    const char* const modem =
        silence(reports.modemManager, "ModemManager does not run", device.slots.empty() ? "no modem" : nullptr);
    const bool isWired = Find(reports.network, kNetworkPath).carrier == "802-3-ethernet";
    const std::pair<const char*, const char*> reasons[] = {
        {"telephony.available", modem},
        {"network.cellular", modem},
        {"settings.mobile-data", network != nullptr ? network : modem},
        {"runtime.data-roaming", network != nullptr ? network : modem},
        {"runtime.flight-mode", network},
        {"network.wifi", network},
        {"network.bluetooth", network},
        {"network", isWired ? "a wired connection carries the traffic, and does not count here" : nullptr},
    };
    for (const auto& [key, reason] : reasons)
        if (reason != nullptr)
            device.reasons[key] = reason;
}

} // namespace

std::set<std::string> SimsOf(const Reports& reports)
{
    std::set<std::string> sims;
    for (const auto& [path, modem] : reports.modems)
        sims.insert(modem.sim);
    sims.erase("");
    return sims;
}

std::set<std::string> ConnectionsOf(const Reports& reports)
{
    std::set<std::string> connections;
    for (const auto& [path, device] : reports.devices)
        if (const std::string& active = Find(reports.activeConnections, device.active).connection; device.type == kModemDevice)
            connections.insert(active.empty() ? device.available : active);
    connections.erase("");
    return connections;
}

void Describe(const Reports& reports, Device& device)
{
    device.telephony = reports.modemManager == Presence::Present;
    DescribeSlots(reports, device);
    DescribeNetwork(reports, device);
    GiveReasons(reports, device);
}

} // namespace kiv::platform
