#include "support/Texts.h"

#include <DASubscribeDataManager.h>
#include <DASubscriberStore.h>
#include <LogControl.h>

#include <sys/wait.h>
#include <unistd.h>

#include <csignal>

namespace
{

namespace fs = std::filesystem;
using kiv::test::Contents;
using Outcome = DASubscriberStore::Outcome;

struct SubscriberStore : testing::Test
{
    SubscriberStore() { Use("new/directory/subscribers.db"); }
    ~SubscriberStore() override { fs::remove_all(directory); }

    void Use(const std::string& name) { setenv("KIV_SUBSCRIBERS", (directory / name).c_str(), 1); }

    Outcome Add(const char* kind, const std::string& key, const std::string& busname)
    {
        return store.Add({kind, key, {busname, "/org/example/A", "org.example.A"}}, reason);
    }

    /// The bus names that are appended, a blank behind each, and what is logged meanwhile.
    std::string Find(const char* kind, const char* key)
    {
        kiv::platform::StartLog();
        std::list<_SubscriberInfo> found(1);
        std::string text = DASubscribeDataManager().GetSubscriber(kind, key, found) ? "" : "failed: ";
        found.pop_front();
        for (const _SubscriberInfo& subscriber : found)
            text += subscriber.busname + ' ';
        for (const auto& line : kiv::platform::TakeLog())
            text += std::to_string(line.priority) + ' ' + line.tag + ' ' + line.text;
        return text;
    }

    const fs::path directory = mkdtemp((fs::temp_directory_path() / "kiv-store-XXXXXX").string().data());
    DASubscriberStore store;
    std::string reason;
};

TEST_F(SubscriberStore, GivesTheSubscribersOfOneEventInTheOrderInWhichTheySubscribed)
{
    for (const char* busname : {":1.7", "org.example.Z", "org.example.A"})
    {
        for (const auto& [kind, key] : {std::pair("status", "7"), {"status", "77"}, {"status", "all"}, {"push", "7"}})
            EXPECT_EQ(Outcome::Done, Add(kind, key, busname)) << reason;
    }
    EXPECT_EQ(Outcome::Unchanged, Add("status", "7", "org.example.Z"));
    for (const Outcome outcome : {Outcome::Done, Outcome::Unchanged})
        EXPECT_EQ(outcome, store.Remove({"status", "77", {"org.example.Z", "/org/example/A", "org.example.A"}}, reason));
    EXPECT_EQ(Outcome::Done, Add("status", "77", "org.example.Z"));

    for (const auto& [kind, key] : {std::pair("status", "7"), {"status", "all"}, {"push", "7"}})
        EXPECT_EQ(":1.7 org.example.Z org.example.A ", Find(kind, key));
    EXPECT_EQ(":1.7 org.example.A org.example.Z ", Find("status", "77"));
    for (const auto& [kind, key] : {std::pair("status", "8"), {"auth", "all"}, {"status", nullptr}})
        EXPECT_EQ("", Find(kind, key));
}

TEST_F(SubscriberStore, RefusesWhatNoSubscriptionCanBeAndIsMadeByTheFirstThatCan)
{
    const char* const fields[] = {"kind \"", "key \"", "bus name \"", "object path \"", "interface \""};
    const std::pair<int, std::string> faults[] = {{0, "activate"}, {1, ""}, {1, std::string(256, 'k')}, {1, "\xff"}, {1, "a\nb"},
        {2, {"a.b\0c", 5}}, {3, "/a/"}, {3, "/org/freedesktop/DBus/Locale/x"}, {4, ":1.7"}, {4, "org.freedesktop.DBus.Local"}};
    for (const auto& [field, value] : faults)
    {
        std::string values[] = {"push", "7", "a.b", "/", "a.b"};
        values[field] = value;
        EXPECT_EQ(Outcome::Refused, store.Add({values[0], values[1], {values[2], values[3], values[4]}}, reason)) << value;
        EXPECT_EQ(0U, reason.find(fields[field])) << reason;
    }
    EXPECT_EQ("", Find("push", "7"));
    EXPECT_TRUE(fs::is_empty(directory));
    EXPECT_EQ(Outcome::Done, Add("push", std::string(255, 'k'), ":1.7")) << reason;
    EXPECT_EQ(fs::perms::owner_all, fs::status(directory / "new/directory").permissions());
}

TEST_F(SubscriberStore, LosesNothingWhenManyProcessesMakeFillAndReadIt)
{
    for (const std::string writer : {":a.", ":b.", ":c.", ":d."})
    {
        if (fork() != 0)
            continue;
        for (int i = 0; i < 64; ++i)
        {
            Use(std::to_string(i / 2));
            EXPECT_THAT(Find("push", "7"), testing::Not(testing::HasSubstr("failed")));
            EXPECT_EQ(Outcome::Done, Add("push", "7", writer + std::to_string(i % 2))) << reason;
        }
        _exit(HasFailure() ? 1 : 0);
    }
    for (int status = 0; wait(&status) > 0;)
        EXPECT_EQ(0, status);
    for (int i = 0; i < 32; ++i)
    {
        Use(std::to_string(i));
        EXPECT_THAT(Find("push", "7"), testing::SizeIs(8 * std::string(":a.0 ").size()));
    }
}

TEST_F(SubscriberStore, LeavesAFileThatItCanNotUseAsItIsAndSaysSoInOneErrorLine)
{
    ASSERT_EQ(Outcome::Done, Add("push", "7", ":1.7"));
    const std::string good = Contents(store.Path());
    const std::tuple<const char*, std::string, const char*> rows[] = {
        {"new/directory/subscribers.db", "spoilt while it is open", "file is not a database"},
        {"later", std::string(good).replace(63, 1, 1, '\2'), "schema version 2 instead of 1; the file is left as it is"},
        {"foreign", std::string(good).replace(63, 1, 1, '\0'), "schema version 0 instead of 1; the file is left as it is"},
        {"new/directory", "", "not a regular file"},
        {"later/subscribers.db", "", "Not a directory"},
    };
    for (const auto& [name, content, trouble] : rows)
    {
        Use(name);
        std::ofstream(store.Path(), std::ios::binary) << content;
        EXPECT_EQ("failed: 6 KIV_UTIL no subscribers of push \"7\": " + store.Path() + ": " + trouble + "\n", Find("push", "7"));
        EXPECT_EQ(Outcome::Failed, Add("push", "7", ":1.8")) << name;
        EXPECT_EQ(content, Contents(store.Path()));
    }
}

TEST_F(SubscriberStore, IsTheFileAtItsPathAlsoWhileAProcessHasTheFormerOneOpen)
{
    for (char letter = 'a'; letter <= 'z'; ++letter)
        ASSERT_EQ(Outcome::Done, Add("push", std::string(250, letter), ":8.8"));
    Use("smaller.db");
    const pid_t holder = fork();
    if (holder == 0)
    {
        raise(Add("push", "7", ":1.7") == Outcome::Done ? SIGSTOP : SIGKILL);
        _exit(0);
    }
    int status = 0;
    ASSERT_TRUE(waitpid(holder, &status, WUNTRACED) == holder && WIFSTOPPED(status));

    fs::rename(directory / "new/directory/subscribers.db", store.Path());
    EXPECT_EQ(":8.8 ", Find("push", std::string(250, 'z').c_str()));
    kill(holder, SIGKILL);
    EXPECT_EQ(holder, waitpid(holder, nullptr, 0));
}

} // namespace
