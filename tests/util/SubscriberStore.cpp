#include "StoreTest.h"

#include <glib.h>

#include <sys/stat.h>

namespace
{

TEST_F(SubscriberStore, ReturnsSubscribersInTheOrderOfTheirSubscriptions)
{
    for (const char* busname : {":1.7", "org.example.Z", "org.example.A"})
    {
        for (const auto& [kind, key] : {std::pair("status", "7"), {"status", "77"}, {"auth", "all"}, {"push", "7"}})
            EXPECT_EQ(Outcome::Done, Add(kind, key, busname)) << reason;
    }
    EXPECT_EQ(Outcome::Unchanged, Add("status", "7", "org.example.Z"));
    for (const Outcome outcome : {Outcome::Done, Outcome::Unchanged})
        EXPECT_EQ(outcome, store.Remove({"status", "77", {"org.example.Z", "/org/example/A", "org.example.A"}}, reason));
    EXPECT_EQ(Outcome::Done, Add("status", "77", "org.example.Z"));

    for (const auto& [kind, key] : {std::pair("status", "7"), {"auth", "all"}, {"push", "7"}})
        EXPECT_EQ(":1.7 org.example.Z org.example.A ", Find(kind, key));
    EXPECT_EQ(":1.7 org.example.A org.example.Z ", Find("status", "77"));
    for (const auto& [kind, key] : {std::pair("status", "8"), {"activated", "all"}, {"status", nullptr}})
        EXPECT_EQ("", Find(kind, key));
}

TEST_F(SubscriberStore, RefusesInvalidSubscriptions)
{
    const char* const fields[] = {"kind \"", "key \"", "bus name \"", "object path \"", "interface \""};
    const std::pair<int, std::string> faults[] = {{0, "activate"}, {1, ""}, {1, std::string(256, 'k')}, {1, "\xff"}, {1, "a\nb"},
        {1, "\u202e"}, {1, "\u2028"}, {1, "\u2029"}, {2, {"a.b\0c", 5}}, {3, "/a/"}, {3, {"/\0", 2}},
        {3, '/' + std::string(1024, 'p')}, {4, {"a.b\0", 4}}, {3, "/org/freedesktop/DBus/Locale/x"}, {4, ":1.7"},
        {4, "org.freedesktop.DBus.Local"}};
    for (const auto& [field, value] : faults)
    {
        std::string values[] = {"push", "7", "a.b", "/", "a.b"};
        values[field] = value;
        EXPECT_EQ(Outcome::Refused, store.Add({values[0], values[1], {values[2], values[3], values[4]}}, reason)) << value;
        EXPECT_EQ(0U, reason.find(fields[field])) << reason;
    }
    EXPECT_EQ("", Find("push", "7"));
    EXPECT_TRUE(fs::is_empty(directory));
}

TEST_F(SubscriberStore, IsReadableByItsUserOnly)
{
    const mode_t usual = umask(0);
    EXPECT_EQ(Outcome::Done, store.Add({"push", std::string(255, 'k'), {":1.7", '/' + std::string(1023, 'p'), "a.b"}}, reason));
    umask(usual);
    for (const char* made : {"new", "new/directory"})
        EXPECT_EQ(fs::perms::owner_all, fs::status(directory / made).permissions());
    EXPECT_EQ(fs::perms::owner_read | fs::perms::owner_write, fs::status(store.Path()).permissions());
}

TEST_F(SubscriberStore, AcceptsOnlyServiceIdsThatTheAgentLooksUp)
{
    for (const char* const kind : {"policy", "status"})
    {
        for (const char* const key : {"0", "7", "-1", "123456789", "-12345678"})
            EXPECT_EQ(Outcome::Done, Add(kind, key, ":1.7")) << reason;
        for (const char* const key : {"all", "-", "-0", "07", "-07", "+7", "7 ", "0x7", "1234567890", "-123456789"})
            EXPECT_EQ(Outcome::Refused, Add(kind, key, ":1.7")) << key;
    }
}

TEST_F(SubscriberStore, IsWhereTheEnvironmentSaysOrInTheStateDirectory)
{
    for (const auto& [name, path] : {std::pair<fs::path, fs::path>("/a/b", "/a/b"), {"a/b", fs::current_path() / "a/b"},
             {"", fs::path(g_get_user_state_dir()) / "kiv/subscribers.db"}})
    {
        setenv("KIV_SUBSCRIBERS", name.c_str(), 1);
        EXPECT_EQ(path, store.Path());
    }
}

TEST_F(SubscriberStore, ExplainsWhatToDoAboutAnUnusableFile)
{
    ASSERT_EQ(Outcome::Done, Add("push", "7", ":1.7"));
    const std::string good = Contents(store.Path());
    const std::tuple<const char*, std::string, const char*> rows[] = {
        {"new/directory/subscribers.db", "spoilt while it is open",
            "file is not a database; the file is damaged: move it away and subscribe again"},
        {"later", std::string(good).replace(63, 1, 1, '\2'), "schema version 2 instead of 1; set KIV_SUBSCRIBERS to another file"},
        {"foreign", std::string(good).replace(63, 1, 1, '\0'),
            "schema version 0 instead of 1; set KIV_SUBSCRIBERS to another file"},
        {"new/directory", "", "not a regular file; set KIV_SUBSCRIBERS to another file"},
        {"later/subscribers.db", "", "Not a directory; set KIV_SUBSCRIBERS to another file"},
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

TEST_F(SubscriberStore, ChecksWhetherItCanBeChangedWithoutAChange)
{
    fs::create_symlink("nowhere", directory / "dangling");
    const std::tuple<const char*, Outcome, const char*> rows[] = {
        {"new/directory/subscribers.db", Outcome::Done, ""},
        {"dangling", Outcome::Failed, "dangling: the file cannot be changed: No such file or directory; set KIV_SUBSCRIBERS to"},
        {"dangling/x", Outcome::Done, ""},
        {"/proc/x/y", Outcome::Failed, "/proc: no file can be made there: No such file or directory; set KIV_SUBSCRIBERS to"},
    };
    for (const auto& [name, outcome, trouble] : rows)
    {
        Use(name);
        reason.clear();
        EXPECT_EQ(outcome, store.Check(reason)) << name;
        EXPECT_NE(reason.npos, reason.find(trouble)) << reason;
    }
    EXPECT_EQ(1, std::distance(fs::directory_iterator(directory), {}));
    Use("made");
    ASSERT_EQ(Outcome::Done, Add("push", "7", ":1.7")) << reason;
    const std::string content = Contents(store.Path());
    EXPECT_EQ(Outcome::Done, store.Check(reason)) << reason;
    EXPECT_EQ(content, Contents(store.Path()));
    EXPECT_EQ(2, std::distance(fs::directory_iterator(directory), {}));
}

} // namespace
