#include "bus/Subscribers.h"

#include <DADatabaseManager.h>
#include <DASubscribeDataManager.h>

DADatabaseManager::DADatabaseManager() = default;
DADatabaseManager::~DADatabaseManager() = default;

bool DADatabaseManager::GetSubscriber(const char* kind, const char* key, std::list<_SubscriberInfo>& subscribers)
{
    return DASubscribeDataManager().GetSubscriber(kind, key, subscribers);
}
