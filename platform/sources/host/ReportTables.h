/// @file
/// Names and numbers of the services on the bus, and tables that translate them into values of the device.
#ifndef KIV_SOURCES_REPORTTABLES_H
#define KIV_SOURCES_REPORTTABLES_H

#include "ITapiSim.h"
#include "Reports.h"
#include "net_connection.h"
#include "telephony.h"
#include "wifi.h"

#include <algorithm>
#include <utility>
#include <variant>

namespace kiv::platform
{

template <std::size_t count>
int Lookup(const std::pair<int, int> (&table)[count], int key, int fallback)
{
    const auto* const found = std::find_if(table, table + count, [key](const auto& row) { return row.first == key; });
    return found == table + count ? fallback : found->second;
}

// clang-format off
constexpr char kModemManager[] = "org.freedesktop.ModemManager1";
constexpr char kNetworkManager[] = "org.freedesktop.NetworkManager";
constexpr char kBluez[] = "org.bluez";
constexpr char kNetworkPath[] = "/org/freedesktop/NetworkManager"; // of the object for the whole network

// A property that is read, and the member that it sets. Of a list, the first element counts.
struct Property
{
    const char* name;
    std::variant<int Object::*, std::string Object::*> member;
};

// The interfaces whose objects are kept. "gsm" is a group of a connection's settings, which has the form of an interface.
constexpr struct Interface
{
    const char* service;
    const char* name;
    Objects Reports::*objects;
    Property properties[10];
} kInterfaces[] = {
    {kModemManager, "org.freedesktop.ModemManager1.Modem", &Reports::modems, {
        {"State",                   &Object::state},
        {"StateFailedReason",       &Object::failure},
        {"PowerState",              &Object::power},
        {"UnlockRequired",          &Object::lock},
        {"AccessTechnologies",      &Object::technologies},
        {"Device",                  &Object::device},
        {"PrimaryPort",             &Object::port},
        {"OwnNumbers",              &Object::number},
        {"EquipmentIdentifier",     &Object::imei},
        {"Sim",                     &Object::sim}}},
    {kModemManager, "org.freedesktop.ModemManager1.Modem.Modem3gpp", &Reports::registrations, {
        {"RegistrationState",       &Object::registration},
        {"OperatorCode",            &Object::operatorCode}}},
    {kModemManager, "org.freedesktop.ModemManager1.Modem.Messaging", &Reports::messaging, {}},
    {kModemManager, "org.freedesktop.ModemManager1.Sim", &Reports::sims, {
        {"Imsi",                    &Object::imsi},
        {"OperatorIdentifier",      &Object::operatorCode}}},
    {kNetworkManager, "org.freedesktop.NetworkManager", &Reports::network, {
        {"WirelessEnabled",         &Object::wifiEnabled},
        {"WirelessHardwareEnabled", &Object::wifiAllowed},
        {"WwanEnabled",             &Object::wwanEnabled},
        {"WwanHardwareEnabled",     &Object::wwanAllowed},
        {"PrimaryConnectionType",   &Object::carrier}}},
    {kNetworkManager, "org.freedesktop.NetworkManager.Device", &Reports::devices, {
        {"DeviceType",              &Object::type},
        {"State",                   &Object::state},
        {"Udi",                     &Object::modem},
        {"ActiveConnection",        &Object::active},
        {"AvailableConnections",    &Object::available}}},
    {kNetworkManager, "org.freedesktop.NetworkManager.Connection.Active", &Reports::activeConnections, {
        {"Connection",              &Object::connection}}},
    {kNetworkManager, "gsm", &Reports::settings, {
        {"home-only",               &Object::homeOnly}}},
    {kBluez, "org.bluez.Adapter1", &Reports::adapters, {
        {"Powered",                 &Object::powered}}},
};

// Enumerations of ModemManager and NetworkManager are those of their D-Bus interfaces, which never change a number.

// MMModemState, except "failed" and "locked", which depend on more.
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

// MMModemAccessTechnology, the bits of each generation; the latest generation counts
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

} // namespace kiv::platform

#endif
