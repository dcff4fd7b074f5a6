#ifndef SUBSCRIPTIONSERVICE_H
#define SUBSCRIPTIONSERVICE_H

#include "BusParty.h"
#include "CallLimit.h"

#include <DASubscriberStore.h>

#include <set>

namespace kiv
{

/// Writes to the subscriber store for client services, which call it as dbus/org.kiv.Subscriptions1.xml describes.
///
/// A caller can subscribe only itself: the bus identifies the caller and the owner of a name. All state that must survive a kill is
/// in the store and in the NameBook next to it, so a new process has nothing to restore.
class SubscriptionService : public BusParty
{
public:
    static constexpr char kBusName[] = "org.kiv.Subscriptions";
    static constexpr int kMostRecords = 1000; ///< per user
    static constexpr double kIdleSeconds = 60;

    /// Starts to serve; the owner must call GoOn() regularly. Throws BusError.
    /// @param idleSeconds     GoOn() ends the service after this time without calls and without subscriptions of unique names
    /// @param administrators  user ids that may list and remove the subscriptions of others
    SubscriptionService(double idleSeconds, std::set<guint32> administrators);
    ~SubscriptionService() override;

    /// Removes the subscriptions of unique names that left the bus. A call that arrives while the service ends is answered, or
    /// makes the bus start a successor.
    bool GoOn() override;

private:
    using Records = std::vector<DASubscription>;
    using Change = DASubscriberStore::Outcome (DASubscriberStore::*)(const DASubscription&, std::string&);
    struct Deleter
    {
        void operator()(GSource* source) const;
    };

    GVariant* Answer(const BusCall& call);
    bool Subscribe(const DASubscription& wanted, const char* sender);
    bool Unsubscribe(const DASubscription& unwanted, const char* sender);
    GVariant* List(const char* sender);
    void Sweep();
    Records ReadStore();
    bool HasUniqueNames();
    bool Apply(Change change, const DASubscription& subscription);
    bool ApplyAsOwner(Change change, Change inverse, const DASubscription& subscription, const char* sender);
    void RequireOwner(const std::string& name, const char* sender) const;
    bool IsOwner(const std::string& name, const char* sender) const;
    bool IsAdministrator(const char* sender) const;
    guint32 UserOf(const char* sender) const;
    VariantPtr AskBus(const char* method, GVariant* arguments, const char* replyType) const;

    const gint64 idleUs_;
    const std::set<guint32> administrators_;
    const CallLimit limit_;
    DASubscriberStore store_;
    std::string busId_;
    std::unique_ptr<GSource, Deleter> idleTimer_;
    guint departures_ = 0;   ///< signal subscription
    bool isIdle_ = false;    ///< the idle time is over
    bool isSweepDue_ = true; ///< a name may have left the bus
    gint64 restUntil_ = 0;   ///< time of the monotonic clock
};

} // namespace kiv

#endif
