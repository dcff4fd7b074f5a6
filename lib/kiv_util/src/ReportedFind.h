#ifndef KIV_REPORTEDFIND_H
#define KIV_REPORTEDFIND_H

#include "DASubscriberInfo.h"

#include <list>

/// Appends the subscribers with that kind and key. When the store cannot be read, appends none, logs one error line and returns
/// false.
bool ReportedFind(const char* kind, const char* key, std::list<_SubscriberInfo>& subscribers);

#endif
