#include "bus/Subscribers.h"

#include <DADatabaseManager.h>
#include <DASubscribeDataManager.h>

DASubscribeDataManager::DASubscribeDataManager() = default;
DASubscribeDataManager::~DASubscribeDataManager() = default;

bool DASubscribeDataManager::GetSubscriber(const char* kind, const char* key, std::list<_SubscriberInfo>& subscribers)
{
    auto& store = *kiv::test::Subscribers::current;
    {
        const std::lock_guard lock(store.mutex);
        store.asked.push_back(kind + std::string(" ") + key);
    }
    subscribers.insert(subscribers.end(), store.records.begin(), store.records.end());
    return true;
}

DADatabaseManager::DADatabaseManager() = default;
DADatabaseManager::~DADatabaseManager() = default;

bool DADatabaseManager::GetSubscriber(const char* kind, const char* key, std::list<_SubscriberInfo>& subscribers)
{
    return DASubscribeDataManager().GetSubscriber(kind, key, subscribers);
}
