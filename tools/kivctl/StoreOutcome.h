#ifndef STOREOUTCOME_H
#define STOREOUTCOME_H

#include <DASubscriberStore.h>

#include <string>

/// Ends the verb when the store rejected a subscription or cannot be used.
void RequireStored(DASubscriberStore::Outcome outcome, const std::string& reason);

#endif
