#ifndef KIV_TESTS_BUSTEST_H
#define KIV_TESTS_BUSTEST_H

#include "bus/Subscribers.h"
#include "support/LogCapture.h"
#include "support/Peer.h"
#include "support/PrivateBus.h"

#include <DADBusManager.h>
#include <DASystem.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace kiv::test
{

constexpr char kServiceManager[] = "org.tizen.servicemanager.service";
constexpr char kBoardDaemon[] = "org.tizen.system.deviced";

/// The library between a private bus and a subscriber store in memory.
struct BusTest : testing::Test
{
    static PrivateBus& Bus()
    {
        static PrivateBus bus;
        return bus;
    }

    PrivateBus& bus = Bus();
    Subscribers store;
    DASystem& facade = *DASystem::GetInstance();
    DADBusManager& manager = *DADBusManager::GetInstance();
    LogCapture log;
    char imsi[4] = "450";

    static _SubscriberInfo Record(const Peer& peer) { return {peer.Name(), "/example/client", "org.example.Client"}; }
    void Subscribe(const Peer& peer) { store.records.push_back(Record(peer)); }

    int NotifySubscribers(_KIV_NOTI_TYPE_E type, int serviceId = 7)
    {
        return facade.SendNotiToServiceManager(type, imsi, serviceId, "on", "voice", "1.0", "url");
    }
    int NotifyServiceManager(_KIV_NOTI_TYPE_E type, int serviceId = 7)
    {
        return manager.SendNotiToServiceManager(type, imsi, serviceId, "on", "voice", "1.0", "url");
    }

    /// The four error lines of a record that no proxy could be made for.
    static std::vector<testing::Matcher<std::string>> NoProxyLines(const std::string& function, const _SubscriberInfo& record)
    {
        const std::string place = "E DADBusManager.cpp " + function + " > ";
        return {testing::MatchesRegex(place + "Unable to create proxy: .+"), place + " subscriber busname: " + record.busname,
            place + " subscriber objectpath: " + record.objectpath, place + " subscriber interface: " + record.interface};
    }
};

} // namespace kiv::test

#endif
