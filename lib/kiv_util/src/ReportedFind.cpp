#include "ReportedFind.h"

#include "DASubscriberStore.h"

#include <dlog.h>

bool ReportedFind(const char* kind, const char* key, std::list<_SubscriberInfo>& subscribers)
{
    std::string reason;
    if (DASubscriberStore().Find(kind, key, subscribers, reason) != DASubscriberStore::Outcome::Failed)
        return true;

    __dlog_print(LOG_ID_SYSTEM, DLOG_ERROR, "KIV_UTIL", "no subscribers of %s \"%s\": %s\n", kind, key, reason.c_str());
    return false;
}
