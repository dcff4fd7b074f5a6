/// @file
/// Translates the reports of the services on the bus into values of the device.
#ifndef KIV_SOURCES_REPORTS_H
#define KIV_SOURCES_REPORTS_H

#include "DeviceControl.h"

#include <gio/gio.h>
#include <map>
#include <memory>
#include <string>

namespace kiv::platform
{

using Variant = std::shared_ptr<GVariant>;
using Properties = std::map<std::string, Variant>;
using Interfaces = std::map<std::string, Properties>;
using Objects = std::map<std::string, Interfaces>; ///< by object path

enum class Presence
{
    Absent,
    Denied, ///< this user may not ask it
    Present
};

struct ServiceReport
{
    Presence presence = Presence::Absent;
    Objects objects;
};

struct Reports
{
    ServiceReport modems, network, bluetooth; ///< of ModemManager, NetworkManager, BlueZ
};

/// Names of the properties that are read here, with a null at the end. Others need not be kept.
extern const char* const kUsedProperties[];

/// A method call that reads an object.
struct DetailCall
{
    const char* interface;
    const char* method;
    const char* argument; ///< null when the method takes none
};

/// The SIMs of the modems, which the object manager does not list.
std::map<std::string, DetailCall> DetailsOfModems(const Objects& modems);

/// The connections that the modems use, or would use.
std::map<std::string, DetailCall> DetailsOfNetwork(const Objects& network);

/// Sets every value of the device that comes from the services, or the reason why it is missing.
void Describe(const Reports& reports, Device& device);

} // namespace kiv::platform

#endif
