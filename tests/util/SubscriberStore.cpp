#include "support/Test.h"

#include <DADatabaseManager.h>
#include <DASubscribeDataManager.h>
#include <DASubscriberStore.h>
#include <SimulatedLog.h>

#include <sys/wait.h>
#include <unistd.h>

#include <chrono>
#include <csignal>

namespace
{

namespace fs = std::filesystem;
using Outcome = DASubscriberStore::Outcome;

std::string Read(const fs::path& path)
{
    return (std::ostringstream() << std::ifstream(path, std::ios::binary).rdbuf()).str();
}

/// Starts another process, which runs one body and ends with 0 when nothing failed.
pid_t Fork(const std::function<void()>& body)
{
    if (const pid_t process = fork(); process != 0)
        return process;
    body();
    _exit(testing::Test::HasFailure() ? 1 : 0);
}

class SubscriberStore : public testing::Test
{
protected:
    SubscriberStore() { Use("new/directory/subscribers.db"); }
    ~SubscriberStore() override { fs::remove_all(directory_); }

    void Use(const std::string& name) { setenv("KIV_SUBSCRIBERS", (directory_ / name).c_str(), 1); }

    Outcome Add(const char* kind, const std::string& key, const std::string& busname)
    {
        return store_.Add({kind, key, {busname, "/org/example/A", "org.example.A"}}, reason_);
    }

    /// The bus names that the manager of that kind appends, a space behind each, or the log line that says why it can not.
    std::string Find(const std::string& kind, const char* key)
    {
        kiv::sim::StartLog();
        std::list<_SubscriberInfo> found(1);
        const bool isDone = kind == "push" ? DADatabaseManager().GetSubscriber("push", key, found)
                                           : DASubscribeDataManager().GetSubscriber(kind.c_str(), key, found);
        found.pop_front();
        std::ostringstream text(isDone ? "" : "failed: ", std::ios::ate);
        for (const _SubscriberInfo& subscriber : found)
            text << subscriber.busname << " ";
        for (const auto& line : kiv::sim::TakeLog())
            text << line.id << " " << line.priority << " " << line.tag << " " << line.text;
        return text.str();
    }

