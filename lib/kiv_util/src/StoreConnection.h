#ifndef KIV_STORECONNECTION_H
#define KIV_STORECONNECTION_H

#include "DASubscriberStore.h"

#include <sqlite3.h>
#include <sys/stat.h>

#include <initializer_list>
#include <list>
#include <memory>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

/// The store cannot be used; what() is "FILE: TROUBLE; ADVICE".
struct StoreTrouble : std::runtime_error
{
    StoreTrouble(const std::string& file, const std::string& trouble, const std::string& advice)
        : std::runtime_error(file + ": " + trouble + "; " + advice)
    {
    }
};

/// The store has the journal of a change that was interrupted, or that is under way in a file which had its name before.
struct JournalTrouble : StoreTrouble
{
    using StoreTrouble::StoreTrouble;
};

/// The lock of processes that change a store, on the directory that the store is in. Waits for it a few seconds.
class DirectoryLock
{
public:
    explicit DirectoryLock(const std::string& path);
    DirectoryLock(const DirectoryLock&) = delete;
    DirectoryLock& operator=(const DirectoryLock&) = delete;
    ~DirectoryLock();

private:
    int directory_;
};

/// An open subscriber store. One thread at a time; not to be carried across a fork. Every operation throws StoreTrouble when the
/// file cannot be used, and the connection is of no more use then.
///
/// SQLite finds the journal of a change by the name of the store, and a journal that nobody holds is played back into the file that
/// has that name, even if another process writes it for a file that had the name before. So only connections that can change the
/// store play a journal back, and the directory's lock lets one of them be open at a time.
class StoreConnection
{
public:
    enum class Use
    {
        Read,       ///< JournalTrouble where there is a journal
        ReadFrozen, ///< what the file itself holds, whatever is beside it
        Change,     ///< holds the directory's lock, and plays a journal back
        Make        ///< likewise; makes the store first if there is none
    };

    /// Opens the store at an absolute path; null if none was made there.
    static std::unique_ptr<StoreConnection> Open(const std::string& path, Use use);

    /// Whether the file at its path is the one that was opened.
    bool IsInPlace() const;

    /// Whether this is the file at that path, and nobody has written to it since it was opened. SQLite notices what other
    /// connections write, but not another store that was copied into the file.
    bool IsUpToDate(const std::string& path) const;

    /// Whether it has a write-ahead log, as version 1.0.0 made it; nobody can convert such a store while it is open.
    bool HasLog() const { return hasLog_; }

    /// Whether the subscription is new.
    bool Add(const DASubscription& subscription);

    /// Whether the subscription was there.
    bool Remove(const DASubscription& subscription);

    std::vector<DASubscription> List();
    std::list<_SubscriberInfo> Find(std::string_view kind, std::string_view key);

private:
    struct Close
    {
        void operator()(sqlite3* db) const { sqlite3_close(db); }
        void operator()(sqlite3_stmt* statement) const { sqlite3_finalize(statement); }
    };
    using Database = std::unique_ptr<sqlite3, Close>;
    using Statement = std::unique_ptr<sqlite3_stmt, Close>;

    StoreConnection(std::string path, Use use);
    bool CanUseLog();
    bool IsBlank();
    bool Change(const char* sql, const DASubscription& subscription);

    Statement Prepare(const char* sql);
    std::string Value(const char* sql);
    void Execute(const char* sql);
    template <typename Row>
    void Run(sqlite3_stmt* statement, std::initializer_list<std::string_view> values, Row&& row);
    [[noreturn]] void Fail() const;

    std::string path_;
    struct stat file_;
    bool hasLog_ = false;
    std::unique_ptr<DirectoryLock> lock_; // held until the database is closed
    Database db_;
    Statement find_; // kept, since a search goes before every notification
};

#endif
