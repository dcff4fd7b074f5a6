// Texts for the bus, a line each, behind a line with a letter that picks an operation (a capital one finds no subscriber) and a
// number: service id, flag or time.
#include "Bus.h"

#include <DASystem.h>

using namespace kiv::fuzz;

namespace
{

using Texts = std::vector<std::string>;
using Arguments = char* const*;
DASystem& facade = *DASystem::GetInstance();
DADBusManager& manager = *DADBusManager::GetInstance();

int SendOne(int number, Arguments texts)
{
    char* status = texts[1];
    return facade.SendMultiOnOffNotiToServiceManager(texts[0], 1, &number, &status);
}

// clang-format off
const struct
{
    std::ptrdiff_t texts; ///< how many go on the bus
    int refused;          ///< the code when one is no text
    int (*send)(int number, Arguments t);
} kOperations[] = {
    {5, 4, [](int n, Arguments t) { return manager.SendNotiToServiceManager(KIV_NOTI_TYPE_POLICY, t[0], n, t[1], t[2], t[3], t[4]); }},
    {5, 4, [](int n, Arguments t) { return manager.SendPolicyNotification(t[0], n, t[1], t[2], t[3], t[4]); }},
    {5, 4, [](int, Arguments t) { return manager.SendNumberChangedNotification(t[0], t[1], t[2], t[3], t[4]); }},
    {1, 4, [](int n, Arguments t) { return manager.SendAuthNotification(t[0], n); }},
    {1, 4, [](int n, Arguments t) { return manager.SendActivatedNotification(t[0], n); }},
    {2, 4, [](int n, Arguments t) { return manager.SendStatusNotification(t[0], n, t[1]); }},
    {2, 0, SendOne},
    {5, 0, [](int n, Arguments t) { return facade.SendNotiToServiceManager(KIV_NOTI_TYPE_POLICY, t[0], n, t[1], t[2], t[3], t[4]); }},
    {3, 0, [](int n, Arguments t) { return manager.DeliverPushMessage(t[0], t[1], t[2], n); }},
};
// clang-format on

void Collect(GVariant* value, Texts& texts)
{
    if (g_variant_is_of_type(value, G_VARIANT_TYPE_STRING))
        texts.emplace_back(g_variant_get_string(value, nullptr));
    for (gsize child = 0; g_variant_is_container(value) && child < g_variant_n_children(value); ++child)
    {
        g_autoptr(GVariant) part = g_variant_get_child_value(value, child);
        Collect(part, texts);
    }
}

} // namespace

void Try(std::string_view input)
{
    static std::mutex mutex;
    static std::vector<Texts> told;
    static Bus& bus = *new Bus(
        [](GDBusMessage* call)
        {
            const std::lock_guard lock(mutex);
            Collect(g_dbus_message_get_body(call), told.emplace_back());
        });
    const auto takeTold = []
    {
        const std::lock_guard lock(mutex);
        return std::exchange(told, {});
    };
    Texts texts = Split(input, '\n', 6);
    const std::string head = texts[0];
    texts.erase(texts.begin());
    std::vector<char*> arguments;
    for (std::string& text : texts)
        arguments.push_back((text = text.c_str()).data()); // up to the first null

    const std::size_t pick = static_cast<unsigned char>(g_ascii_tolower(head[0]) - 'a') % std::size(kOperations);
    const auto& operation = kOperations[pick];
    const bool isPush = operation.texts == 3, isHeard = g_ascii_isupper(head[0]) == FALSE || pick == 0;
    bus.store.records.assign(isHeard ? 1 : 0, {bus.peer.Name(), "/example/client", "org.example.Client"});
    bus.store.asked.clear();

    texts.resize(static_cast<std::size_t>(operation.texts));
    const bool areTexts =
        std::all_of(texts.begin(), texts.end(), [](const auto& text) { return g_utf8_validate(text.c_str(), -1, nullptr); });
    const int code = operation.send(Number(head.empty() ? head : head.substr(1)), arguments.data());
    Require(code == (areTexts ? 0 : operation.refused), "what is no text is refused");
    const std::vector<Texts> sent(areTexts && isHeard ? 1 : 0, texts);
    std::vector<Texts> arrived = takeTold();
    for (; isPush && arrived.size() < sent.size(); arrived = takeTold())
        g_main_context_iteration(nullptr, TRUE);
    Require(arrived == sent, "the texts arrive as they are");
    Feed(1);
}
