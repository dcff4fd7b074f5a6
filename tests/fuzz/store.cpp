// What is done to a store, a line each, with fields behind tabs: "+" adds a subscription, "-" removes one, "=" puts one into the
// file behind the store's back, "@" writes a text at a place of the file, "w" one into a write-ahead log beside it, "!" cuts the
// file. After each step, what is found and listed is compared with a list of the steps, as long as the file was not damaged.
#include "Fuzz.h"

#include <DASubscribeDataManager.h>
#include <DASubscriberStore.h>

#include <glib/gstdio.h>
#include <sqlite3.h>
#include <unistd.h>

#include <algorithm>
#include <fstream>

using namespace kiv::fuzz;

namespace
{

using Outcome = DASubscriberStore::Outcome;
using Lines = std::vector<std::string>;

/// A subscription in a line, as in the input.
std::string Line(const std::string& kind, const std::string& key, const _SubscriberInfo& subscriber)
{
    return kind + '\t' + key + '\t' + subscriber.busname + '\t' + subscriber.objectpath + '\t' + subscriber.interface;
}

/// Where the file is, which is made anew for each input.
std::string MakeDirectory()
{
    const g_autofree char* made = g_dir_make_tmp("kiv-fuzz-XXXXXX", nullptr);
    return made;
}
const std::string kDirectory = MakeDirectory(), kPath = kDirectory + "/subscribers.db";

void RemoveFiles()
{
    for (const char* const suffix : {"", "-wal", "-shm", "-journal"})
        g_unlink((kPath + suffix).c_str());
}

class Steps
{
public:
    void Take(const std::string& step)
    {
        const Lines fields = Split(step, '\t', 6);
        const DASubscription row{fields[1], fields[2], {fields[3], fields[4], fields[5]}};
        if (step[0] == '+' || step[0] == '-')
            Change(row, step[0] == '+' ? &DASubscriberStore::Add : &DASubscriberStore::Remove);
        else if (step[0] == '=')
            Insert(fields);
        else if (step[0] == '@' || step[0] == 'w' || step[0] == '!')
            Damage(step[0], static_cast<unsigned>(Number(fields[1])) % 65536, fields[2]);
        Compare(row.kind.c_str(), row.key.c_str());
    }

private:
    void Change(const DASubscription& row, Outcome (DASubscriberStore::*change)(const DASubscription&, std::string&))
    {
        std::string reason;
        const Outcome outcome = (store_.*change)(row, reason);
        Require((outcome == Outcome::Failed || outcome == Outcome::Refused) != reason.empty(), "a failure has a reason");
        Require(outcome != Outcome::Failed || isDamaged_, "only a damaged store fails");
        if (outcome != Outcome::Done)
            return;
        const std::string line = Line(row.kind, row.key, row.subscriber);
        const auto end = std::remove(lines_.begin(), lines_.end(), line);
        if (change == &DASubscriberStore::Remove)
            return static_cast<void>(lines_.erase(end, lines_.end()));
        Require(isDamaged_ || end == lines_.end(), "nothing is added twice");
        lines_.push_back(line);
    }

    void Insert(const Lines& fields)
    {
        sqlite3* db = nullptr;
        char* const sql = sqlite3_mprintf("INSERT INTO subscription VALUES(NULL, %Q, %Q, %Q, %Q, %Q)", fields[1].c_str(),
            fields[2].c_str(), fields[3].c_str(), fields[4].c_str(), fields[5].c_str());
        if (sqlite3_open_v2(kPath.c_str(), &db, SQLITE_OPEN_READWRITE, nullptr) == SQLITE_OK &&
            sqlite3_exec(db, sql, nullptr, nullptr, nullptr) == SQLITE_OK)
            lines_.push_back(Line(fields[1].c_str(), fields[2].c_str(), {fields[3].c_str(), fields[4].c_str(), fields[5].c_str()}));
        sqlite3_free(sql);
        sqlite3_close(db);
    }

    void Damage(char verb, unsigned place, const std::string& text)
    {
        isDamaged_ = true;
        if (verb == '!')
            return Require(truncate(kPath.c_str(), place) == 0 || errno == ENOENT, "the file is cut");
        std::fstream file(verb == 'w' ? kPath + "-wal" : kPath, verb == 'w' ? std::ios::out : std::ios::in | std::ios::out);
        file.seekp(place) << text;
    }

    void Compare(const char* kind, const char* key)
    {
        std::list<_SubscriberInfo> found;
        std::vector<DASubscription> listed;
        std::string reason;
        const bool isAsked = DASubscribeDataManager().GetSubscriber(kind, key, found);
        const bool isListed = store_.List(listed, reason) == Outcome::Done;
        Require((isAsked || found.empty()) && (isListed ? reason.empty() : listed.empty()), "a store that fails gives nothing");
        if (isDamaged_)
            return;
        Lines all, ofEvent;
        for (const auto& [rowKind, rowKey, subscriber] : listed)
            all.push_back(Line(rowKind, rowKey, subscriber));
        for (const _SubscriberInfo& subscriber : found)
            ofEvent.push_back(Line(kind, key, subscriber));
        Require(isAsked && isListed && all == lines_, "what is in the store is listed in order");
        const std::string event = kind + std::string("\t") + key + '\t';
        const auto isOther = [&](const std::string& line) { return line.rfind(event, 0) != 0; };
        all.erase(std::remove_if(all.begin(), all.end(), isOther), all.end());
        Require(ofEvent == all, "what is of the event is found in order, and nothing else");
    }

    DASubscriberStore store_;
    Lines lines_;
    bool isDamaged_ = false;
};

} // namespace

void Try(std::string_view input)
{
    static const struct Place
    {
        Place() { setenv("KIV_SUBSCRIBERS", kPath.c_str(), 1); }
        ~Place() { g_rmdir(kDirectory.c_str()); }
    } place;
    constexpr std::size_t kMostSteps = 16;
    RemoveFiles();
    Lines lines = Split(input, '\n');
    lines.resize(std::min(lines.size(), kMostSteps));
    Steps steps;
    for (const std::string& line : lines)
        steps.Take(line);
    RemoveFiles();
    Feed(lines.size());
}
