#ifndef KIV_REPORTEDFIND_H
#define KIV_REPORTEDFIND_H

#include "DASubscriberInfo.h"

#include <list>

/// Appends the subscribers recorded under kind and key. A store that can not be asked gives none, false and one error line in the
/// platform log.
bool ReportedFind(const char* kind, const char* key, std::list<_SubscriberInfo>& subscribers);

#endif
