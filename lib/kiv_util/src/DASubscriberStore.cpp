#include "DASubscriberStore.h"

#include "StoreConnection.h"

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

using Outcome = DASubscriberStore::Outcome;

/// What the process's callers share, since to open the store takes far longer than to search it.
struct SharedConnection
{
    std::mutex use;
    std::unique_ptr<StoreConnection> connection;
};

SharedConnection& Shared();

void BeforeFork()
{
    Shared().use.lock();
    Shared().connection.reset(); // no child may inherit a connection of SQLite's
}

void AfterFork()
{
    Shared().use.unlock();
}

void AtExit()
{
    const std::lock_guard<std::mutex> lock(Shared().use);
    Shared().connection.reset(); // the store is left as one file
}

/// Never destroyed: the store may still be asked while the process ends.
SharedConnection& Shared()
{
    static SharedConnection* const shared = []
    {
        auto made = std::make_unique<SharedConnection>();
        if (pthread_atfork(BeforeFork, AfterFork, AfterFork) != 0 || std::atexit(AtExit) != 0)
            throw std::bad_alloc();
        return made.release();
    }();
    return *shared;
}

/// Runs `work` with the open store, or with null where `open` finds none.
template <typename Work>
Outcome WithStore(std::unique_ptr<StoreConnection> (*open)(const std::string& path), std::string& reason, Work&& work)
{
    const std::lock_guard<std::mutex> lock(Shared().use);
    std::unique_ptr<StoreConnection>& connection = Shared().connection;
    try
    {
        const std::string path = DASubscriberStore::Path();
        if (connection != nullptr && !connection->Serves(path))
            connection.reset();
        if (connection == nullptr)
            connection = open(path);
        return work(connection.get());
    }
    catch (const StoreTrouble& trouble)
    {
        connection.reset();
        reason = trouble.what();
        return Outcome::Failed;
    }
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

bool IsKey(const std::string& text)
{
    if (text.empty() || text.size() > 255 || g_utf8_validate(text.data(), static_cast<gssize>(text.size()), nullptr) == FALSE)
        return false;
    for (const char* at = text.c_str(); *at != '\0'; at = g_utf8_next_char(at))
    {
        if (g_unichar_iscntrl(g_utf8_get_char(at)) != FALSE)
            return false;
    }
    return true;
}

/// Why a subscription can not be one; empty when it can.
std::string Objection(const DASubscription& subscription)
{
    const _SubscriberInfo& subscriber = subscription.subscriber;
    const struct
    {
        const char* field;
        const std::string& value;
        bool (*isPossible)(const std::string&);
        std::string wanted;
    } rules[] = {
        {"kind", subscription.kind, IsKind, KindWanted()},
        {"key", subscription.key, IsKey, "1 to 255 bytes of UTF-8 without control characters are needed, such as 7 or all"},
        {"bus name", subscriber.busname, [](const std::string& text) { return g_dbus_is_name(text.c_str()) != FALSE; },
            "two or more elements joined by dots are needed, such as org.example.Client"},
        {"object path", subscriber.objectpath,
            [](const std::string& text) { return g_variant_is_object_path(text.c_str()) != FALSE; },
            "elements of letters, digits and underscores, a slash before each, are needed, such as /org/example/Client"},
        {"object path", subscriber.objectpath,
            [](const std::string& text) { return g_str_has_prefix(text.c_str(), "/org/freedesktop/DBus/Local") == FALSE; },
            "the bus reserves what begins like this and disconnects who calls it"},
        {"interface", subscriber.interface, [](const std::string& text) { return g_dbus_is_interface_name(text.c_str()) != FALSE; },
            "two or more elements joined by dots are needed, such as org.example.Client"},
        {"interface", subscriber.interface,
            [](const std::string& text) { return g_str_has_prefix(text.c_str(), "org.freedesktop.DBus.Local") == FALSE; },
            "the bus reserves what begins like this and disconnects who calls it"},
    };
    for (const auto& rule : rules)
    {
        if (rule.value.find('\0') == std::string::npos && rule.isPossible(rule.value))
            continue;
        const g_autofree char* shown = g_strescape(rule.value.c_str(), nullptr);
        return std::string(rule.field) + " \"" + shown + "\": " + rule.wanted;
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
    const char* const chosen = std::getenv("KIV_SUBSCRIBERS");
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
    return WithStore(StoreConnection::OpenOrMake, reason,
        [&](StoreConnection* store) { return store->Add(subscription) ? Outcome::Done : Outcome::Unchanged; });
}

Outcome DASubscriberStore::Remove(const DASubscription& subscription, std::string& reason)
{
    return WithStore(StoreConnection::Open, reason,
        [&](StoreConnection* store)
        { return store != nullptr && store->Remove(subscription) ? Outcome::Done : Outcome::Unchanged; });
}

Outcome DASubscriberStore::List(std::vector<DASubscription>& subscriptions, std::string& reason)
{
    return WithStore(StoreConnection::Open, reason,
        [&](StoreConnection* store)
        {
            if (store != nullptr)
            {
                std::vector<DASubscription> all = store->List();
                std::move(all.begin(), all.end(), std::back_inserter(subscriptions));
            }
            return Outcome::Done;
        });
}

Outcome DASubscriberStore::Find(const char* kind, const char* key, std::list<_SubscriberInfo>& subscribers, std::string& reason)
{
    if (kind == nullptr || key == nullptr)
        return Outcome::Done;
    return WithStore(StoreConnection::Open, reason,
        [&](StoreConnection* store)
        {
            if (store != nullptr)
                subscribers.splice(subscribers.end(), store->Find(kind, key));
            return Outcome::Done;
        });
}
