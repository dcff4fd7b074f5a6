#ifndef DASUBSCRIBEDATAMANAGER_H
#define DASUBSCRIBEDATAMANAGER_H

#include "DASubscriberInfo.h"

#include <list>

/// Finds the subscribers of the agent's own events: policy, status, authentication, activation, number changes.
class __attribute__((visibility("default"))) DASubscribeDataManager
{
public:
    DASubscribeDataManager();
    ~DASubscribeDataManager();

    /// Appends the subscribers of one event, in the order in which they subscribed.
    /// @param kind  "policy", "status", "auth", "activated" or "number_changed"
    /// @param key   decimal service ID for "policy" and "status", "all" for the others
    /// @param subscribers  the list to append to
    /// @return whether the store could be read; if not, logs one error line and appends nothing
    /// Any thread; blocks on the store's file.
    bool GetSubscriber(const char* kind, const char* key, std::list<_SubscriberInfo>& subscribers);
};

#endif
