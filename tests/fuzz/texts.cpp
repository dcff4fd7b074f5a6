// Texts for the bus, one per line. The first line has a letter that selects an operation, and a number: service id, flag or time.
#include "Fuzz.h"
#include "bus/Subscribers.h"
#include "support/Peer.h"

#include <DADBusManager.h>
#include <DASystem.h>

using namespace kiv::fuzz;
using namespace kiv::test;

namespace
{

using Arguments = char**;
DASystem& facade = *DASystem::GetInstance();
DADBusManager& manager = *DADBusManager::GetInstance();

// clang-format off
const struct
{
    std::ptrdiff_t texts; ///< how many are sent on the bus
    int refused;          ///< the code when one is invalid
    int (*send)(int number, Arguments t);
} kOperations[] = {
    {5, 4, [](int n, Arguments t) { return manager.SendNotiToServiceManager(KIV_NOTI_TYPE_POLICY, t[0], n, t[1], t[2], t[3], t[4]); }},
    {5, 4, [](int n, Arguments t) { return manager.SendPolicyNotification(t[0], n, t[1], t[2], t[3], t[4]); }},
    {5, 4, [](int, Arguments t) { return manager.SendNumberChangedNotification(t[0], t[1], t[2], t[3], t[4]); }},
    {1, 4, [](int n, Arguments t) { return manager.SendAuthNotification(t[0], n); }},
    {1, 4, [](int n, Arguments t) { return manager.SendActivatedNotification(t[0], n); }},
    {2, 4, [](int n, Arguments t) { return manager.SendStatusNotification(t[0], n, t[1]); }},
    {2, 0, [](int n, Arguments t) { return facade.SendMultiOnOffNotiToServiceManager(t[0], 1, &n, t + 1); }},
    {3, 0, [](int n, Arguments t) { return manager.DeliverPushMessage(t[0], t[1], t[2], n); }},
};
// clang-format on

} // namespace

void Try(std::string_view input)
{
    static std::vector<std::string> told; // bodies in order of arrival; read after an answer, or when `count` shows them
    static std::atomic<std::size_t> count{0};
    const auto answer = [](GDBusMessage* call)
    {
        GVariant* const body = g_dbus_message_get_body(call);
        told.emplace_back(static_cast<const char*>(g_variant_get_data(body)), g_variant_get_size(body));
        ++count;
        return g_dbus_message_new_method_reply(call);
    };
    static const PrivateBus& bus = *new PrivateBus;
    static Peer& peer = *new Peer(bus, "org.tizen.servicemanager.service", answer);
    [[maybe_unused]] static const GDBusConnection* const asAnAgentHoldsIt = g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr);
    peer.Forget();

    std::vector<std::string> texts = Split(input, '\n', 6);
    const std::string head = texts[0] + ' ';
    texts.erase(texts.begin());
    std::vector<char*> arguments;
    for (std::string& text : texts)
        arguments.push_back((text = text.c_str()).data()); // up to the first null
    const auto& operation = kOperations[static_cast<unsigned char>(head[0] - 'a') % std::size(kOperations)];
    texts.resize(static_cast<std::size_t>(operation.texts));
    const bool areTexts =
        std::all_of(texts.begin(), texts.end(), [](const auto& text) { return g_utf8_validate(text.c_str(), -1, nullptr); });
    Subscribers store;
    store.records.push_back({peer.Name(), "/example/client", "org.example.Client"});
    told.clear();
    count = 0;
    const int code = operation.send(Number(head.substr(1)), arguments.data());
    Require(code == (areTexts ? 0 : operation.refused), "what is no text is refused");
    while (areTexts && count == 0)
        g_main_context_iteration(nullptr, TRUE);
    Require(told.size() == (areTexts ? 1 : 0), "what is a text is sent once");
    for (const std::string& text : texts)
        Require(!areTexts || told[0].find(text + '\0') != std::string::npos, "the texts arrive as they are");
    Feed(1);
}
