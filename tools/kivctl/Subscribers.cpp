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

/// Prints what became of a subscription; text has the exit code for that.
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
        throw Failure(Exit::NoStore, "the subscriber store can not be used: " + reason);
}

Exit ListSubscribers(const Command& command)
{
    std::vector<DASubscription> subscriptions;
    std::string reason;
    RequireStored(DASubscriberStore().List(subscriptions, reason), reason);

    RequireFields(ToRecord({}), command.form);
    std::vector<Record> records;
    std::transform(subscriptions.begin(), subscriptions.end(), std::back_inserter(records), ToRecord);
    PrintTable(records, command.form);
    if (records.empty())
        Note("nobody has subscribed to anything in " + DASubscriberStore::Path());
    return Exit::Done;
}

Exit AddSubscriber(const SubscriptionOptions& options, const Command& command)
{
    std::string reason;
    const auto outcome = DASubscriberStore().Add(Subscription(options), reason);
    RequireStored(outcome, reason);
    if (outcome == DASubscriberStore::Outcome::Unchanged)
        Note("was subscribed before");
    PrintResult(outcome == DASubscriberStore::Outcome::Done ? "added" : "unchanged", Subscription(options), command.form);
    return Exit::Done;
}

Exit RemoveSubscriber(const SubscriptionOptions& options, const Command& command)
{
    std::string reason;
    const auto outcome = DASubscriberStore().Remove(Subscription(options), reason);
    RequireStored(outcome, reason);
    if (outcome == DASubscriberStore::Outcome::Unchanged)
        throw Failure(
            Exit::No, "there is no such subscription; all five fields must be those that \"kivctl subscribers list\" shows");
    PrintResult("removed", Subscription(options), command.form);
    return Exit::Done;
}
