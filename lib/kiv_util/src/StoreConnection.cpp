#include "StoreConnection.h"

#include <fcntl.h>
#include <glib.h>
#include <unistd.h>

#include <cerrno>
#include <utility>

namespace
{

constexpr int kSchemaVersion = 1;
constexpr int kPatienceMs = 5000; // with other processes that use the file

constexpr const char* kSchema =
    "CREATE TABLE subscription(id INTEGER PRIMARY KEY, kind TEXT NOT NULL, key TEXT NOT NULL, busname TEXT NOT NULL,"
    " objectpath TEXT NOT NULL, interface TEXT NOT NULL, UNIQUE(kind, key, busname, objectpath, interface));"
    "CREATE INDEX subscription_by_event ON subscription(kind, key, id);"
    "PRAGMA user_version = 1;";

// By that index a search reads the rows that it finds, in their order, and no others.
constexpr const char* kFind = "SELECT busname, objectpath, interface FROM subscription INDEXED BY subscription_by_event"
                              " WHERE kind = ?1 AND key = ?2 ORDER BY id";
constexpr const char* kList = "SELECT kind, key, busname, objectpath, interface FROM subscription ORDER BY id";
constexpr const char* kAdd = "INSERT INTO subscription(kind, key, busname, objectpath, interface) VALUES(?1, ?2, ?3, ?4, ?5)"
                             " ON CONFLICT DO NOTHING";
constexpr const char* kRemove = "DELETE FROM subscription"
                                " WHERE kind = ?1 AND key = ?2 AND busname = ?3 AND objectpath = ?4 AND interface = ?5";

std::string Text(sqlite3_stmt* row, int column)
{
    const auto* const text = reinterpret_cast<const char*>(sqlite3_column_text(row, column));
    return text == nullptr ? std::string() : std::string(text, static_cast<std::size_t>(sqlite3_column_bytes(row, column)));
}

_SubscriberInfo Subscriber(sqlite3_stmt* row, int column)
{
    return {Text(row, column), Text(row, column + 1), Text(row, column + 2)};
}

bool IsSameFile(const struct stat& one, const struct stat& other)
{
    return one.st_dev == other.st_dev && one.st_ino == other.st_ino;
}

bool IsUnchanged(const struct stat& one, const struct stat& other)
{
    return one.st_size == other.st_size && one.st_mtim.tv_sec == other.st_mtim.tv_sec &&
           one.st_mtim.tv_nsec == other.st_mtim.tv_nsec;
}

/// Makes an empty file, which is a database without tables. One that another process made meanwhile is as good.
void MakeFile(const std::string& path)
{
    const g_autofree char* directory = g_path_get_dirname(path.c_str());
    if (g_mkdir_with_parents(directory, 0700) != 0)
        throw StoreTrouble(std::string(directory) + ": the directory can not be made: " + g_strerror(errno));

    const int file = open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0600);
    if (file >= 0)
        close(file);
    else if (errno != EEXIST)
        throw StoreTrouble(path + ": the file can not be made: " + g_strerror(errno));
}

} // namespace

std::unique_ptr<StoreConnection> StoreConnection::Open(const std::string& path)
{
    std::unique_ptr<StoreConnection> connection = OpenFile(path);
    return connection == nullptr || connection->IsBlank() ? nullptr : std::move(connection);
}

std::unique_ptr<StoreConnection> StoreConnection::OpenOrMake(const std::string& path)
{
    MakeFile(path);
    std::unique_ptr<StoreConnection> connection = OpenFile(path);
    if (connection == nullptr)
        throw StoreTrouble(path + ": no file can be made behind this name");
    if (connection->IsBlank())
        connection->MakeSchema();
    return connection;
}

std::unique_ptr<StoreConnection> StoreConnection::OpenFile(const std::string& path)
{
    struct stat file; // taken before the file is opened: if it is replaced in between, Serves() tells
    if (stat(path.c_str(), &file) == 0)
        return std::unique_ptr<StoreConnection>(new StoreConnection(path, file));
    if (errno == ENOENT)
        return nullptr;
    throw StoreTrouble(path + ": " + g_strerror(errno));
}

StoreConnection::StoreConnection(std::string path, const struct stat& file) : path_(std::move(path)), file_(file)
{
    if (!S_ISREG(file.st_mode))
        throw StoreTrouble(path_ + ": not a regular file");

    sqlite3* db = nullptr;
    const int result = sqlite3_open_v2(path_.c_str(), &db, SQLITE_OPEN_READWRITE | SQLITE_OPEN_NOMUTEX, nullptr);
    db_.reset(db);
    if (result != SQLITE_OK)
        Fail();
    sqlite3_busy_timeout(db, kPatienceMs);
    DropIndexOfAnother();
}

// SQLite finds the shared index of the write-ahead log by the name of the store. After another file took the store's place, the
// index there is that of the former one as long as some process keeps it open, and would give wrong pages of the new one. While
// nobody has this file open (the exclusive lock says so), whatever index is beside it is of no use.
void StoreConnection::DropIndexOfAnother()
{
    sqlite3_file* file = nullptr;
    sqlite3_file_control(db_.get(), "main", SQLITE_FCNTL_FILE_POINTER, &file);
    if (file->pMethods->xLock(file, SQLITE_LOCK_SHARED) != SQLITE_OK)
        return;
    if (file->pMethods->xLock(file, SQLITE_LOCK_EXCLUSIVE) == SQLITE_OK)
        unlink((std::string(sqlite3_db_filename(db_.get(), "main")) + "-shm").c_str());
    file->pMethods->xUnlock(file, SQLITE_LOCK_NONE);
}

