#include "StoreTest.h"

#include <fcntl.h>
#include <sqlite3.h>
#include <sys/mman.h>
#include <sys/resource.h>
#include <sys/wait.h>

#include <csignal>
#include <numeric>
#include <random>

namespace
{

using testing::Contains;
using testing::HasSubstr;
using testing::Not;
using testing::SizeIs;

/// Another process. The destructor kills it if it is still running.
class Beside
{
public:
    template <class Work>
    explicit Beside(Work work) : id_(fork())
    {
        if (id_ != 0)
            return;
        work();
        _exit(testing::Test::HasFailure() ? 1 : 0);
    }
    Beside(Beside&& other) noexcept : id_(std::exchange(other.id_, 0)) {}
    ~Beside()
    {
        if (id_ != 0)
            Kill();
    }

    void Kill()
    {
        kill(id_, SIGKILL);
        AwaitEnd(SIGKILL);
    }

    void AwaitEnd(int expected = 0)
    {
        int status = 0;
        EXPECT_EQ(id_, waitpid(id_, &status, 0));
        EXPECT_EQ(expected, status);
        id_ = 0;
    }

private:
    pid_t id_;
};

/// Writes to the file before it is killed.
constexpr const char* kInterrupted = "PRAGMA cache_size = 1; BEGIN; UPDATE subscription SET key = '8'; CREATE TABLE t(a);"
                                     "WITH RECURSIVE n(i) AS (SELECT 1 UNION ALL SELECT i + 1 FROM n WHERE i < 99)"
                                     "INSERT INTO t SELECT zeroblob(9999) FROM n";

struct BusyStore : SubscriberStore
{
    BusyStore() { Use("subscribers.db"); }

    /// State that the processes share.
    struct Board
    {
        std::atomic<int> arrived, added;
        std::atomic<bool> isOver;
    };

    ~BusyStore() override { munmap(board, sizeof(Board)); }

    /// Adds subscribers with the keys 1, 2, ... until `isOver`.
    void KeepAdding()
    {
        while (!board->isOver)
        {
            EXPECT_EQ(Outcome::Done, Add("push", std::to_string(board->added + 1), ":1.7")) << reason;
            ++board->added;
        }
    }

    void AwaitAdded(int more) const
    {
        for (const int wanted = board->added + more; board->added < wanted;)
            usleep(100);
    }

    std::vector<std::string> Keys()
    {
        std::vector<DASubscription> all;
        EXPECT_EQ(Outcome::Done, store.List(all, reason)) << reason;
        std::vector<std::string> keys;
        for (const DASubscription& one : all)
            keys.push_back(one.key);
        return keys;
    }

    /// Runs as a user who may read the store but write nothing.
    template <class Work>
    void AsReader(Work work)
    {
        const auto permit = [this](mode_t folder, mode_t file)
        {
            EXPECT_EQ(0, chmod(directory.c_str(), folder));
            for (const fs::directory_entry& entry : fs::directory_iterator(directory))
                EXPECT_EQ(0, chmod(entry.path().c_str(), file));
        };
        permit(0555, 0444);
        constexpr uid_t kNobody = 65534;
        Beside(
            [&]
            {
                EXPECT_TRUE(geteuid() != 0 || setuid(kNobody) == 0);
                work();
            })
            .AwaitEnd();
        permit(0700, 0600);
    }

    /// Runs SQL statements on the store. @return the connection, which the caller closes
    sqlite3* Execute(const char* sql)
    {
        sqlite3* db = nullptr;
        EXPECT_EQ(SQLITE_OK, sqlite3_open(store.Path().c_str(), &db));
        EXPECT_EQ(SQLITE_OK, sqlite3_exec(db, sql, nullptr, nullptr, nullptr)) << sqlite3_errmsg(db);
        return db;
    }

