#ifndef BOARDDAEMON_H
#define BOARDDAEMON_H

#include "BusParty.h"

namespace kiv
{

/// The device daemon, as far as its board interface goes: tells the board's serial number.
class BoardDaemon : public BusParty
{
public:
    static constexpr char kBusName[] = "org.tizen.system.deviced";

    /// Serves from now on. Throws BusError.
    explicit BoardDaemon(const std::string& serial);

    /// The serial number of the device in use. Throws std::runtime_error that tells why there is none.
    static std::string DeviceSerial();
};

} // namespace kiv

#endif
