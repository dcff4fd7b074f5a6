#ifndef KIV_RECORDRULES_H
#define KIV_RECORDRULES_H

#include <gio/gio.h>

#include <string>

namespace kiv
{

/// Why a subscriber cannot be called.
enum class RecordFlaw
{
    None,
    BusName,
    ObjectPath,
    Interface,
    ReservedPath,
    ReservedInterface
};

/// Checks a record before it is written and before its subscriber is called. GDBus does not report a malformed record, and the bus
/// disconnects a caller of the reserved path or interface, or of one that begins with the same letters.
inline RecordFlaw FlawOf(const std::string& busName, const std::string& objectPath, const std::string& interface)
{
    const auto isWhole = [](const std::string& text) { return text.find('\0') == std::string::npos; };
    if (!g_dbus_is_name(busName.c_str()) || !isWhole(busName))
        return RecordFlaw::BusName;
    if (!g_variant_is_object_path(objectPath.c_str()) || !isWhole(objectPath))
        return RecordFlaw::ObjectPath;
    if (!g_dbus_is_interface_name(interface.c_str()) || !isWhole(interface))
        return RecordFlaw::Interface;
    if (g_str_has_prefix(objectPath.c_str(), "/org/freedesktop/DBus/Local"))
        return RecordFlaw::ReservedPath;
    if (g_str_has_prefix(interface.c_str(), "org.freedesktop.DBus.Local"))
        return RecordFlaw::ReservedInterface;
    return RecordFlaw::None;
}

} // namespace kiv

#endif
