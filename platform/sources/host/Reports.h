/// @file
/// What the services on the bus report, and what it means for the device.
#ifndef KIV_SOURCES_REPORTS_H
#define KIV_SOURCES_REPORTS_H

#include "DeviceControl.h"

#include <glib.h>
#include <map>
#include <set>
#include <string>

namespace kiv::platform
{

/// What is reported about one object under one interface. What is not reported is as in a new object.
struct Object
{
    int state = 0, failure = 0, power = 0, lock = 0, technologies = 0, registration = 4, type = 0;
    gboolean wifiEnabled = FALSE, wifiAllowed = FALSE, wwanEnabled = FALSE, wwanAllowed = FALSE, homeOnly = FALSE, powered = FALSE;
    std::string device, port, number, imei, imsi, operatorCode, carrier;
    std::string sim, modem, active, available, connection; ///< paths of other objects
};
using Objects = std::map<std::string, Object>; ///< by path

enum class Presence
{
    Absent,
    Denied, ///< this user may not ask it
    Present
};

struct Reports
{
    Presence modemManager = Presence::Absent, networkManager = Presence::Absent, bluez = Presence::Absent;
    Objects modems, registrations, messaging, sims;        ///< of ModemManager
    Objects network, devices, activeConnections, settings; ///< of NetworkManager
    Objects adapters;                                      ///< of BlueZ
};

/// Paths of the modems' SIMs.
std::set<std::string> SimsOf(const Reports& reports);

/// Paths of the connections that the modems use, or would use.
std::set<std::string> ConnectionsOf(const Reports& reports);

/// Sets every value of the device that comes from the services, or the reason why it is missing.
void Describe(const Reports& reports, Device& device);

} // namespace kiv::platform

#endif
