#include "SubscriptionService.h"

#include "BusInterfaces.h"
#include "NameBook.h"

#include <SubscriptionRules.h>

#include <algorithm>
#include <map>
#include <tuple>
#include <utility>

namespace kiv
{
namespace
{

/// Makes the service rest as long as it worked. So even if callers keep it busy, bus and store are free for notifications half of
/// the time.
class Work
{
public:
    explicit Work(gint64& restUntil) : restUntil_(restUntil)
    {
        const gint64 now = g_get_monotonic_time();
        if (now < restUntil_)
            g_usleep(static_cast<gulong>(restUntil_ - now));
        began_ = g_get_monotonic_time();
    }
    Work(const Work&) = delete;
    Work& operator=(const Work&) = delete;

    ~Work()
    {
        constexpr gint64 kLongestRestUs = 100'000;
        const gint64 now = g_get_monotonic_time();
        restUntil_ = now + std::min(now - began_, kLongestRestUs);
    }

private:
    gint64& restUntil_;
    gint64 began_ = 0;
};

bool IsUniqueName(const std::string& name)
{
    return name.front() == ':';
}

auto Fields(const DASubscription& subscription)
{
    const _SubscriberInfo& who = subscription.subscriber;
    return std::tie(subscription.kind, subscription.key, who.busname, who.objectpath, who.interface);
}

DASubscription ReadArguments(const BusCall& call)
{
    const char *kind, *key, *busName, *path, *interface;
    g_variant_get(call.arguments, "(&s&s&s&o&s)", &kind, &key, &busName, &path, &interface);
    return {kind, key, {*busName == '\0' ? call.sender : busName, path, interface}};
}

void RequireValid(const DASubscription& subscription)
{
    const auto& [busName, objectPath, interface] = subscription.subscriber;
    const std::string objection = ObjectionTo(subscription.kind, subscription.key, busName, objectPath, interface);
    if (!objection.empty())
        throw CallError(G_DBUS_ERROR_INVALID_ARGS, objection);
}

void RequireDone(DASubscriberStore::Outcome outcome, const std::string& reason)
{
    if (outcome == DASubscriberStore::Outcome::Refused)
        throw CallError(G_DBUS_ERROR_INVALID_ARGS, reason);
    if (outcome == DASubscriberStore::Outcome::Failed)
        throw CallError(G_DBUS_ERROR_FAILED, reason);
}

} // namespace

void SubscriptionService::Deleter::operator()(GSource* source) const
{
    g_source_destroy(source);
    g_source_unref(source);
}

SubscriptionService::SubscriptionService(double idleSeconds, std::set<guint32> administrators)
    : BusParty(kSubscriptionsXml, [this](const BusCall& call) { return Answer(call); }),
      idleUs_(static_cast<gint64>(idleSeconds * G_TIME_SPAN_SECOND)),
      administrators_(std::move(administrators)),
      limit_(Connection()),
      idleTimer_(g_timeout_source_new(static_cast<guint>(idleUs_ / 1000)))
{
    const auto noteIdle = [](gpointer self) -> gboolean
    {
        static_cast<SubscriptionService*>(self)->isIdle_ = true;
        return G_SOURCE_CONTINUE;
    };
    g_source_set_callback(idleTimer_.get(), noteIdle, this, nullptr);
    g_source_attach(idleTimer_.get(), g_main_context_get_thread_default());

    const auto noteDeparture =
        [](GDBusConnection*, const char*, const char*, const char*, const char*, GVariant* names, gpointer self)
    {
        const char *name, *owner;
        g_variant_get(names, "(&s&s&s)", &name, nullptr, &owner);
        if (IsUniqueName(name) && *owner == '\0')
            static_cast<SubscriptionService*>(self)->isSweepDue_ = true;
    };
    departures_ = g_dbus_connection_signal_subscribe(Connection(), "org.freedesktop.DBus", "org.freedesktop.DBus",
        "NameOwnerChanged", "/org/freedesktop/DBus", nullptr, G_DBUS_SIGNAL_FLAGS_NONE, noteDeparture, this, nullptr);
    OwnName(kBusName);
}

SubscriptionService::~SubscriptionService()
{
    g_dbus_connection_signal_unsubscribe(Connection(), departures_);
}

bool SubscriptionService::GoOn()
{
    if (!isSweepDue_ && !isIdle_)
        return true;
    const bool isIdle = std::exchange(isIdle_, false);
    if (HasUniqueNames() || !isIdle)
        return true;
    ReleaseName();
    while (g_main_context_iteration(g_main_context_get_thread_default(), FALSE) != FALSE)
        continue;
    if (!HasUniqueNames())
        return false;
    try
    {
        OwnName(kBusName);
        return true;
    }
    catch (const BusError&)
    {
        return false; // a later call started a successor, which watches all names
    }
}

GVariant* SubscriptionService::Answer(const BusCall& call)
{
    const Work work(restUntil_);
    isIdle_ = false;
    g_source_set_ready_time(idleTimer_.get(), g_get_monotonic_time() + idleUs_);
    Sweep();
    const std::string method = call.method.name;
    if (method == "List")
        return List(call.sender);
    const bool isChanged =
        method == "Subscribe" ? Subscribe(ReadArguments(call), call.sender) : Unsubscribe(ReadArguments(call), call.sender);
    return g_variant_new("(b)", isChanged);
}

bool SubscriptionService::Subscribe(const DASubscription& wanted, const char* sender)
{
    const std::string& name = wanted.subscriber.busname;
    RequireOwner(name, sender);
    const Records records = ReadStore();
    const auto isWanted = [&](const DASubscription& record) { return Fields(record) == Fields(wanted); };
    if (std::any_of(records.begin(), records.end(), isWanted))
        return false;

    const guint32 user = UserOf(sender);
    NameBook book(DASubscriberStore::Path());
    const auto isOfUser = [&](const DASubscription& record)
    { return record.subscriber.busname == name || book.IsOf(record.subscriber.busname, user); };
    if (std::count_if(records.begin(), records.end(), isOfUser) >= kMostRecords)
    {
        throw CallError(G_DBUS_ERROR_LIMITS_EXCEEDED,
            "user " + std::to_string(user) + " has " + std::to_string(kMostRecords) + " subscriptions, which is the limit");
    }
    const auto isInUse = [&](const std::string& known)
    { return std::any_of(records.begin(), records.end(), [&](const auto& record) { return record.subscriber.busname == known; }); };
    book.SetUser(name, user, isInUse);
    return ApplyAsOwner(&DASubscriberStore::Add, &DASubscriberStore::Remove, wanted, sender);
}

bool SubscriptionService::Unsubscribe(const DASubscription& unwanted, const char* sender)
{
    const bool isAnyAllowed = IsAdministrator(sender);
    if (!isAnyAllowed)
        RequireOwner(unwanted.subscriber.busname, sender);
    RequireValid(unwanted);
    if (isAnyAllowed)
        return Apply(&DASubscriberStore::Remove, unwanted);
    return ApplyAsOwner(&DASubscriberStore::Remove, &DASubscriberStore::Add, unwanted, sender);
}

GVariant* SubscriptionService::List(const char* sender)
{
    const bool seesAll = IsAdministrator(sender);
    std::map<std::string, bool> isVisible;
    g_auto(GVariantBuilder) list = G_VARIANT_BUILDER_INIT(G_VARIANT_TYPE("a(sssss)"));
    for (const DASubscription& record : ReadStore())
    {
        const _SubscriberInfo& who = record.subscriber;
        const auto [name, isNew] = isVisible.emplace(who.busname, seesAll);
        if (isNew && !seesAll)
            name->second = IsOwner(who.busname, sender);
        if (name->second)
        {
            g_variant_builder_add(&list, "(sssss)", record.kind.c_str(), record.key.c_str(), who.busname.c_str(),
                who.objectpath.c_str(), who.interface.c_str());
        }
    }
    return g_variant_new("(a(sssss))", &list);
}

/// A bus never uses a unique name twice, but every bus starts with the same ones. So subscriptions with unique names of another bus
/// have no owner any more.
void SubscriptionService::Sweep()
{
    if (!isSweepDue_)
        return;
    NameBook book(DASubscriberStore::Path());
    const VariantPtr id = AskBus("GetId", nullptr, "(s)");
    const char* bus = nullptr;
    g_variant_get(id.get(), "(&s)", &bus);

    const VariantPtr reply = AskBus("ListNames", nullptr, "(as)");
    g_autofree const char** names = nullptr;
    g_variant_get(reply.get(), "(^a&s)", &names);
    for (const DASubscription& record : ReadStore())
    {
        const std::string& name = record.subscriber.busname;
        if (IsUniqueName(name) && (book.Bus() != bus || g_strv_contains(names, name.c_str()) == FALSE))
            Apply(&DASubscriberStore::Remove, record);
    }
    if (book.Bus() != bus)
        book.SetBus(bus);
    isSweepDue_ = false;
}

SubscriptionService::Records SubscriptionService::ReadStore()
{
    Records records;
    std::string reason;
    RequireDone(store_.List(records, reason), reason);
    return records;
}

/// Whether the store has a name to watch. An unusable store has none; callers receive the error.
bool SubscriptionService::HasUniqueNames()
{
    try
    {
        Sweep();
        const Records records = ReadStore();
        return std::any_of(
            records.begin(), records.end(), [](const DASubscription& record) { return IsUniqueName(record.subscriber.busname); });
    }
    catch (const CallError&)
    {
        return false;
    }
}

bool SubscriptionService::Apply(Change change, const DASubscription& subscription)
{
    std::string reason;
    const DASubscriberStore::Outcome outcome = (store_.*change)(subscription, reason);
    RequireDone(outcome, reason);
    return outcome == DASubscriberStore::Outcome::Done;
}

/// Applies a change, and undoes it if the name got another owner while the store made the change wait.
bool SubscriptionService::ApplyAsOwner(Change change, Change inverse, const DASubscription& subscription, const char* sender)
{
    if (!Apply(change, subscription))
        return false;
    if (!IsOwner(subscription.subscriber.busname, sender))
        Apply(inverse, subscription);
    RequireOwner(subscription.subscriber.busname, sender);
    return true;
}

void SubscriptionService::RequireOwner(const std::string& name, const char* sender) const
{
    if (!IsOwner(name, sender))
    {
        throw CallError(G_DBUS_ERROR_ACCESS_DENIED, "\"" + name + "\" is not a name of the caller " + sender +
                                                        "; a caller may use its unique name and the well-known names that it owns");
    }
}

bool SubscriptionService::IsOwner(const std::string& name, const char* sender) const
{
    if (name == sender)
        return true;
    const VariantPtr reply = CallBus("GetNameOwner", g_variant_new("(s)", name.c_str()), "(s)");
    const char* owner = "";
    if (reply != nullptr)
        g_variant_get(reply.get(), "(&s)", &owner);
    return std::string(owner) == sender;
}

bool SubscriptionService::IsAdministrator(const char* sender) const
{
    return administrators_.count(UserOf(sender)) != 0;
}

guint32 SubscriptionService::UserOf(const char* sender) const
{
    const VariantPtr reply = AskBus("GetConnectionUnixUser", g_variant_new("(s)", sender), "(u)");
    guint32 user = 0;
    g_variant_get(reply.get(), "(u)", &user);
    return user;
}

VariantPtr SubscriptionService::AskBus(const char* method, GVariant* arguments, const char* replyType) const
{
    g_autoptr(GError) error = nullptr;
    VariantPtr reply = CallBus(method, arguments, replyType, &error);
    if (reply != nullptr)
        return reply;
    const g_autofree char* reason = g_strdup_printf("the bus does not answer %s: %s", method, error->message);
    throw CallError(G_DBUS_ERROR_FAILED, reason);
}

} // namespace kiv
