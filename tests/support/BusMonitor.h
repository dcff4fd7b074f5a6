#ifndef KIV_TESTS_BUSMONITOR_H
#define KIV_TESTS_BUSMONITOR_H

#include "support/PrivateBus.h"

namespace kiv::test
{

/// Sees every message that goes over the bus, as long as it lives. One at a time.
class BusMonitor
{
public:
    /// @param shared  the connection whose messages are in question; borrowed
    BusMonitor(const PrivateBus& bus, GDBusConnection* shared);
    BusMonitor(const BusMonitor&) = delete;
    BusMonitor& operator=(const BusMonitor&) = delete;
    ~BusMonitor();

    /// The messages that an operation causes: a line each with all of it but serials, in the order of the bus.
    std::vector<std::string> During(const std::function<void()>& operation);

private:
    static GDBusMessage* Filter(GDBusConnection* connection, GDBusMessage* message, gboolean incoming, gpointer);
    void AwaitMarker();

    GDBusConnection* shared_; ///< a mark that is sent over it shows where they end
    Connection watching_;
};

} // namespace kiv::test

#endif
