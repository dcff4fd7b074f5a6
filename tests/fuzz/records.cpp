// Lines of bus name, object path and interface with tabs between them; each line's name with each line's path and interface is a
// record of a subscriber. A good record stands somewhere among them. A line "push" in front has a push delivered, anything else
// has a notification.
#include "Bus.h"

using namespace kiv::fuzz;

namespace
{

std::atomic<unsigned> number{0}; ///< of the input: the good record has an object of its own, which no other record names
std::atomic<int> delivered{0};

std::string Path()
{
    return "/example/client/" + std::to_string(number);
}

} // namespace

void Try(std::string_view input)
{
    constexpr std::size_t kMostLines = 10; // the bus lets a connection wait for 128 replies at once
    static Bus& bus = *new Bus([](GDBusMessage* call) { delivered += g_dbus_message_get_path(call) == Path() ? 1 : 0; });
    auto lines = Split(input, '\n');
    lines.resize(std::min(lines.size(), kMostLines));
    auto& records = bus.store.records;
    records.clear();
    std::vector<std::vector<std::string>> fields;
    for (const auto& line : lines)
        fields.push_back(Split(line, '\t', 3));
    for (const auto& name : fields)
        for (const auto& object : fields)
            records.push_back({name[0], object[1], object[2]});
    Feed(records.size() + 1);
    ++number;
    delivered = 0;
    const auto place = static_cast<std::ptrdiff_t>(input.size() % (records.size() + 1));
    records.insert(records.begin() + place, {bus.peer.Name(), Path(), "org.example.Client"});

    char imsi[] = "450";
    if (lines[0] != "push")
        Require(bus.manager.SendStatusNotification(imsi, 7, "on") == 0, "a notification is dispatched");
    else
        Require(bus.manager.DeliverPushMessage("mail", "data", "message", 1) == 0, "a push is dispatched");
    while (delivered == 0 && lines[0] == "push" && !g_dbus_connection_is_closed(bus.connection))
        g_main_context_iteration(nullptr, TRUE);
    while (g_main_context_iteration(nullptr, FALSE) != FALSE)
        continue;
    Require(!g_dbus_connection_is_closed(bus.connection), "the bus does not disconnect");
    Require(delivered == 1, "the good record is called once");
    bus.store.asked.clear();
}
