#include "Bus.h"
#include "CallRecord.h"
#include "StoreOutcome.h"
#include "Verbs.h"

#include <BusInterfaces.h>
#include <BusParty.h>
#include <StandardOutput.h>
#include <StopSignals.h>
#include <SubscriptionService.h>

#include <utility>

namespace
{

using Outcome = DASubscriberStore::Outcome;

/// Subscriptions that are removed when the client service ends. The subscription service makes them if it answers or can be
/// started; otherwise they are written to the store's file.
class Subscriptions
{
public:
    /// @param party    who subscribes; outlives the subscriptions
    /// @param useFile  do not use the subscription service
    Subscriptions(const kiv::BusParty& party, bool useFile) : party_(party), isServed_(!useFile && IsServiceThere()) {}
    Subscriptions(const Subscriptions&) = delete;
    Subscriptions& operator=(const Subscriptions&) = delete;

    ~Subscriptions()
    {
        std::string reason;
        for (const DASubscription& subscription : made_)
        {
            const Outcome outcome = isServed_ ? Call("Unsubscribe", subscription, reason) : store_.Remove(subscription, reason);
            if (outcome == Outcome::Failed || outcome == Outcome::Refused)
                Note("could not remove the subscription: " + reason);
        }
    }

    void Make(DASubscription subscription)
    {
        std::string reason;
        RequireStored(isServed_ ? Call("Subscribe", subscription, reason) : store_.Add(subscription, reason), reason);
        made_.push_back(std::move(subscription));
    }

private:
    bool IsServiceThere() const
    {
        const char* const name = kiv::SubscriptionService::kBusName;
        return party_.CallBus("GetNameOwner", g_variant_new("(s)", name), "(s)") != nullptr ||
               party_.CallBus("StartServiceByName", g_variant_new("(su)", name, 0U), "(u)") != nullptr;
    }

    Outcome Call(const char* method, const DASubscription& subscription, std::string& reason)
    {
        const _SubscriberInfo& who = subscription.subscriber;
        g_autoptr(GError) error = nullptr;
        g_autoptr(GVariant) reply = g_dbus_connection_call_sync(party_.Connection(), kiv::SubscriptionService::kBusName,
            "/org/kiv/Subscriptions", "org.kiv.Subscriptions1", method,
            g_variant_new("(sssos)", subscription.kind.c_str(), subscription.key.c_str(), who.busname.c_str(),
                who.objectpath.c_str(), who.interface.c_str()),
            G_VARIANT_TYPE("(b)"), G_DBUS_CALL_FLAGS_NONE, -1, nullptr, &error);
        if (reply != nullptr)
            return Outcome::Done;
        const bool isRefused = g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_INVALID_ARGS) ||
                               g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_ACCESS_DENIED) ||
                               g_error_matches(error, G_DBUS_ERROR, G_DBUS_ERROR_LIMITS_EXCEEDED);
        g_dbus_error_strip_remote_error(error);
        reason = error->message;
        return isRefused ? Outcome::Refused : Outcome::Failed;
    }

    const kiv::BusParty& party_;
    const bool isServed_;
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
            throw Failure(Exit::Usage, "\"" + kind + "\" needs a service; give it with --key");
        wanted.emplace_back(kind, takesKey ? options.key : "all");
        isKeyUsed = isKeyUsed || takesKey || options.key == "all";
    }
    for (const std::string& service : options.pushes)
        wanted.emplace_back("push", service);
    if (wanted.empty())
        throw Failure(Exit::Usage, "nothing to subscribe to; give it with --kind or --push");
    if (!isKeyUsed)
        throw Failure(Exit::Usage, "auth, activated and number_changed have no service; omit --key");
    return wanted;
}

} // namespace

Exit Subscribe(const SubscribeOptions& options, const Command& command)
{
    const auto wanted = Wanted(options);
    RequireBus();
    kiv::StopSignals signals;
    kiv::BusParty party(kiv::kClientServiceXml,
        [form = command.form](const kiv::BusCall& call) -> GVariant*
        {
            PrintLine(CallRecord(call), form);
            return nullptr;
        });
    if (!options.name.empty())
        party.OwnName(options.name);

    if (!options.store.empty())
        g_setenv("KIV_SUBSCRIBERS", options.store.c_str(), TRUE);
    Subscriptions subscriptions(party, !options.store.empty());
    std::vector<std::string> subscribed;
    for (const auto& [kind, key] : wanted)
    {
        subscriptions.Make({kind, key, {party.Name(), party.ObjectPath(), party.Interface()}});
        subscribed.push_back(kind);
        subscribed.back().append(":").append(key);
    }
    PrintLine({{"event", "ready"}, {"bus_name", party.Name()}, {"subscribed", subscribed}}, command.form);
    const bool wasStopped = signals.IterateWhile([&party] { return party.IsConnected(); });
    kiv::StandardOutput::EndStream();
    if (wasStopped)
        return Exit::Done;
    throw Failure(Exit::NoBus, "the connection to the bus was lost");
}
