#include "StaleRecord.h"

#include "Bus.h"

#include <glib.h>

#include <vector>

namespace
{

std::string ShellWord(const std::string& text)
{
    const bool isPlain =
        text.find_first_not_of("abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789._-/:@%+=,") == text.npos;
    if (isPlain && !text.empty())
        return text;
    g_autofree char* quoted = g_shell_quote(text.c_str());
    return quoted;
}

} // namespace

std::string RemovalOf(const DASubscription& subscription)
{
    const _SubscriberInfo& who = subscription.subscriber;
    std::string command = "kivctl subscribers remove";
    for (const std::string& field : {subscription.kind, subscription.key, who.busname, who.objectpath, who.interface})
        command += ' ' + ShellWord(field);
    return command;
}

std::string DeliveryTrouble(const std::string& trouble, const std::string& kind, const std::string& key, const std::string& busName)
{
    std::string why = ReasonOf(trouble);
    if (why != kNoOwner)
        return why;
    std::vector<DASubscription> subscriptions;
    std::string reason;
    DASubscriberStore().List(subscriptions, reason);
    for (const DASubscription& subscription : subscriptions)
    {
        const _SubscriberInfo& who = subscription.subscriber;
        const bool isNamed =
            busName.empty() ? trouble.find("The name " + who.busname + " ") != trouble.npos : who.busname == busName;
        if (subscription.kind != kind || subscription.key != key || !isNamed)
            continue;
        return why + "; start the service, or remove its record: " + RemovalOf(subscription);
    }
    return why;
}
