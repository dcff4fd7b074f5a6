#include "CallRecord.h"
#include "StoreOutcome.h"
#include "Verbs.h"

#include <BusInterfaces.h>
#include <BusParty.h>
#include <StopSignals.h>

#include <utility>

namespace
{

/// Subscriptions that are taken back when the client service ends.
class Subscriptions
{
public:
    Subscriptions() = default;
    Subscriptions(const Subscriptions&) = delete;
    Subscriptions& operator=(const Subscriptions&) = delete;

    ~Subscriptions()
    {
        std::string reason;
        for (const DASubscription& subscription : made_)
        {
            if (store_.Remove(subscription, reason) == DASubscriberStore::Outcome::Failed)
                Note("could not take the subscription back: " + reason);
        }
    }

    void Make(DASubscription subscription)
    {
        std::string reason;
        RequireStored(store_.Add(subscription, reason), reason);
        made_.push_back(std::move(subscription));
    }

private:
    DASubscriberStore store_;
    std::vector<DASubscription> made_;
};

/// Kind and key of each subscription that the command line asks for.
std::vector<std::pair<std::string, std::string>> Wanted(const SubscribeOptions& options)
{
    std::vector<std::pair<std::string, std::string>> wanted;
    bool isKeyUsed = options.key.empty();
    for (const std::string& kind : options.kinds)
    {
        const bool takesKey = kind == "policy" || kind == "status" || kind == "push";
        if (takesKey && options.key.empty())
            throw Failure(Exit::Usage, "\"" + kind + "\" is subscribed to by service; name it with --key");
        wanted.emplace_back(kind, takesKey ? options.key : "all");
        isKeyUsed = isKeyUsed || takesKey || options.key == "all";
    }
    for (const std::string& service : options.pushes)
        wanted.emplace_back("push", service);
    if (wanted.empty())
        throw Failure(Exit::Usage, "nothing to subscribe to; name it with --kind or --push");
    if (!isKeyUsed)
        throw Failure(Exit::Usage, "auth, activated and number_changed are subscribed to for all services; leave --key out");
    return wanted;
}

} // namespace

Exit Subscribe(const SubscribeOptions& options, const Command& command)
{
    const auto wanted = Wanted(options);
    kiv::StopSignals signals;
    kiv::BusParty party(kiv::kClientServiceXml,
        [form = command.form](const kiv::BusCall& call) -> GVariant*
        {
            PrintLine(CallRecord(call), form);
            return nullptr;
        });
    if (!options.name.empty())
        party.OwnName(options.name);

    Subscriptions subscriptions;
    std::vector<std::string> subscribed;
    for (const auto& [kind, key] : wanted)
    {
        subscriptions.Make({kind, key, {party.Name(), party.ObjectPath(), party.Interface()}});
        subscribed.push_back(kind);
        subscribed.back().append(":").append(key);
    }
    PrintLine({{"event", "ready"}, {"bus_name", party.Name()}, {"subscribed", subscribed}}, command.form);
    if (signals.IterateWhile([&party] { return party.IsConnected(); }))
        return Exit::Done;
    throw Failure(Exit::NoBus, "the bus went away");
}
