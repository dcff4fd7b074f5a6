// Lines of bus name, object path and interface, separated by tabs. Each line's name with each line's path and interface is a
// subscriber's record. A good record is among them. If the first line is "push", a push is delivered, otherwise a notification.
#include "Fuzz.h"
#include "bus/Subscribers.h"
#include "support/Peer.h"

#include <DADBusManager.h>

using namespace kiv::fuzz;
using namespace kiv::test;

void Try(std::string_view input)
{
    static std::atomic<unsigned> number{0}; // of the input; the good record has its own object, which no other record names
    static std::atomic<int> delivered{0}, late{0};
    static const auto path = [](unsigned of) { return "/example/client/" + std::to_string(of); };
    const auto answer = [](GDBusMessage* call)
    {
        delivered += g_dbus_message_get_path(call) == path(number) ? 1 : 0;
        late += g_dbus_message_get_path(call) == path(number - 1) ? 1 : 0; // a second call of the input before
        return g_dbus_message_new_method_reply(call);
    };
    static const PrivateBus& bus = *new PrivateBus;
    static Peer& peer = *new Peer(bus, "org.tizen.servicemanager.service", answer);
    static GDBusConnection* const connection = g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr); // held, like an agent does
    peer.Forget();

    constexpr std::size_t kMostLines = 10; // the bus lets a connection wait for 128 replies at once
    auto lines = Split(input, '\n');
    lines.resize(std::min(lines.size(), kMostLines));
    Subscribers store;
    for (const auto& line : lines)
        for (const auto& other : lines)
            store.records.push_back({Split(line, '\t', 3)[0], Split(other, '\t', 3)[1], Split(other, '\t', 3)[2]});
    Feed(store.records.size() + 1);
    ++number;
    delivered = 0;
    const auto place = static_cast<std::ptrdiff_t>(input.size() % (store.records.size() + 1));
    store.records.insert(store.records.begin() + place, {peer.Name(), path(number), "org.example.Client"});

    DADBusManager& manager = *DADBusManager::GetInstance();
    char imsi[] = "450";
    const int code = lines[0] == "push" ? manager.DeliverPushMessage("mail", "data", "message", 1)
                                        : manager.SendStatusNotification(imsi, 7, "on");
    Require(code == 0, "what is sent is dispatched");
    while (delivered == 0 && !g_dbus_connection_is_closed(connection))
        g_main_context_iteration(nullptr, TRUE);
    while (g_main_context_iteration(nullptr, FALSE) != FALSE)
        continue;
    Require(!g_dbus_connection_is_closed(connection), "the bus does not disconnect");
    Require(delivered == 1 && late == 0, "the good record is called once");
}
