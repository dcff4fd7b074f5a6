#include "BoardDaemon.h"

#include "BusInterfaces.h"

#include <DeviceControl.h>

namespace kiv
{

BoardDaemon::BoardDaemon(const std::string& serial)
    : BusParty(kBoardXml, [serial](const BusCall&) { return g_variant_new("(s)", serial.c_str()); })
{
    OwnName(kBusName);
}

std::string BoardDaemon::DeviceSerial()
{
    if (const auto serial = platform::GetDevice().serial)
        return *serial;
    const std::string trouble = platform::DeviceTrouble();
    throw std::runtime_error(trouble.empty() ? "the device in use has no serial number; give one with --serial" : trouble);
}

} // namespace kiv
