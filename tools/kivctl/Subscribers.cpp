#include "StoreOutcome.h"
#include "Verbs.h"

namespace
{

DASubscription Subscription(const SubscriptionOptions& options)
{
    return {options.kind, options.key, {options.busName, options.objectPath, options.interface}};
}

} // namespace

void RequireStored(DASubscriberStore::Outcome outcome, const std::string& reason)
{
    if (outcome == DASubscriberStore::Outcome::Refused)
        throw Failure(Exit::Refused, reason);
    if (outcome == DASubscriberStore::Outcome::Failed)
        throw Failure(Exit::NoStore, "the subscriber store can not be used: " + reason);
}

Exit ListSubscribers(const Command& command)
{
    std::vector<DASubscription> subscriptions;
    std::string reason;
    RequireStored(DASubscriberStore().List(subscriptions, reason), reason);

    std::vector<Record> records;
    for (const DASubscription& subscription : subscriptions)
    {
        const _SubscriberInfo& who = subscription.subscriber;
        records.push_back({{"kind", subscription.kind}, {"key", subscription.key}, {"bus_name", who.busname},
            {"object_path", who.objectpath}, {"interface", who.interface}});
    }
    PrintTable(records, command.form);
    if (records.empty())
        Note("nobody has subscribed to anything in " + DASubscriberStore::Path());
    return Exit::Done;
}

Exit AddSubscriber(const SubscriptionOptions& options, const Command&)
{
    std::string reason;
    const auto outcome = DASubscriberStore().Add(Subscription(options), reason);
    RequireStored(outcome, reason);
    if (outcome == DASubscriberStore::Outcome::Unchanged)
        Note("was subscribed before");
    return Exit::Done;
}

Exit RemoveSubscriber(const SubscriptionOptions& options, const Command&)
{
    std::string reason;
    const auto outcome = DASubscriberStore().Remove(Subscription(options), reason);
    RequireStored(outcome, reason);
    if (outcome == DASubscriberStore::Outcome::Unchanged)
        throw Failure(
            Exit::No, "there is no such subscription; all five fields must be those that \"kivctl subscribers list\" shows");
    return Exit::Done;
}
