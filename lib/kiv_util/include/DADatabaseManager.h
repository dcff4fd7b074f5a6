#ifndef DADATABASEMANAGER_H
#define DADATABASEMANAGER_H

#include "DASubscriberInfo.h"

#include <list>

/// Finds the subscribers of a service's push messages.
class __attribute__((visibility("default"))) DADatabaseManager
{
public:
    DADatabaseManager();
    ~DADatabaseManager();

    /// Appends the subscribers of one service's pushes, in the order in which they subscribed.
    /// @param kind  "push"
    /// @param key   service id
    /// @param subscribers  the list to append to
    /// @return whether the store could be read; if not, logs one error line and appends nothing
    /// Any thread; blocks on the store's file.
    bool GetSubscriber(const char* kind, const char* key, std::list<_SubscriberInfo>& subscribers);
};

#endif
