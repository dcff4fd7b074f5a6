#ifndef STOREOUTCOME_H
#define STOREOUTCOME_H

#include <DASubscriberStore.h>

#include <string>

/// Ends the verb unless the store did, or had done, what it was asked for.
void RequireStored(DASubscriberStore::Outcome outcome, const std::string& reason);

#endif
