#ifndef DASUBSCRIBERSTORE_H
#define DASUBSCRIBERSTORE_H

#include "DASubscriberInfo.h"

#include <list>
#include <string>
#include <vector>

/// One line of the store: who hears of which event.
struct DASubscription
{
    std::string kind;           ///< one of DASubscriberStore::Kinds()
    std::string key;            ///< decimal service id, service name for "push", or "all"
    _SubscriberInfo subscriber; ///< where to call
};

/// The subscriptions of the device: one SQLite file that several processes read and write at the same time.
///
/// The file is $KIV_SUBSCRIBERS when that is set, else kiv/subscribers.db in the user's state directory. It is looked up on each
/// call, made with its directory on the first Add, for the user alone, and never overwritten: a file that is damaged or of another
/// schema is left as it is and reported. The process keeps it open from call to call; a file that took its place is noticed, and a
/// child made by fork opens its own.
/// Any thread. Each call blocks on the file, at most a few seconds when other processes keep it busy. A reason is set only where an
/// outcome says so. std::bad_alloc may leave.
class __attribute__((visibility("default"))) DASubscriberStore
{
public:
    enum class Outcome
    {
        Done,
        Unchanged, ///< added before, or not there to remove
        Refused,   ///< the subscription can not be one: the reason names the field, the value and what would be right
        Failed     ///< the file can not be used: the reason names file and trouble
    };

    /// The kinds of events that there are; "push" is that of push messages.
    static std::vector<std::string> Kinds();

    /// Where the store is, or would be made: an absolute path.
    static std::string Path();

    /// Records a subscription behind those that are there.
    Outcome Add(const DASubscription& subscription, std::string& reason);

    /// Takes a subscription out; all five fields must be equal.
    Outcome Remove(const DASubscription& subscription, std::string& reason);

    /// Appends all subscriptions in the order in which they were added. A store that was never made is an empty one.
    Outcome List(std::vector<DASubscription>& subscriptions, std::string& reason);

    /// Appends the subscribers recorded under kind and key, in the order in which they were added; null finds nothing. Takes
    /// microseconds, however many others are recorded.
    Outcome Find(const char* kind, const char* key, std::list<_SubscriberInfo>& subscribers, std::string& reason);
};

#endif
