#include "DASubscriberStore.h"

#include "StoreConnection.h"

#include <SubscriptionRules.h>
#include <pthread.h>

#include <algorithm>
#include <cstdlib>
#include <iterator>
#include <memory>
#include <mutex>
#include <new>

namespace
{

using kiv::kKinds;
using Outcome = DASubscriberStore::Outcome;

/// Shared by all callers in the process, since opening the store takes far longer than a search.
struct SharedConnection
{
    std::mutex use;
    std::unique_ptr<StoreConnection> connection;
};

SharedConnection& Shared();

void BeforeFork()
{
    Shared().use.lock();
    Shared().connection.reset(); // a child must not inherit a connection of SQLite
}

void AfterFork()
{
    Shared().use.unlock();
}

/// Never destroyed: the store may still be used while the process ends.
SharedConnection& Shared()
{
    static SharedConnection* const shared = []
    {
        auto made = std::make_unique<SharedConnection>();
        if (pthread_atfork(BeforeFork, AfterFork, AfterFork) != 0)
            throw std::bad_alloc();
        return made.release();
    }();
    return *shared;
}

/// Runs `work` with the path of the store, one thread at a time.
template <typename Work>
Outcome Guarded(std::string& reason, Work&& work)
{
    const std::lock_guard<std::mutex> lock(Shared().use);
    try
    {
        return work(DASubscriberStore::Path());
    }
    catch (const StoreTrouble& trouble)
    {
        reason = trouble.what();
        return Outcome::Failed;
    }
}

/// Runs `read` with the open store, if there is one.
template <typename Read>
Outcome Reading(std::string& reason, Read&& read)
{
    const auto readIf = [&](StoreConnection* store)
    {
        if (store != nullptr)
            read(*store);
        return Outcome::Done;
    };
    return Guarded(reason,
        [&](const std::string& path)
        {
            std::unique_ptr<StoreConnection> connection = std::move(Shared().connection);
            try
            {
                if (connection == nullptr || !connection->IsUpToDate(path))
                    connection = StoreConnection::Open(path, StoreConnection::Use::Read);
                readIf(connection.get());
            }
            catch (const JournalTrouble&)
            {
                connection.reset();
                return readIf(StoreConnection::Open(path, StoreConnection::Use::Change).get());
            }
            if (connection != nullptr && !connection->HasLog())
                Shared().connection = std::move(connection);
            return Outcome::Done;
        });
}

/// Runs `change` and returns whether it changed anything. If the file was replaced meanwhile, repeats the change in the new one.
template <typename Change>
Outcome Changing(StoreConnection::Use use, std::string& reason, Change&& change)
{
    return Guarded(reason,
        [&](const std::string& path)
        {
            Outcome outcome = Outcome::Unchanged;
            for (;;)
            {
                const std::unique_ptr<StoreConnection> connection = StoreConnection::Open(path, use);
                if (connection == nullptr)
                    return outcome;
                try
                {
                    if (change(*connection))
                        outcome = Outcome::Done;
                    if (connection->IsInPlace())
                        return outcome;
                }
                catch (const StoreTrouble&)
                {
                    if (connection->IsInPlace())
                        throw;
                }
            }
        });
}

} // namespace

std::vector<std::string> DASubscriberStore::Kinds()
{
    return {std::begin(kKinds), std::end(kKinds)};
}

std::string DASubscriberStore::Path()
{
    const char* const chosen = secure_getenv("KIV_SUBSCRIBERS");
    if (chosen == nullptr || *chosen == '\0')
    {
        const g_autofree char* usual = g_build_filename(g_get_user_state_dir(), "kiv", "subscribers.db", nullptr);
        return usual;
    }
    if (g_path_is_absolute(chosen) != FALSE)
        return chosen;
    const g_autofree char* absolute = g_canonicalize_filename(chosen, nullptr);
    return absolute;
}

Outcome DASubscriberStore::Add(const DASubscription& subscription, std::string& reason)
{
    const auto& [busName, objectPath, interface] = subscription.subscriber;
    if (const std::string objection = kiv::ObjectionTo(subscription.kind, subscription.key, busName, objectPath, interface);
        !objection.empty())
    {
        reason = objection;
        return Outcome::Refused;
    }
    return Changing(StoreConnection::Use::Make, reason, [&](StoreConnection& store) { return store.Add(subscription); });
}

Outcome DASubscriberStore::Remove(const DASubscription& subscription, std::string& reason)
{
    return Changing(StoreConnection::Use::Change, reason, [&](StoreConnection& store) { return store.Remove(subscription); });
}

Outcome DASubscriberStore::Check(std::string& reason)
{
    return Guarded(reason,
        [](const std::string& path)
        {
            StoreConnection::RequireChangeable(path);
            return Outcome::Done;
        });
}

Outcome DASubscriberStore::List(std::vector<DASubscription>& subscriptions, std::string& reason)
{
    return Reading(reason,
        [&](StoreConnection& store)
        {
            std::vector<DASubscription> all = store.List();
            std::move(all.begin(), all.end(), std::back_inserter(subscriptions));
        });
}

Outcome DASubscriberStore::Find(const char* kind, const char* key, std::list<_SubscriberInfo>& subscribers, std::string& reason)
{
    if (kind == nullptr || key == nullptr)
        return Outcome::Done;
    return Reading(reason, [&](StoreConnection& store) { subscribers.splice(subscribers.end(), store.Find(kind, key)); });
}
