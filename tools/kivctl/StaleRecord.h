#ifndef STALERECORD_H
#define STALERECORD_H

#include <DASubscriberStore.h>

#include <string>

/// The shell command that removes a subscription.
std::string RemovalOf(const DASubscription& subscription);

/// Says why a call to a subscriber failed. If no program owns the bus name, includes the command that removes the subscription,
/// which is looked up in the store.
/// @param trouble  as the library logs it
/// @param kind     of the subscription
/// @param key      of the subscription
/// @param busName  of the subscriber; empty where only `trouble` names it
std::string DeliveryTrouble(
    const std::string& trouble, const std::string& kind, const std::string& key, const std::string& busName);

#endif
