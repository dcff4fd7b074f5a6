#ifndef KIV_BENCH_BUSMONITOR_H
#define KIV_BENCH_BUSMONITOR_H

#include "PrivateSystemBus.h"

#include <functional>
#include <string>
#include <vector>

namespace kiv::bench
{

/// Sees every message that goes over the bus, as long as it lives. One at a time.
class BusMonitor
{
public:
    explicit BusMonitor(const PrivateSystemBus& bus);
    BusMonitor(const BusMonitor&) = delete;
    BusMonitor& operator=(const BusMonitor&) = delete;
    ~BusMonitor();

    /// The messages that an operation causes: a line each with all of it but serials, in the order of the bus.
    std::vector<std::string> During(const std::function<void()>& operation);

private:
    static GDBusMessage* Filter(GDBusConnection* connection, GDBusMessage* message, gboolean incoming, gpointer);
    void AwaitMarker();

    GDBusConnection* shared_; ///< whose messages are in question: a mark that is sent over it tells where they end
    Connection watching_;
};

} // namespace kiv::bench

#endif
