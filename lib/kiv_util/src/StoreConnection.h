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

/// The store can not be used; what() names file and trouble.
struct StoreTrouble : std::runtime_error
{
    using std::runtime_error::runtime_error;
};

/// An open subscriber store. One thread at a time; not to be carried across a fork. Every operation throws StoreTrouble where the
/// file does not serve, and the connection is of no more use then.
class StoreConnection
{
public:
    /// Opens the store at an absolute path; null when none was made there yet.
    static std::unique_ptr<StoreConnection> Open(const std::string& path);

    /// Opens the store at an absolute path, which it makes first where there is none.
    static std::unique_ptr<StoreConnection> OpenOrMake(const std::string& path);

    /// Whether this is the path that was opened and the file that stands there is the one that was read last.
    bool Serves(const std::string& path) const;

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

    StoreConnection(std::string path, const struct stat& file);
    static std::unique_ptr<StoreConnection> OpenFile(const std::string& path);

    void DropIndexOfAnother();
    bool IsBlank();
    void MakeSchema();
    bool Change(const char* sql, const DASubscription& subscription);
    void FoldLog();

    Statement Prepare(const char* sql);
    int Number(const char* sql);
    void Execute(const char* sql);
    template <typename Row>
    void Run(sqlite3_stmt* statement, std::initializer_list<std::string_view> values, Row&& row);
    [[noreturn]] void Fail() const;

    std::string path_;
    struct stat file_;
    Database db_;
    Statement find_; // kept, since a search goes before every notification
};

#endif
