#ifndef KIV_BENCH_BUSMONITOR_H
#define KIV_BENCH_BUSMONITOR_H

#include "PrivateSystemBus.h"
#include "Table.h"

#include <functional>
#include <string>
#include <vector>

namespace kiv::bench
{

/// Sees every message that goes over the bus, as long as it lives.
class BusMonitor
{
public:
    explicit BusMonitor(const PrivateSystemBus& bus);
    BusMonitor(const BusMonitor&) = delete;
    BusMonitor& operator=(const BusMonitor&) = delete;
    ~BusMonitor();

    /// The messages that an operation causes: a line each with all of it but serials and unique names, in the order of the bus.
    std::vector<std::string> During(const std::function<void()>& operation);

private:
    struct Seen;

    static GDBusMessage* Filter(GDBusConnection* connection, GDBusMessage* message, gboolean incoming, gpointer seen);
    void AwaitMarker();

    GDBusConnection* shared_;
    std::shared_ptr<Seen> seen_;
    Connection connection_;
};

enum class Order
{
    Same,
    Any ///< where it depends on when the replies arrive
};

/// Adds to the table whether the library causes the same messages as the bare loop.
void CompareMessages(Table& table, const PrivateSystemBus& bus, const std::string& item, Order order,
    const std::function<void()>& library, const std::function<void()>& bare);

} // namespace kiv::bench

#endif
