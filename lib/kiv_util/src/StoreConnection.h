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

/// The store has a journal: a change was interrupted, or is still running in a file that had the same name before.
struct JournalTrouble : StoreTrouble
{
    using StoreTrouble::StoreTrouble;
};

/// Locks the directory of a store for a change. Waits a few seconds for other processes.
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

/// An open subscriber store. One thread at a time; it must not cross a fork. Every operation throws StoreTrouble when the file
/// cannot be used; the connection is useless afterwards.
///
/// SQLite finds a journal by the name of the store. It plays an unlocked journal back into the file with that name, even if another
/// process is writing the journal for a file that had the name before. So only connections that can change the store play journals
/// back, and the directory's lock allows only one of them at a time.
class StoreConnection
{
public:
    enum class Use
    {
        Read,       ///< throws JournalTrouble if there is a journal
        ReadFrozen, ///< reads only the file, without a journal or log
        Change,     ///< holds the directory's lock, and plays a journal back
        Make        ///< like Change; makes the store first if there is none
    };

    /// Opens the store at an absolute path; null if there is none.
    static std::unique_ptr<StoreConnection> Open(const std::string& path, Use use);

    /// Throws StoreTrouble unless the store at an absolute path can be changed, or made if there is none. Changes nothing.
    static void RequireChangeable(const std::string& path);

    /// Whether the opened file is still the one at its path.
    bool IsInPlace() const;

    /// Whether the opened file is the one at that path and unchanged since. SQLite notices writes of other connections, but not
    /// another store that is copied into the file.
    bool IsUpToDate(const std::string& path) const;

    /// Whether the store has a write-ahead log, as in version 1.0.0. While it is open, no process can convert it.
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
    std::unique_ptr<DirectoryLock> lock_; // released after the database is closed
    Database db_;
    Statement find_; // kept, because every notification starts with a search
};

#endif
