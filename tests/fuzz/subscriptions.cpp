// Lines with a method of the subscription service and, after a blank, arguments of any type in GVariant's text form. If the text is
// not a tuple, it is the content of one.
#include "Fuzz.h"
#include "services/Client.h"

#include <DASubscriberStore.h>
#include <SubscriptionService.h>

using namespace kiv::fuzz;
using namespace kiv::test;

namespace
{

/// The service in a separate thread, for as long as the process lives.
void Serve()
{
    std::promise<void> ready;
    std::thread(
        [&ready]
        {
            g_main_context_push_thread_default(g_main_context_new());
            kiv::SubscriptionService service(60, {});
            ready.set_value();
            while (service.GoOn())
                g_main_context_iteration(g_main_context_get_thread_default(), TRUE);
        })
        .detach();
    ready.get_future().wait();
}

/// Whether a tuple of that type can go on the bus at all.
bool IsBody(const std::string& tuple)
{
    return g_variant_is_signature(tuple.substr(1, tuple.size() - 2).c_str()) != FALSE && tuple.find("()", 1) == tuple.npos;
}

} // namespace

void Try(std::string_view input)
{
    static const StoreFolder folder;
    static const PrivateBus& bus = *new PrivateBus;
    [[maybe_unused]] static const bool isServed = (Serve(), true);
    static auto& client = *new std::unique_ptr<Client>(new Client(bus));

    for (const std::string& line : Split(input, '\n'))
    {
        const std::size_t blank = line.find(' ');
        const std::string method = line.substr(0, blank), text = blank == line.npos ? "()" : line.substr(blank + 1);
        if (g_dbus_is_member_name(method.c_str()) == FALSE || g_utf8_validate(text.c_str(), -1, nullptr) == FALSE)
            continue;
        g_autoptr(GVariant) arguments = g_variant_parse(nullptr, text.c_str(), nullptr, nullptr, nullptr);
        if (arguments == nullptr || g_variant_is_of_type(arguments, G_VARIANT_TYPE_TUPLE) == FALSE)
        {
            g_clear_pointer(&arguments, g_variant_unref);
            arguments = g_variant_parse(nullptr, ("(" + text + ",)").c_str(), nullptr, nullptr, nullptr);
        }
        if (arguments == nullptr || !IsBody(g_variant_get_type_string(arguments)))
            continue;
        const std::string answer = client->Call(method.c_str(), arguments);
        if (g_dbus_connection_is_closed(client->Bus()) != FALSE)
            client = std::make_unique<Client>(bus); // the bus disconnects a client that sends a type unknown to D-Bus
        Require(answer != "NoReply" && answer != "ServiceUnknown", "the service is there");
        Feed(1);
    }
    Require(client->Call("List").front() == '(', "the service answers");
    std::vector<DASubscription> records;
    std::string reason;
    DASubscriberStore().List(records, reason);
    for (const DASubscription& record : records)
        Require(record.subscriber.busname == client->UniqueName(), "a client subscribes only itself");
}
