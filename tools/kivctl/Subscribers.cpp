#include "StoreOutcome.h"
#include "Verbs.h"

#include <algorithm>
#include <iterator>

namespace
{

DASubscription Subscription(const SubscriptionOptions& options)
{
    return {options.kind, options.key, {options.busName, options.objectPath, options.interface}};
}

Record ToRecord(const DASubscription& subscription)
{
    const _SubscriberInfo& who = subscription.subscriber;
    return {{"kind", subscription.kind}, {"key", subscription.key}, {"bus_name", who.busname}, {"object_path", who.objectpath},
        {"interface", who.interface}};
}

/// Prints the result in JSON. In text, the exit code says it.
void PrintResult(const char* result, const DASubscription& subscription, const Form& form)
{
    if (form.notation != Form::Notation::Json)
        return;
    Record record = ToRecord(subscription);
    record.insert(record.begin(), {"result", result});
    Print(record, form);
}

} // namespace

void RequireStored(DASubscriberStore::Outcome outcome, const std::string& reason)
{
    if (outcome == DASubscriberStore::Outcome::Refused)
        throw Failure(Exit::Refused, reason);
    if (outcome == DASubscriberStore::Outcome::Failed)
        throw Failure(Exit::NoStore, "the subscriber store cannot be used: " + reason);
}

Exit ListSubscribers(const Command& command)
{
    std::vector<DASubscription> subscriptions;
    std::string reason;
    RequireStored(DASubscriberStore().List(subscriptions, reason), reason);

    std::vector<Record> records;
    std::transform(subscriptions.begin(), subscriptions.end(), std::back_inserter(records), ToRecord);
    PrintTable(records, command.form);
    if (records.empty())
        Note("there are no subscriptions in " + DASubscriberStore::Path());
    return Exit::Done;
}

Exit AddSubscriber(const SubscriptionOptions& options, const Command& command)
{
    std::string reason;
    const auto outcome = DASubscriberStore().Add(Subscription(options), reason);
    RequireStored(outcome, reason);
    if (outcome == DASubscriberStore::Outcome::Unchanged)
        Note("this subscription already exists");
    PrintResult(outcome == DASubscriberStore::Outcome::Done ? "added" : "unchanged", Subscription(options), command.form);
    return Exit::Done;
}

Exit RemoveSubscriber(const SubscriptionOptions& options, const Command& command)
{
    std::string reason;
    const auto outcome = DASubscriberStore().Remove(Subscription(options), reason);
    RequireStored(outcome, reason);
    if (outcome == DASubscriberStore::Outcome::Unchanged)
        throw Failure(Exit::No, "there is no such subscription; give all five fields as \"kivctl subscribers list\" shows them");
    PrintResult("removed", Subscription(options), command.form);
    return Exit::Done;
}
