#include "DASubscribeDataManager.h"

#include "ReportedFind.h"

DASubscribeDataManager::DASubscribeDataManager() = default;

DASubscribeDataManager::~DASubscribeDataManager() {}

bool DASubscribeDataManager::GetSubscriber(const char* kind, const char* key, std::list<_SubscriberInfo>& subscribers)
{
    return ReportedFind(kind, key, subscribers);
}
