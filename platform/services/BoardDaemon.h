#ifndef BOARDDAEMON_H
#define BOARDDAEMON_H

#include "BusParty.h"

namespace kiv
{

/// The board interface of the device daemon, which returns the board's serial number.
class BoardDaemon : public BusParty
{
public:
    static constexpr char kBusName[] = "org.tizen.system.deviced";

    /// Starts to serve. Throws BusError.
    explicit BoardDaemon(const std::string& serial);

    /// Returns the serial number of the device in use. Throws std::runtime_error with the reason if there is none.
    static std::string DeviceSerial();
};

} // namespace kiv

#endif
