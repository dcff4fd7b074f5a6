#ifndef STALERECORD_H
#define STALERECORD_H

#include <DASubscriberStore.h>

#include <string>

/// The command that removes a subscription, for a shell.
std::string RemovalOf(const DASubscription& subscription);

/// Why a call to a subscriber failed, in words for the user: for a bus name that nobody owns, with the command that removes the
/// record, which the store is asked for.
/// @param trouble  as the library logs it
/// @param kind     of the subscription
/// @param key      of the subscription
/// @param busName  of the subscriber; empty where only `trouble` names it
std::string DeliveryTrouble(
    const std::string& trouble, const std::string& kind, const std::string& key, const std::string& busName);

#endif
