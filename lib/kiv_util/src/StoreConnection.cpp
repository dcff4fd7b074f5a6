#include "StoreConnection.h"

#include <fcntl.h>
#include <glib.h>
#include <sys/file.h>
#include <unistd.h>

#include <cerrno>
#include <fstream>
#include <utility>

namespace
{

constexpr const char* kSchemaVersion = "1";
constexpr int kPatienceMs = 5000; // maximum wait for other processes that use the file

constexpr const char* kPermit = "allow this user to read and write the file and its directory";
constexpr const char* kTryAgain = "try again when no other process keeps it busy";
constexpr const char* kNameAnother = "set KIV_SUBSCRIBERS to another file";
constexpr const char* kMakeRoom = "free space on the disk";

constexpr const char* kSchema =
    "BEGIN;"
    "CREATE TABLE subscription(id INTEGER PRIMARY KEY, kind TEXT NOT NULL, key TEXT NOT NULL, busname TEXT NOT NULL,"
    " objectpath TEXT NOT NULL, interface TEXT NOT NULL, UNIQUE(kind, key, busname, objectpath, interface));"
    "CREATE INDEX subscription_by_event ON subscription(kind, key, id);"
    "PRAGMA user_version = 1;"
    "COMMIT";

/// With that index, a search reads only the rows that it returns, in their order.
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

/// Returns advice about a failure of a system call.
const char* Advice(int cause)
{
    return cause == EACCES || cause == EPERM ? kPermit : cause == ENOSPC ? kMakeRoom : kNameAnother;
}

/// Returns advice about a failure of SQLite.
const char* Advice(int code, int cause)
{
    if (code == SQLITE_CORRUPT || code == SQLITE_NOTADB)
        return "the file is damaged: move it away and subscribe again";
    if (code == SQLITE_BUSY)
        return kTryAgain;
    if (code == SQLITE_FULL || cause == ENOSPC)
        return kMakeRoom;
    if (code == SQLITE_READONLY || code == SQLITE_CANTOPEN)
        return kPermit;
    return "check the disk and its file system";
}

/// Whether a store has the format of version 1.0.0 and an empty log.
bool HasFoldedLog(const std::string& path)
{
    constexpr int kFormPosition = 18;
    constexpr int kLogForm = 2;
    std::ifstream file(path, std::ios::binary);
    struct stat log;
    return file.seekg(kFormPosition).get() == kLogForm && (stat((path + "-wal").c_str(), &log) != 0 || log.st_size == 0);
}

/// Makes an empty file, which is a database without tables, unless a file exists. The caller holds the directory's lock.
void MakeFile(const std::string& path)
{
    const int file = open(path.c_str(), O_RDONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0600);
    if (file >= 0)
        close(file);
    else if (errno != EEXIST)
        throw StoreTrouble(path, std::string("the file cannot be created: ") + g_strerror(errno), Advice(errno));
}

} // namespace

DirectoryLock::DirectoryLock(const std::string& path) : directory_(open(path.c_str(), O_RDONLY | O_DIRECTORY | O_CLOEXEC))
{
    if (directory_ < 0)
        throw StoreTrouble(path, g_strerror(errno), Advice(errno));
    for (int waitedMs = 0; flock(directory_, LOCK_EX | LOCK_NB) != 0 && errno == EWOULDBLOCK; ++waitedMs)
    {
        if (waitedMs == kPatienceMs)
        {
            close(directory_);
            throw StoreTrouble(path, "another process has locked the directory", kTryAgain);
        }
        g_usleep(1000);
    }
}

DirectoryLock::~DirectoryLock()
{
    close(directory_);
}

std::unique_ptr<StoreConnection> StoreConnection::Open(const std::string& path, Use use)
{
    struct stat file;
    if (use != Use::Make && stat(path.c_str(), &file) != 0 && errno == ENOENT)
        return nullptr;
    std::unique_ptr<StoreConnection> connection(new StoreConnection(path, use));
    if (use == Use::Read && HasFoldedLog(path) && !connection->CanUseLog())
        connection.reset(new StoreConnection(path, Use::ReadFrozen));
    if (!connection->IsBlank())
        return connection;
    if (use != Use::Make)
        return nullptr;
    connection->Execute(kSchema);
    return connection;
}

StoreConnection::StoreConnection(std::string path, Use use) : path_(std::move(path))
{
    const g_autofree char* directory = g_path_get_dirname(path_.c_str());
    if (use == Use::Make && g_mkdir_with_parents(directory, 0700) != 0)
        throw StoreTrouble(directory, std::string("the directory cannot be created: ") + g_strerror(errno), Advice(errno));
    if (use == Use::Change || use == Use::Make)
        lock_ = std::make_unique<DirectoryLock>(directory);
    if (use == Use::Make)
        MakeFile(path_);

    // Before the file is opened, so that IsInPlace() and IsUpToDate() notice if it is replaced in between.
    if (stat(path_.c_str(), &file_) != 0)
        throw StoreTrouble(path_, g_strerror(errno), Advice(errno));
    if (!S_ISREG(file_.st_mode))
        throw StoreTrouble(path_, "not a regular file", kNameAnother);

    sqlite3* db = nullptr;
    const int mode = use == Use::Change || use == Use::Make ? SQLITE_OPEN_READWRITE : SQLITE_OPEN_READONLY;
    const g_autofree char* uri = g_filename_to_uri(path_.c_str(), nullptr, nullptr);
    const std::string name = uri + std::string(use == Use::ReadFrozen ? "?immutable=1" : "");
    const int result = sqlite3_open_v2(name.c_str(), &db, mode | SQLITE_OPEN_URI | SQLITE_OPEN_NOMUTEX, nullptr);
    db_.reset(db);
    if (result != SQLITE_OK)
        Fail();
    sqlite3_busy_timeout(db, kPatienceMs);
}