    const fs::path directory_ = mkdtemp((fs::temp_directory_path() / "kiv-store-XXXXXX").string().data());
    DASubscriberStore store_;
    std::string reason_;
};

TEST_F(SubscriberStore, GivesTheSubscribersOfOneEventInTheOrderInWhichTheySubscribed)
{
    for (const char* busname : {":1.7", "org.example.Z", "org.example.A"})
    {
        for (const auto& [kind, key] : {std::pair("status", "7"), {"status", "77"}, {"status", "all"}, {"push", "7"}})
            EXPECT_EQ(Outcome::Done, Add(kind, key, busname)) << reason_;
    }
    EXPECT_EQ(Outcome::Unchanged, Add("status", "7", "org.example.Z"));
    for (const Outcome outcome : {Outcome::Done, Outcome::Unchanged})
        EXPECT_EQ(outcome, store_.Remove({"status", "77", {"org.example.Z", "/org/example/A", "org.example.A"}}, reason_));
    EXPECT_EQ(Outcome::Done, Add("status", "77", "org.example.Z"));

    for (const auto& [kind, key] : {std::pair("status", "7"), {"status", "all"}, {"push", "7"}})
        EXPECT_EQ(":1.7 org.example.Z org.example.A ", Find(kind, key));
    EXPECT_EQ(":1.7 org.example.A org.example.Z ", Find("status", "77"));
    for (const auto& [kind, key] : {std::pair("status", "8"), {"status", ""}, {"auth", "all"}, {"status", nullptr}})
        EXPECT_EQ("", Find(kind, key));
}

TEST_F(SubscriberStore, RefusesWhatNoSubscriptionCanBeAndIsMadeByTheFirstThatCan)
{
    const char* const fields[] = {"kind \"", "key \"", "bus name \"", "object path \"", "interface \""};
    const std::pair<int, std::string> faults[] = {{0, "activate"}, {1, ""}, {1, std::string(256, 'k')}, {1, "\xff"}, {1, "a\nb"},
        {2, "x"}, {2, {"a.b\0c", 5}}, {3, "/a/"}, {3, "/org/freedesktop/DBus/Local"}, {3, "/org/freedesktop/DBus/Locale/x"},
        {4, ":1.7"}, {4, "org.freedesktop.DBus.Locale"}, {4, "org.freedesktop.DBus.Local"}};
    for (const auto& [field, value] : faults)
    {
        std::string values[] = {"push", "7", "a.b", "/", "a.b"};
        values[field] = value;
        EXPECT_EQ(Outcome::Refused, store_.Add({values[0], values[1], {values[2], values[3], values[4]}}, reason_)) << value;
        EXPECT_EQ(0U, reason_.find(fields[field])) << reason_;
    }
    EXPECT_EQ(
        "interface \"org.freedesktop.DBus.Local\": the bus reserves what begins like this and disconnects who calls it", reason_);
    EXPECT_EQ("", Find("push", "7"));
    EXPECT_TRUE(fs::is_empty(directory_));
    EXPECT_EQ(Outcome::Done, Add("push", std::string(255, 'k'), ":1.7")) << reason_;
    EXPECT_EQ(fs::perms::owner_all, fs::status(directory_ / "new/directory").permissions());
}

TEST_F(SubscriberStore, LosesNothingWhenManyProcessesMakeAndFillItWhileOneReads)
{
    const auto fill = [&](const std::string& writer)
    {
        for (int i = 0; i < 64; ++i)
        {
            Use(std::to_string(i / 2));
            EXPECT_EQ(Outcome::Done, Add("push", "7", writer + std::to_string(i % 2))) << reason_;
        }
    };
    for (const char* writer : {":a.", ":b.", ":c.", ":d."})
        Fork([&] { fill(writer); });

    const auto end = std::chrono::steady_clock::now() + std::chrono::minutes(1);
    for (int store = 0; store < 32; ++store)
    {
        Use(std::to_string(store));
        for (std::string found; found.size() != 8 * std::string(":a.0 ").size();)
        {
            const std::string before = std::exchange(found, Find("push", "7"));
            ASSERT_EQ(before, found.substr(0, before.size()));
            ASSERT_LT(std::chrono::steady_clock::now(), end) << found;
        }
    }
    for (int status = 0; wait(&status) > 0;)
        EXPECT_EQ(0, status);
}

TEST_F(SubscriberStore, LeavesAFileThatItCanNotUseAsItIsAndSaysSoInOneErrorLine)
{
    ASSERT_EQ(Outcome::Done, Add("push", "7", ":1.7"));
    const std::string good = Read(store_.Path());
    const std::tuple<const char*, std::string, const char*> rows[] = {
        {"new/directory/subscribers.db", "spoilt while it is open", "file is not a database"},
        {"short", "xy", "file is not a database"},
        {"half", good.substr(0, good.size() / 2), "database disk image is malformed"},
        {"overwritten", good.substr(0, 4096) + std::string(good.size() - 4096, 'x'), "database disk image is malformed"},
        {"later", std::string(good).replace(63, 1, 1, '\2'), "schema version 2 instead of 1; the file is left as it is"},
        {"foreign", std::string(good).replace(63, 1, 1, '\0'), "schema version 0 instead of 1; the file is left as it is"},
        {"new/directory", "", "not a regular file"},
        {"short/subscribers.db", "", "Not a directory"},
    };
    for (const auto& [name, content, trouble] : rows)
    {
        Use(name);
        std::ofstream(store_.Path(), std::ios::binary) << content;
        EXPECT_EQ("failed: 2 6 KIV_UTIL no subscribers of push \"7\": " + store_.Path() + ": " + trouble + "\n", Find("push", "7"));
        EXPECT_EQ(Outcome::Failed, Add("push", "7", ":1.8")) << name;
        EXPECT_EQ(content, Read(store_.Path()));
    }
}

TEST_F(SubscriberStore, IsTheFileAtItsPathAlsoForProcessesThatHadTheFormerOneOpen)
{
    for (char letter = 'a'; letter <= 'z'; ++letter)
        ASSERT_EQ(Outcome::Done, Add("push", std::string(250, letter), ":8.8"));
    Use("smaller.db");
    const auto hold = [&]
    {
        EXPECT_EQ(Outcome::Done, Add("push", "7", ":1.7")) << reason_;
        raise(SIGSTOP);
        EXPECT_EQ(":1.8 ", Find("push", "7"));
    };
    const pid_t holder = Fork(hold);
    int status = 0;
    ASSERT_TRUE(waitpid(holder, &status, WUNTRACED) == holder && WIFSTOPPED(status));

    fs::rename(directory_ / "new/directory/subscribers.db", store_.Path());
    EXPECT_EQ(":8.8 ", Find("push", std::string(250, 'z').c_str()));
    fs::remove(store_.Path());
    EXPECT_EQ(Outcome::Done, Add("push", "7", ":1.8")) << reason_;
    kill(holder, SIGCONT);
    EXPECT_TRUE(waitpid(holder, &status, 0) == holder && status == 0);
}

} // namespace