    Board* const board = new (mmap(nullptr, sizeof(Board), PROT_READ | PROT_WRITE, MAP_SHARED | MAP_ANONYMOUS, -1, 0)) Board();
};

TEST_F(BusyStore, LosesNothingWhileManyProcessesUseIt)
{
    constexpr int kStores = 10;
    std::vector<Beside> writers;
    for (const std::string writer : {":a.", ":b.", ":c.", ":d."})
    {
        writers.emplace_back(
            [&]
            {
                for (int i = 0; i < 2 * kStores; ++i)
                {
                    for (++board->arrived; i % 2 == 0 && board->arrived < 4 * (i + 1);)
                        std::this_thread::yield();
                    Use(std::to_string(i / 2));
                    EXPECT_THAT(Find("push", "7"), Not(HasSubstr("failed")));
                    EXPECT_EQ(Outcome::Done, Add("push", "7", writer + std::to_string(i % 2))) << reason;
                }
            });
    }
    for (Beside& writer : writers)
        writer.AwaitEnd();
    for (int i = 0; i < kStores; ++i)
    {
        Use(std::to_string(i));
        EXPECT_THAT(Find("push", "7"), SizeIs(8 * std::string(":a.0 ").size()));
    }
}

TEST_F(BusyStore, MayBeCopiedAndReplacedAtAnyTime)
{
    for (int round = 0; round < 12; ++round)
    {
        Use("coming.db");
        for (int i = 0; i < 8; ++i)
            EXPECT_EQ(Outcome::Done, Add("push", std::string(250, 'c') + std::to_string(i), ":8.8"));
        const std::string coming = store.Path();
        Use("former.db");
        EXPECT_EQ(Outcome::Done, Add("push", "former", ":8.8"));

        board->isOver = false;
        Beside writer([&] { KeepAdding(); });
        std::vector<Beside> readers;
        for (int i = 0; i < 2; ++i)
            readers.emplace_back(
                [&]
                {
                    for (;;)
                        EXPECT_THAT(Find("push", "1"), Not(HasSubstr("failed")));
                });
        AwaitAdded(2 + round % 3);
        fs::rename(coming, store.Path());
        const int first = board->added + 2; // the one before may have been added just before the move, and not been counted
        AwaitAdded(3);
        board->isOver = true;
        writer.AwaitEnd();
        fs::copy_file(store.Path(), directory / "copy.db", fs::copy_options::overwrite_existing);
        readers.clear();

        Use("copy.db");
        const std::vector<std::string> keys = Keys();
        EXPECT_THAT(keys, Not(Contains("former")));
        EXPECT_EQ(8, std::count_if(keys.begin(), keys.end(), [](const std::string& key) { return key.size() > 250; }));
        for (int number = first; number <= board->added; ++number)
            EXPECT_THAT(keys, Contains(std::to_string(number)));
        fs::remove(directory / "former.db");
    }
}

TEST_F(BusyStore, NoticesAnotherStoreThatIsCopiedIntoItsFile)
{
    for (const char* const name : {"one.db", "other.db"})
    {
        Use(name);
        EXPECT_EQ(Outcome::Done, Add("push", name, ":1.7"));
        EXPECT_EQ(":1.7 ", Find("push", name));
    }
    for (const char* const name : {"one.db", "other.db"}) // changed at almost the same moment
        EXPECT_EQ(0, chmod((directory / name).c_str(), 0600));
    for (const auto& [name, found] : {std::pair("one.db", ""), {"other.db", ":1.7 "}})
    {
        Use(name);
        EXPECT_EQ(found, Find("push", "other.db"));
    }
    std::ofstream(store.Path(), std::ios::binary) << Contents(directory / "one.db");
    EXPECT_EQ("", Find("push", "other.db"));
    EXPECT_EQ(":1.7 ", Find("push", "one.db"));
}

TEST_F(BusyStore, KeepsWhatAKilledWriterAdded)
{
    std::minstd_rand random;
    for (int round = 0; round < 30; ++round)
    {
        Beside writer([&] { KeepAdding(); });
        AwaitAdded(1);
        usleep(static_cast<useconds_t>(random() % 10'000));
        writer.Kill();

        std::vector<std::string> expected(static_cast<std::size_t>(board->added));
        for (std::size_t i = 0; i < expected.size(); ++i)
            expected[i] = std::to_string(i + 1);
        std::vector<std::string> keys = Keys();
        if (keys.size() == expected.size() + 1) // added, but killed before it could report it
            expected.push_back(std::to_string(++board->added));
        EXPECT_EQ(expected, keys);
    }
}

TEST_F(BusyStore, UndoesAnInterruptedChangeOrReportsWhyItCannot)
{
    EXPECT_EQ(Outcome::Done, Add("push", "7", ":1.7"));
    EXPECT_EQ(":1.7 ", Find("push", "7"));
    Beside(
        [&]
        {
            Execute(kInterrupted);
            raise(SIGKILL);
        })
        .AwaitEnd(SIGKILL);
    ASSERT_TRUE(fs::exists(store.Path() + "-journal"));
    AsReader([&] { EXPECT_THAT(Find("push", "7"), HasSubstr(": a change was interrupted and has to be undone first; allow ")); });
    EXPECT_EQ(":1.7 ", Find("push", "7"));
    EXPECT_FALSE(fs::exists(store.Path() + "-journal"));
}

TEST_F(BusyStore, CanBeReadWhenItCannotBeWritten)
{
    for (const char* const form : {"PRAGMA journal_mode = DELETE", "PRAGMA journal_mode = WAL"})
    {
        EXPECT_NE(Outcome::Failed, Add("push", "7", ":1.7")) << reason;
        sqlite3_close(Execute(form));
        AsReader(
            [&]
            {
                EXPECT_EQ(":1.7 ", Find("push", "7"));
                EXPECT_EQ(Outcome::Failed, Add("push", "7", ":1.8"));
                EXPECT_THAT(reason, HasSubstr("; allow this user to read and write the file and its directory"));
            });
        Beside full(
            [&]
            {
                signal(SIGXFSZ, SIG_IGN);
                const rlimit nothing{0, 0};
                EXPECT_EQ(0, setrlimit(RLIMIT_FSIZE, &nothing));
                EXPECT_EQ(":1.7 ", Find("push", "7"));
                EXPECT_EQ(Outcome::Failed, Add("push", "7", ":1.8"));
                EXPECT_THAT(reason, HasSubstr("; check the disk and its file system"));
                EXPECT_EQ(":1.7 ", Find("push", "7"));
            });
        full.AwaitEnd();
    }
}

TEST_F(BusyStore, SaysThatAnotherProcessKeepsItBusy)
{
    EXPECT_EQ(Outcome::Done, Add("push", "7", ":1.7"));
    const Beside holder(
        [&]
        {
            Execute("BEGIN EXCLUSIVE");
            ++board->added;
            pause();
        });
    while (board->added == 0)
        usleep(100);
    EXPECT_THAT(Find("push", "7"), HasSubstr("database is locked; try again when no other process keeps it busy\n"));
}

TEST_F(BusyStore, ReadsALogOfVersion1UntilTheFirstChangeMergesIt)
{
    for (int round = 0; round < 8; ++round)
    {
        Use(std::to_string(round));
        EXPECT_EQ(Outcome::Done, Add("push", "1", ":1.7"));
        Beside([&] { Execute("PRAGMA journal_mode = WAL; UPDATE subscription SET key = '2'"); }).AwaitEnd();
        ASSERT_LT(0U, fs::file_size(store.Path() + "-wal"));

        Beside reader(
            [&]
            {
                for (;; ++board->added)
                    EXPECT_EQ(":1.7 ", Find("push", "2"));
            });
        AwaitAdded(2);
        EXPECT_EQ(Outcome::Done, Add("push", "3", ":1.7")) << reason;
        std::error_code missing;
        const std::uintmax_t log = fs::file_size(store.Path() + "-wal", missing);
        EXPECT_TRUE(missing || log == 0) << log; // SQLite lets a reader make an empty one before the merged file is marked
        EXPECT_EQ((std::vector<std::string>{"2", "3"}), Keys());
    }
}

TEST_F(BusyStore, WorksInAChildWithoutInheritedDescriptors)
{
    EXPECT_EQ(Outcome::Done, Add("push", "7", ":1.7"));
    auto finding = std::async(std::launch::async,
        [&]
        {
            while (!board->isOver)
                Find("push", "7");
        });
    for (int i = 0; i < 30; ++i)
    {
        Beside child(
            [&]
            {
                for (const fs::directory_entry& open : fs::directory_iterator("/proc/self/fd"))
                {
                    std::error_code closed;
                    EXPECT_THAT(fs::read_symlink(open, closed).string(), Not(HasSubstr(directory.string())));
                }
                std::list<_SubscriberInfo> found;
                EXPECT_EQ(Outcome::Done, store.Find("push", "7", found, reason)) << reason;
                EXPECT_THAT(found, SizeIs(1));
            });
        child.AwaitEnd();
    }
    board->isOver = true;
}

} // namespace
