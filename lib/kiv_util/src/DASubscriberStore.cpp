#include "DASubscriberStore.h"

#include "StoreConnection.h"

#include <RecordRules.h>
#include <gio/gio.h>
#include <pthread.h>

#include <algorithm>
#include <cstdlib>
#include <iterator>
#include <memory>
#include <mutex>
#include <new>

namespace
{

using kiv::FlawOf;
using kiv::RecordFlaw;
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

constexpr const char* kKinds[] = {"policy", "status", "auth", "activated", "number_changed", "push"};

bool IsKind(const std::string& text)
{
    return std::find(std::begin(kKinds), std::end(kKinds), text) != std::end(kKinds);
}

std::string KindWanted()
{
    std::string wanted = "one of these is needed:";
    for (const char* const kind : kKinds)
        wanted.append(" ").append(kind);
    return wanted;
}

/// Whether a text has no control characters, invisible formatting characters or line separators.
bool IsPlain(const std::string& text)
{
    for (const char* at = text.c_str(); *at != '\0'; at = g_utf8_next_char(at))
    {
        switch (g_unichar_type(g_utf8_get_char(at)))
        {
        case G_UNICODE_CONTROL:
        case G_UNICODE_FORMAT:
        case G_UNICODE_LINE_SEPARATOR:
        case G_UNICODE_PARAGRAPH_SEPARATOR:
            return false;
        default:
            break;
        }
    }
    return true;
}

/// Whether the agent can look up this text as a service ID: it uses the first nine characters of the decimal ID.
bool IsServiceId(const std::string& text)
{
    const std::string digits = text.substr(text.front() == '-' ? 1 : 0);
    return text.size() <= 9 && !digits.empty() && digits.find_first_not_of("0123456789") == std::string::npos &&
           (digits.front() != '0' || text == "0");
}

/// Returns what a valid key would be; null if the key is valid.
const char* WantedKey(const DASubscription& subscription)
{
    const std::string& key = subscription.key;
    if (key.empty() || key.size() > 255 || g_utf8_validate(key.data(), static_cast<gssize>(key.size()), nullptr) == FALSE ||
        !IsPlain(key))
        return "1 to 255 bytes of UTF-8 without control or invisible characters are needed, such as 7 or all";
    if ((subscription.kind == "policy" || subscription.kind == "status") && !IsServiceId(key))
        return "a service ID is needed: a decimal number, of which the first nine characters count, such as 7";
    return nullptr;
}

constexpr std::size_t kMostPathBytes = 1024;

std::string Refusal(const char* field, const std::string& value, const std::string& wanted)
{
    const g_autofree char* shown = g_strescape(value.c_str(), nullptr);
    return std::string(field) + " \"" + shown + "\": " + wanted;
}

/// Returns why a subscription is invalid; empty when it is valid.
std::string Objection(const DASubscription& subscription)
{
    const auto& [busName, objectPath, interface] = subscription.subscriber;
    constexpr const char* kName = "two or more elements joined by dots are needed, such as org.example.Client";
    constexpr const char* kPath =
        "elements of letters, digits and underscores, a slash before each, are needed, such as /org/example/Client";
    constexpr const char* kReserved = "the bus reserves names that begin like this and disconnects their callers";

    if (!IsKind(subscription.kind))
        return Refusal("kind", subscription.kind, KindWanted());
    if (const char* const wanted = WantedKey(subscription))
        return Refusal("key", subscription.key, wanted);
    if (objectPath.size() > kMostPathBytes)
        return Refusal("object path", objectPath, "at most " + std::to_string(kMostPathBytes) + " bytes are possible");

    switch (FlawOf(busName, objectPath, interface))
    {
    case RecordFlaw::BusName:
        return Refusal("bus name", busName, kName);
    case RecordFlaw::ObjectPath:
        return Refusal("object path", objectPath, kPath);
    case RecordFlaw::Interface:
        return Refusal("interface", interface, kName);
    case RecordFlaw::ReservedPath:
        return Refusal("object path", objectPath, kReserved);
    case RecordFlaw::ReservedInterface:
        return Refusal("interface", interface, kReserved);
    case RecordFlaw::None:
        break;
    }
    return {};
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
    if (const std::string objection = Objection(subscription); !objection.empty())
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
