#ifndef KIV_TESTS_BUSMONITOR_H
#define KIV_TESTS_BUSMONITOR_H

#include "support/PrivateBus.h"

namespace kiv::test
{

/// Sees every message on the bus while it lives. One at a time.
class BusMonitor
{
public:
    /// @param shared  the connection whose messages are recorded; borrowed
    BusMonitor(const PrivateBus& bus, GDBusConnection* shared);
    BusMonitor(const BusMonitor&) = delete;
    BusMonitor& operator=(const BusMonitor&) = delete;
    ~BusMonitor();

    /// Returns the messages of an operation in the order of the bus, one per line, complete except for serials.
    std::vector<std::string> During(const std::function<void()>& operation);

    /// Waits for a message with this text. @return the messages before it that were not returned yet
    static std::vector<std::string> Until(const std::string& text);

private:
    static GDBusMessage* Filter(GDBusConnection* connection, GDBusMessage* message, gboolean incoming, gpointer);

    GDBusConnection* shared_; ///< a marker sent over it shows where they end
    Connection watching_;
};

} // namespace kiv::test

#endif
