/// @file
/// The services on the bus that know the machine: ModemManager, NetworkManager and BlueZ.
#ifndef KIV_SOURCES_SERVICES_H
#define KIV_SOURCES_SERVICES_H

#include "Reports.h"

#include <functional>
#include <gio/gio.h>
#include <memory>

namespace kiv::platform
{

/// Fills the reports over a connection, and keeps them current until the result goes. For one thread, whose default context it
/// uses. Never blocks, never starts a service, and survives the end of the connection.
/// @param changed  runs after each change; receives whether everything was read
std::shared_ptr<void> FollowServices(
    GDBusConnection* connection, Reports& reports, const std::function<void(bool isComplete)>& changed);

/// Takes over what is reported about one object: "a{sa{sv}}".
void ReadObject(const std::string& path, GVariant* interfaces, Reports& reports);

} // namespace kiv::platform

#endif
