#ifndef SERVICEMANAGER_H
#define SERVICEMANAGER_H

#include "BusParty.h"

#include <functional>

namespace kiv
{

/// The platform's service manager, as the agent's events reach it: takes every one and tells it to whoever watches.
class ServiceManager : public BusParty
{
public:
    static constexpr char kBusName[] = "org.tizen.servicemanager.service";

    /// Serves from now on. Throws BusError.
    /// @param onCall  hears of every call before it is answered
    explicit ServiceManager(std::function<void(const BusCall&)> onCall);
};

} // namespace kiv

#endif
