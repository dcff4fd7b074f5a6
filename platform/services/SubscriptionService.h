#ifndef SUBSCRIPTIONSERVICE_H
#define SUBSCRIPTIONSERVICE_H

#include "BusParty.h"
#include "CallLimit.h"

#include <DASubscriberStore.h>

#include <set>

namespace kiv
{

/// Writes the subscriber store on behalf of the client services, which call it as dbus/org.kiv.Subscriptions1.xml describes.
///
/// Nobody subscribes for someone else: the bus says who the caller is and who owns a name. Whatever has to survive a kill is in the
/// store and in the NameBook beside it, so that a service that starts has nothing to restore.
class SubscriptionService : public BusParty
{
public:
    static constexpr char kBusName[] = "org.kiv.Subscriptions";
    static constexpr int kMostRecords = 1000; ///< of one user
    static constexpr double kIdleSeconds = 60;

    /// Serves from now on, as long as the owner calls GoOn(). Throws BusError.
    /// @param idleSeconds     after which GoOn() ends the service when nobody calls and no unique name has a subscription
    /// @param administrators  user ids that may list and remove what is others'
    SubscriptionService(double idleSeconds, std::set<guint32> administrators);
    ~SubscriptionService() override;

    /// Removes what names have left behind that are gone from the bus. A call that arrives while the service ends is answered, or
    /// has the bus start a successor.
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
    gint64 restUntil_ = 0;   ///< on the monotonic clock
};

} // namespace kiv

#endif
