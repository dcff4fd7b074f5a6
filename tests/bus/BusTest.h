#ifndef KIV_TESTS_BUSTEST_H
#define KIV_TESTS_BUSTEST_H

#include "bus/Subscribers.h"
#include "support/Deliveries.h"
#include "support/LogCapture.h"
#include "support/Peer.h"
#include "support/PrivateBus.h"

#include <DADBusManager.h>
#include <DASystem.h>

namespace kiv::test
{

constexpr char kServiceManager[] = "org.tizen.servicemanager.service";
constexpr char kBoardDaemon[] = "org.tizen.system.deviced";

/// Records that cannot be called, and what is wrong with them.
const std::pair<_SubscriberInfo, std::string> kBadRecords[] = {
    {{"", "", ""}, "busname is not a bus name"},
    {{"a.b", "/x/", "a.b"}, "objectpath is not an object path"},
    {{"a.b", "/org/freedesktop/DBus/Locale/x", "a.b"}, "objectpath is reserved"},
    {{"a.b", "/x", "undotted"}, "interface is not an interface name"},
    {{"a.b", "/x", "org.freedesktop.DBus.Locale"}, "interface is reserved"},
};

/// The library with a private bus and a subscriber store in memory.
struct BusTest : testing::Test
{
    ~BusTest() override { Settle(); }

    PrivateBus bus;
    Subscribers store;
    DASystem& facade = *DASystem::GetInstance();
    DADBusManager& manager = *DADBusManager::GetInstance();
    LogCapture log;
    Deliveries deliveries;
    char imsi[4] = "450";

    static _SubscriberInfo Record(const Peer& peer) { return {peer.Name(), "/example/client", "org.example.Client"}; }
    void Subscribe(const Peer& peer) { store.records.push_back(Record(peer)); }

    int NotifySubscribers(_KIV_NOTI_TYPE_E type) { return facade.SendNotiToServiceManager(type, imsi, 7, "a", "b", "c", "d"); }
    int NotifyServiceManager(_KIV_NOTI_TYPE_E type) { return manager.SendNotiToServiceManager(type, imsi, 7, "a", "b", "c", "d"); }

    static std::string Line(const std::string& message, const char* level = "E", const char* function = "SendNotiToServiceManager")
    {
        return level + std::string(" DADBusManager.cpp ") + function + " > " + message;
    }

    void Settle(GMainContext* context = nullptr) const { deliveries.Settle(context); }
};

} // namespace kiv::test

#endif
