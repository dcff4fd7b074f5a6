// Records of subscribers, one a line: bus name, object path and interface with tabs between them. A good record stands somewhere
// among them. A line "push" in front has a push delivered, anything else has a notification.
#include "Fuzz.h"
#include "bus/Subscribers.h"
#include "support/Peer.h"

#include <DADBusManager.h>

#include <algorithm>
#include <atomic>

using namespace kiv::fuzz;

namespace
{

constexpr std::size_t kMostRecords = 16;

/// A bus, and the client behind the good record, whose object is another one for each input, so that no other record names it.
struct Client
{
    kiv::test::PrivateBus bus;
    kiv::test::Subscribers store;
    std::atomic<unsigned> number{0};
    std::atomic<int> delivered{0};
    kiv::test::Peer peer{bus, "org.example.Client",
        [this](GDBusMessage* call)
        {
            delivered += g_dbus_message_get_path(call) == Path() ? 1 : 0;
            return g_dbus_message_new_method_reply(call);
        }};

    int error = 0;
    GDBusConnection* const connection = DADBusManager::GetInstance()->InitDbusConnection(&error); ///< held as by an agent

    Client() { peer.Forget(); }
    std::string Path() const { return "/example/client/" + std::to_string(number); }
};

} // namespace

void Try(std::string_view input)
{
    static Client& client = *new Client;
    static DADBusManager& manager = *DADBusManager::GetInstance();
    auto lines = Split(input, '\n');
    lines.resize(std::min(lines.size(), kMostRecords));
    auto& records = client.store.records;
    records.clear();
    for (const auto& line : lines)
    {
        const auto fields = Split(line, '\t', 3);
        records.push_back({fields[0], fields[1], fields[2]});
    }
    Feed(records.size() + 1);
    ++client.number;
    client.delivered = 0;
    const auto place = static_cast<std::ptrdiff_t>(input.size() % (records.size() + 1));
    records.insert(records.begin() + place, {client.peer.Name(), client.Path(), "org.example.Client"});

    char imsi[] = "450";
    if (lines[0] != "push")
        Require(manager.SendStatusNotification(imsi, 7, "on") == 0, "a notification is dispatched");
    else
        Require(manager.DeliverPushMessage("mail", "data", "message", 1) == 0, "a push is dispatched");
    while (client.delivered == 0 && lines[0] == "push" && !g_dbus_connection_is_closed(client.connection))
        g_main_context_iteration(nullptr, TRUE);
    while (g_main_context_iteration(nullptr, FALSE) != FALSE)
        continue;
    Require(!g_dbus_connection_is_closed(client.connection), "the bus does not disconnect");
    Require(client.delivered == 1, "the good record is called once");
    client.store.asked.clear();
}
