#include "DADatabaseManager.h"

#include "ReportedFind.h"

DADatabaseManager::DADatabaseManager() = default;

DADatabaseManager::~DADatabaseManager() {}

bool DADatabaseManager::GetSubscriber(const char* kind, const char* key, std::list<_SubscriberInfo>& subscribers)
{
    return ReportedFind(kind, key, subscribers);
}