void StoreConnection::RequireChangeable(const std::string& path)
{
    struct stat file;
    if (lstat(path.c_str(), &file) == 0 && access(path.c_str(), R_OK | W_OK) != 0)
        throw StoreTrouble(path, std::string("the file cannot be changed: ") + g_strerror(errno), Advice(errno));

    std::string directory = path;
    do
    {
        const g_autofree char* above = g_path_get_dirname(directory.c_str());
        directory = above;
    } while (stat(directory.c_str(), &file) != 0 && errno == ENOENT); // missing ones are made together with the store
    // Only an attempt shows whether the file system and the user's rights allow new files.
    std::string attempt = directory + "/.kiv-XXXXXX";
    const int made = mkostemp(attempt.data(), O_CLOEXEC);
    if (made < 0)
        throw StoreTrouble(directory, std::string("no file can be made there: ") + g_strerror(errno), Advice(errno));
    unlink(attempt.c_str());
    close(made);
}

/// Whether the log can be read. For that, SQLite must be able to write a file next to the store.
bool StoreConnection::CanUseLog()
{
    return sqlite3_exec(db_.get(), "PRAGMA user_version", nullptr, nullptr, nullptr) == SQLITE_OK;
}

bool StoreConnection::IsInPlace() const
{
    struct stat file;
    return stat(path_.c_str(), &file) == 0 && file.st_dev == file_.st_dev && file.st_ino == file_.st_ino;
}

bool StoreConnection::IsUpToDate(const std::string& path) const
{
    struct stat file;
    return stat(path.c_str(), &file) == 0 && file.st_dev == file_.st_dev && file.st_ino == file_.st_ino &&
           file.st_ctim.tv_sec == file_.st_ctim.tv_sec && file.st_ctim.tv_nsec == file_.st_ctim.tv_nsec;
}

/// Whether the tables must still be made. Another process may make tables and version at this moment, but always both at once, so
/// asking for the tables first is safe.
bool StoreConnection::IsBlank()
{
    const bool isEmpty = Value("SELECT count(*) FROM sqlite_schema") == "0";
    const std::string version = Value("PRAGMA user_version");
    hasLog_ = Value("PRAGMA journal_mode") == "wal";
    if (version != kSchemaVersion && !(isEmpty && version == "0"))
        throw StoreTrouble(path_, "schema version " + version + " instead of " + kSchemaVersion, kNameAnother);
    return version != kSchemaVersion;
}

bool StoreConnection::Add(const DASubscription& subscription)
{
    return Change(kAdd, subscription);
}

bool StoreConnection::Remove(const DASubscription& subscription)
{
    return Change(kRemove, subscription);
}

bool StoreConnection::Change(const char* sql, const DASubscription& subscription)
{
    // Merges a log of version 1.0.0 into the file. If a process of that version has the store open, a later change merges it.
    // Readers of this version close the store soon, but SQLite does not wait for them here.
    const auto fold = [this] { return sqlite3_exec(db_.get(), "PRAGMA journal_mode = DELETE", nullptr, nullptr, nullptr); };
    for (int tries = 0; fold() == SQLITE_BUSY && tries < kPatienceMs; ++tries)
        g_usleep(1000);

    const _SubscriberInfo& subscriber = subscription.subscriber;
    const Statement statement = Prepare(sql);
    Run(statement.get(), {subscription.kind, subscription.key, subscriber.busname, subscriber.objectpath, subscriber.interface},
        [](sqlite3_stmt*) {});
    return sqlite3_changes(db_.get()) != 0;
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

std::string StoreConnection::Value(const char* sql)
{
    std::string value;
    const Statement statement = Prepare(sql);
    Run(statement.get(), {}, [&](sqlite3_stmt* row) { value = Text(row, 0); });
    return value;
}

void StoreConnection::Execute(const char* sql)
{
    if (sqlite3_exec(db_.get(), sql, nullptr, nullptr, nullptr) != SQLITE_OK)
        Fail();
}

/// Runs a statement with these values, and calls `row` for each row of its result. The values need not outlive the call.
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
    const int code = sqlite3_errcode(db_.get());
    const int cause = sqlite3_system_errno(db_.get());
    if (sqlite3_extended_errcode(db_.get()) == SQLITE_READONLY_ROLLBACK)
        throw JournalTrouble(path_, "a change was interrupted and has to be undone first", kPermit);
    std::string trouble = sqlite3_errmsg(db_.get());
    if (cause != 0 && (code == SQLITE_CANTOPEN || code == SQLITE_IOERR))
        trouble.append(" (").append(g_strerror(cause)).append(")");
    throw StoreTrouble(path_, trouble, Advice(code, cause));
}
