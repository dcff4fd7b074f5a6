#ifndef DASUBSCRIBERSTORE_H
#define DASUBSCRIBERSTORE_H

#include "DASubscriberInfo.h"

#include <list>
#include <string>
#include <vector>

/// One record of the store: an event and a subscriber of it.
struct DASubscription
{
    std::string kind;           ///< one of DASubscriberStore::Kinds()
    std::string key;            ///< decimal service ID for "policy" and "status", service name for "push", otherwise "all"
    _SubscriberInfo subscriber; ///< the address to call
};

/// The subscriptions of the device: one SQLite file that several processes read and write at the same time.
///
/// The file is $KIV_SUBSCRIBERS if that is set, otherwise kiv/subscribers.db in the user's state directory. A program with more
/// rights than its caller ignores the variable. Each call looks the path up again. The first Add() makes the file and its directory
/// with access for the user only. A damaged file, or one with another schema, is reported and left unchanged.
///
/// Every change is in the file before the call returns. The next call undoes a change that was interrupted, even by SIGKILL.
/// Another file may be moved over the store at any time; if a process was killed during a change, first remove the journal next to
/// the store (its name ends in -journal). Each change locks the store's directory with flock() while it runs.
///
/// To read, a process needs only the right to read the file, and no disk space. It also needs the right to write the file and its
/// directory if it must undo a change or merge a log of version 1.0.0. The first change converts a store of that
/// version, unless a process of that version has it open.
///
/// A reading process keeps the file open between calls. A child made by fork inherits no descriptor of it and can use the store.
/// Any thread; one call runs at a time. Each call blocks on the file, at most a few seconds if other processes keep it busy. A
/// reason is set only for the outcomes that mention one. std::bad_alloc may be thrown.
class __attribute__((visibility("default"))) DASubscriberStore
{
public:
    /// The outcome of a call.
    enum class Outcome
    {
        Done,
        Unchanged, ///< already added, or not there to remove
        Refused,   ///< the subscription is invalid: the reason names the field, its value and what is valid
        Failed     ///< the file cannot be used: the reason is "FILE: TROUBLE; ADVICE", with no "; " in the advice
    };

    /// Returns the kinds of events, with "push" for push messages.
    static std::vector<std::string> Kinds();

    /// Returns the absolute path of the store, which need not exist.
    static std::string Path();

    /// Adds a subscription after the existing ones. Refuses
    /// - a kind that is not one of Kinds();
    /// - a key that is empty, longer than 255 bytes, not UTF-8, or contains control characters, invisible formatting characters
    ///   (such as U+202E) or line separators (such as U+2028);
    /// - a key for "policy" or "status" that the agent never looks up. It looks up the first nine characters of the decimal service
    ///   ID, so valid keys are 0 and numbers of up to nine digits, or eight after a minus sign, without leading zeros;
    /// - an invalid or reserved bus name, object path or interface, and a path of more than 1024 bytes.
    Outcome Add(const DASubscription& subscription, std::string& reason);

    /// Removes a subscription; all five fields must be equal.
    Outcome Remove(const DASubscription& subscription, std::string& reason);

    /// Checks that subscriptions can be added and removed, without changing the store. If the store does not exist, checks that it
    /// can be made.
    Outcome Check(std::string& reason);

    /// Appends all subscriptions, in the order in which they were added. A store that does not exist counts as empty.
    Outcome List(std::vector<DASubscription>& subscriptions, std::string& reason);

    /// Appends the subscribers with that kind and key, in the order in which they were added; null finds nothing. Takes
    /// microseconds even in a store with many others.
    Outcome Find(const char* kind, const char* key, std::list<_SubscriberInfo>& subscribers, std::string& reason);
};

#endif