bool StoreConnection::Serves(const std::string& path) const
{
    struct stat file;
    return path == path_ && stat(path.c_str(), &file) == 0 && IsSameFile(file, file_) && IsUnchanged(file, file_);
}

/// Whether the store is still to be made. Tables and version come into being together, so in this order the two questions are
/// safe against a process that makes them right now.
bool StoreConnection::IsBlank()
{
    const bool isEmpty = Number("SELECT count(*) FROM sqlite_schema") == 0;
    const int version = Number("PRAGMA user_version");
    if (version != kSchemaVersion && !(isEmpty && version == 0))
        throw StoreTrouble(path_ + ": schema version " + std::to_string(version) + " instead of " + std::to_string(kSchemaVersion) +
                           "; the file is left as it is");
    return version != kSchemaVersion;
}

void StoreConnection::MakeSchema()
{
    Execute("BEGIN IMMEDIATE");
    if (IsBlank()) // else another process made it while this one waited
        Execute(kSchema);
    Execute("COMMIT");
}

bool StoreConnection::Add(const DASubscription& subscription)
{
    sqlite3_exec(db_.get(), "PRAGMA journal_mode = WAL", nullptr, nullptr, nullptr); // if not now, then by a later Add
    return Change(kAdd, subscription);
}

bool StoreConnection::Remove(const DASubscription& subscription)
{
    return Change(kRemove, subscription);
}

bool StoreConnection::Change(const char* sql, const DASubscription& subscription)
{
    const _SubscriberInfo& subscriber = subscription.subscriber;
    const Statement statement = Prepare(sql);
    Run(statement.get(), {subscription.kind, subscription.key, subscriber.busname, subscriber.objectpath, subscriber.interface},
        [](sqlite3_stmt*) {});
    if (sqlite3_changes(db_.get()) == 0)
        return false;

    FoldLog();
    struct stat file;
    if (stat(path_.c_str(), &file) == 0 && IsSameFile(file, file_))
        file_ = file;
    return true;
}

// Between changes the store is whole in its one file, so that who replaces that file replaces the store. A log that another
// process is reading stays for the next change to fold.
void StoreConnection::FoldLog()
{
    sqlite3_busy_timeout(db_.get(), 0);
    sqlite3_wal_checkpoint_v2(db_.get(), "main", SQLITE_CHECKPOINT_TRUNCATE, nullptr, nullptr);
    sqlite3_busy_timeout(db_.get(), kPatienceMs);
}

std::vector<DASubscription> StoreConnection::List()
{
    std::vector<DASubscription> subscriptions;
    const Statement statement = Prepare(kList);
    Run(statement.get(), {}, [&](sqlite3_stmt* row) { subscriptions.push_back({Text(row, 0), Text(row, 1), Subscriber(row, 2)}); });
    return subscriptions;
}

std::list<_SubscriberInfo> StoreConnection::Find(std::string_view kind, std::string_view key)
{
    if (find_ == nullptr)
        find_ = Prepare(kFind);
    std::list<_SubscriberInfo> subscribers;
    Run(find_.get(), {kind, key}, [&](sqlite3_stmt* row) { subscribers.push_back(Subscriber(row, 0)); });
    return subscribers;
}

StoreConnection::Statement StoreConnection::Prepare(const char* sql)
{
    sqlite3_stmt* statement = nullptr;
    if (sqlite3_prepare_v2(db_.get(), sql, -1, &statement, nullptr) != SQLITE_OK)
        Fail();
    return Statement(statement);
}

int StoreConnection::Number(const char* sql)
{
    int number = 0;
    const Statement statement = Prepare(sql);
    Run(statement.get(), {}, [&](sqlite3_stmt* row) { number = sqlite3_column_int(row, 0); });
    return number;
}

void StoreConnection::Execute(const char* sql)
{
    if (sqlite3_exec(db_.get(), sql, nullptr, nullptr, nullptr) != SQLITE_OK)
        Fail();
}

/// Runs a statement with these values, and `row` for each row of its result. The values need not outlive the call.
template <typename Row>
void StoreConnection::Run(sqlite3_stmt* statement, std::initializer_list<std::string_view> values, Row&& row)
{
    struct Rewind
    {
        void operator()(sqlite3_stmt* used) const
        {
            sqlite3_reset(used);
            sqlite3_clear_bindings(used);
        }
    };
    const std::unique_ptr<sqlite3_stmt, Rewind> rewind(statement);

    int place = 0;
    for (const std::string_view value : values)
    {
        if (sqlite3_bind_text64(statement, ++place, value.data(), value.size(), SQLITE_STATIC, SQLITE_UTF8) != SQLITE_OK)
            Fail();
    }
    int result = SQLITE_ROW;
    while ((result = sqlite3_step(statement)) == SQLITE_ROW)
        row(statement);
    if (result != SQLITE_DONE)
        Fail();
}

void StoreConnection::Fail() const
{
    std::string reason = path_ + ": " + sqlite3_errmsg(db_.get());
    if (const int cause = sqlite3_system_errno(db_.get()); cause != 0 && sqlite3_errcode(db_.get()) == SQLITE_CANTOPEN)
        reason.append(" (").append(g_strerror(cause)).append(")");
    throw StoreTrouble(reason);
}
