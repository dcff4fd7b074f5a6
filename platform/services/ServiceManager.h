#ifndef SERVICEMANAGER_H
#define SERVICEMANAGER_H

#include "BusParty.h"

#include <functional>

namespace kiv
{

/// The part of the platform's service manager that receives the agent's events. It accepts all events and passes them to an
/// observer.
class ServiceManager : public BusParty
{
public:
    static constexpr char kBusName[] = "org.tizen.servicemanager.service";

    /// Starts to serve. Throws BusError.
    /// @param onCall  called with every call before it is answered
    explicit ServiceManager(std::function<void(const BusCall&)> onCall);
};

} // namespace kiv

#endif
