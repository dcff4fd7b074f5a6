#ifndef KIV_TESTS_BUSTEST_H
#define KIV_TESTS_BUSTEST_H

#include "bus/Subscribers.h"
#include "support/LogCapture.h"
#include "support/Peer.h"
#include "support/PrivateBus.h"

#include <DADBusManager.h>
#include <DASystem.h>

namespace kiv::test
{

constexpr char kServiceManager[] = "org.tizen.servicemanager.service";
constexpr char kBoardDaemon[] = "org.tizen.system.deviced";

/// Records that can not be called, and what is wrong with them.
const std::pair<_SubscriberInfo, std::string> kBadRecords[] = {
    {{"", "/x", "a.b"}, "busname is not a bus name"},
    {{"org.ex\xe9mple", "/x", "a.b"}, "busname is not a bus name"},
    {{"no name", "/x", "a.b"}, "busname is not a bus name"},
    {{"a.b", "", "a.b"}, "objectpath is not an object path"},
    {{"a.b", "/x/", "a.b"}, "objectpath is not an object path"},
    {{"a.b", "/org/freedesktop/DBus/Local", "a.b"}, "objectpath is reserved"},
    {{"a.b", "/org/freedesktop/DBus/Locale/x", "a.b"}, "objectpath is reserved"},
    {{"a.b", "/x", "undotted"}, "interface is not an interface name"},
    {{"a.b", "/x", "org.freedesktop.DBus.Local"}, "interface is reserved"},
    {{"a.b", "/x", "org.freedesktop.DBus.Locale"}, "interface is reserved"},
    {{"", "", ""}, "busname is not a bus name"},
};

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

    static std::string Line(const std::string& message, const char* level = "E", const char* function = "SendNotiToServiceManager")
    {
        return level + std::string(" DADBusManager.cpp ") + function + " > " + message;
    }

    /// Iterates a main context until a condition holds; fails after twenty seconds.
    template <class Condition>
    static void IterateUntil(Condition isMet, GMainContext* context = nullptr)
    {
        const gint64 deadline = g_get_monotonic_time() + 20 * G_TIME_SPAN_SECOND;
        while (!isMet())
        {
            ASSERT_LT(g_get_monotonic_time(), deadline);
            if (!g_main_context_iteration(context, FALSE))
                g_usleep(1000); // for what comes true outside the loop
        }
    }

    /// The four error lines of a record that no proxy could be made for.
    static std::vector<testing::Matcher<std::string>> NoProxyLines(const std::string& function, const _SubscriberInfo& record)
    {
        const std::string place = Line("", "E", function.c_str());
        return {testing::MatchesRegex(place + "Unable to create proxy: .+"), place + " subscriber busname: " + record.busname,
            place + " subscriber objectpath: " + record.objectpath, place + " subscriber interface: " + record.interface};
    }
};

} // namespace kiv::test

#endif
