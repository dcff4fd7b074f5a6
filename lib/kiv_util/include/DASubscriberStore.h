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
    std::string key;            ///< decimal service ID for "policy" and "status", service name for "push", else "all"
    _SubscriberInfo subscriber; ///< where to call
};

/// The subscriptions of the device: one SQLite file that several processes read and write at the same time.
///
/// The file is $KIV_SUBSCRIBERS if that is set, else kiv/subscribers.db in the user's state directory; a program with more rights
/// than its caller ignores the variable. The path is looked up on each call. The first Add makes the file and its directory, for
/// the user alone. A file that is damaged or has another schema is left as it is, and reported.
///
/// Every change is written to the file before the call returns, and a change that was interrupted, also by SIGKILL, is undone by
/// the next call. Another file may be moved over the store at any time; if a process was killed during a change, remove the journal
/// beside the store first (its name ends in -journal). Whoever changes the store locks its directory with flock() meanwhile.
///
/// To read, a process needs the right to read the file, and no room on the disk. Only what is left to undo, or to fold from a log
/// of version 1.0.0, needs the right to write the file and its directory. The first change converts a store of that version, unless
/// a process of that version has it open.
///
/// A process that reads keeps the file open from call to call; a child made by fork inherits no descriptor of it, and can use the
/// store. Any thread, one call at a time. Each call blocks on the file, at most a few seconds when other processes keep it busy. A
/// reason is set only where an outcome says so. std::bad_alloc may leave.
class __attribute__((visibility("default"))) DASubscriberStore
{
public:
    enum class Outcome
    {
        Done,
        Unchanged, ///< added before, or not there to remove
        Refused,   ///< the subscription is not possible: the reason names the field, the value and what would be right
        Failed     ///< the file cannot be used: the reason is "FILE: TROUBLE; ADVICE", with no "; " in the advice
    };

    /// The kinds of events that there are; "push" is that of push messages.
    static std::vector<std::string> Kinds();

    /// Where the store is, or would be made: an absolute path.
    static std::string Path();

    /// Records a subscription behind those that are there. Refused are
    /// - a kind that is not one of Kinds();
    /// - a key that is empty, longer than 255 bytes, not UTF-8, or has control characters, invisible formatting characters (such as
    ///   U+202E) or line separators (such as U+2028);
    /// - a key for "policy" or "status" that the agent never looks up: it writes the service ID in decimal and takes the first nine
    ///   characters, so 0 is possible and every number of up to nine digits, or eight behind a minus sign, that begins with 1 to 9;
    /// - a bus name, an object path or an interface that is none, or that the bus reserves, and a path of more than 1024 bytes.
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
