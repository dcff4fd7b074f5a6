#include "services/Client.h"
#include "support/BusMonitor.h"

#include <SubscriptionService.h>

#include <sqlite3.h>
#include <unistd.h>

namespace kiv::test
{
namespace
{

using testing::HasSubstr;
using testing::IsEmpty;

/// The service in a separate thread, run like its program.
class Running
{
public:
    Running(double idleSeconds, std::set<guint32> administrators)
        : context_(g_main_context_new()), thread_([=] { Serve(idleSeconds, administrators); })
    {
        ready_.get_future().wait();
    }
    ~Running()
    {
        isStopped_ = true;
        g_main_context_wakeup(context_);
        thread_.join();
        g_main_context_unref(context_);
    }

    std::atomic<int> turns{0}; ///< of its loop
    std::atomic<bool> hasEnded{false};

private:
    void Serve(double idleSeconds, const std::set<guint32>& administrators)
    {
        g_main_context_push_thread_default(context_);
        {
            SubscriptionService service(idleSeconds, administrators);
            ready_.set_value();
            for (; !isStopped_ && service.GoOn(); ++turns)
                g_main_context_iteration(context_, TRUE);
            hasEnded = true;
        }
        g_main_context_pop_thread_default(context_);
    }

    GMainContext* context_;
    std::atomic<bool> isStopped_{false};
    std::promise<void> ready_;
    std::thread thread_;
};

/// Makes changes of the store wait.
class StoreLock
{
public:
    StoreLock()
    {
        sqlite3_open(DASubscriberStore::Path().c_str(), &db_);
        EXPECT_EQ(SQLITE_OK, sqlite3_exec(db_, "BEGIN IMMEDIATE", nullptr, nullptr, nullptr));
    }
    ~StoreLock() { sqlite3_close(db_); }

private:
    sqlite3* db_ = nullptr;
};

struct Subscriptions : testing::Test
{
    Subscriptions() { Start(); }

    void Start(double idleSeconds = 60, const std::set<guint32>& administrators = {})
    {
        service.reset();
        service = std::make_unique<Running>(idleSeconds, administrators);
    }

    static void AddToStore(const std::string& name, const std::string& key = "all")
    {
        std::string reason;
        EXPECT_EQ(DASubscriberStore::Outcome::Done, DASubscriberStore().Add({"auth", key, {name, kPath, kInterface}}, reason));
    }

    const StoreFolder folder;
    PrivateBus bus;
    std::unique_ptr<Running> service;
};

constexpr char kOther[] = "org.example.Other";

TEST_F(Subscriptions, AreMadeListedAndRemovedUnderTheNamesOfTheCaller)
{
    Client client(bus);
    client.Own(kMail);
    const std::string unique = client.UniqueName();
    for (const std::string& name : {std::string(), unique, std::string(kMail)})
    {
        const std::string recorded = name.empty() ? unique : name;
        EXPECT_EQ("(true,)", client.Change("Subscribe", name)) << client.reason;
        EXPECT_EQ("(false,)", client.Change("Subscribe", recorded));
        EXPECT_EQ("([('auth', 'all', '" + recorded + "', '/org/example/Client', 'org.example.Client')],)", client.Call("List"));
        EXPECT_EQ("(true,)", client.Change("Unsubscribe", name));
        EXPECT_EQ("(false,)", client.Change("Unsubscribe", recorded));
        EXPECT_EQ("([],)", client.Call("List"));
    }
}

TEST_F(Subscriptions, OfOthersCannotBeSeenOrChanged)
{
    Client client(bus), other(bus);
    client.Own(kMail);
    other.Own(kOther);
    for (Client* subscriber : {&other, &client})
        EXPECT_EQ("(true,)", subscriber->Change("Subscribe", ""));
    EXPECT_EQ("(true,)", other.Change("Subscribe", kOther));
    AddToStore("org.example.Nobody");
    const auto before = Stored();
    Client gone(bus);
    gone.Close();
    for (const char* method : {"Subscribe", "Unsubscribe"})
    {
        for (const std::string& name : {other.UniqueName(), gone.UniqueName(), std::string(kOther),
                 std::string("org.example.Nobody"), std::string("org.freedesktop.DBus"), std::string("org.kiv.Subscriptions"),
                 std::string(":0.0"), std::string("noname"), std::string("\n")})
        {
            EXPECT_EQ("AccessDenied", client.Change(method, name)) << method << name;
            EXPECT_THAT(client.reason, HasSubstr("\"" + name + "\" is not a name of the caller " + client.UniqueName()));
        }
    }
    EXPECT_EQ(before, Stored());
    EXPECT_EQ(
        "([('auth', 'all', '" + client.UniqueName() + "', '/org/example/Client', 'org.example.Client')],)", client.Call("List"));
}

TEST_F(Subscriptions, ThatAreInvalidAreRefusedWithTheReason)
{
    Client client(bus);
    const struct
    {
        const char *kind, *key, *path, *interface, *reason;
    } rows[] = {
        {"none", "all", kPath, kInterface, "kind \"none\""},
        {"auth", "", kPath, kInterface, "key \"\""},
        {"auth", "all", "/org/freedesktop/DBus/Local", kInterface, "object path \"/org/freedesktop/DBus/Local\""},
        {"auth", "all", kPath, "org.freedesktop.DBus.Local", "interface \"org.freedesktop.DBus.Local\""},
        {"auth", "all", kPath, "undotted", "interface \"undotted\""},
    };
    for (const auto& row : rows)
    {
        for (const char* method : {"Subscribe", "Unsubscribe"})
        {
            EXPECT_EQ("InvalidArgs", client.Change(method, "", row.kind, row.key, row.path, row.interface)) << row.reason;
            EXPECT_THAT(client.reason, HasSubstr(row.reason));
        }
    }
    EXPECT_THAT(Stored(), IsEmpty());
}

TEST_F(Subscriptions, DoNotChangeWhenTheNameGetsANewOwnerMeanwhile)
{
    for (const char* method : {"Subscribe", "Unsubscribe"})
    {
        Client client(bus), successor(bus);
        client.Own(kMail);
        const auto before = Stored();
        std::future<std::string> answer;
        {
            BusMonitor monitor(bus, successor.Bus());
            const StoreLock lock;
            answer = std::async(std::launch::async, [&] { return client.Change(method, kMail); });
            monitor.Until("GetNameOwner");
            successor.Own(kMail);
        }
        EXPECT_EQ("AccessDenied", answer.get());
        EXPECT_EQ(before, Stored()) << method;
        successor.Change("Subscribe", kMail); // for the second round
    }
}

TEST_F(Subscriptions, OfAllUsersAreListedAndRemovedByAnAdministrator)
{
    Start(60, {getuid()});
    Client administrator(bus), other(bus);
    other.Own(kOther);
    EXPECT_EQ("(true,)", other.Change("Subscribe", kOther));
    EXPECT_EQ("AccessDenied", administrator.Change("Subscribe", kOther));
    EXPECT_THAT(administrator.Call("List"), HasSubstr(kOther));
    EXPECT_EQ("(true,)", administrator.Change("Unsubscribe", kOther));
    EXPECT_THAT(Stored(), IsEmpty());
}

TEST_F(Subscriptions, UnderAUniqueNameEndWhenItLeavesTheBus)
{
    Client stays(bus);
    EXPECT_EQ("(true,)", stays.Change("Subscribe", ""));
    for (const bool isServed : {true, false})
    {
        Client leaves(bus);
        leaves.Own(kMail);
        EXPECT_EQ("(true,)", leaves.Change("Subscribe", ""));
        leaves.Change("Subscribe", kMail);
        if (!isServed)
            service.reset();
        leaves.Close();
        if (!isServed)
            Start();
        AwaitStored({stays.UniqueName(), kMail});
    }
}

TEST_F(Subscriptions, UnderAUniqueNameKeepTheIdleServiceRunning)
{
    Client leaves(bus);
    EXPECT_EQ("(true,)", leaves.Change("Subscribe", ""));
    Start(0.001);
    IterateUntil([&] { return service->turns > 50 || service->hasEnded; });
    EXPECT_FALSE(service->hasEnded);
    leaves.Close();
    IterateUntil([&] { return service->hasEnded.load(); });
    AwaitStored({});
}

TEST_F(Subscriptions, UnderAUniqueNameDoNotApplyOnTheNextBus)
{
    PrivateBus::Tolerate("");
    Client client(bus);
    client.Own(kMail);
    client.Change("Subscribe", "");
    client.Change("Subscribe", kMail);
    service.reset();
    bus.Stop();
    bus.Start();
    std::list<Client> others;
    while (others.empty() || others.back().UniqueName() != client.UniqueName())
        others.emplace_back(bus);
    Start();
    AwaitStored({kMail});
}

TEST_F(Subscriptions, AreLimitedToAThousandPerUser)
{
    {
        Client client(bus);
        client.Own(kMail);
        EXPECT_EQ("(true,)", client.Change("Subscribe", kMail));
        for (int key = 1; key < SubscriptionService::kMostRecords; ++key)
            AddToStore(kMail, std::to_string(key));
        client.Close();
    }
    Start();
    Client client(bus);
    EXPECT_EQ("LimitsExceeded", client.Change("Subscribe", ""));
    EXPECT_THAT(client.reason, HasSubstr("1000 subscriptions"));
    client.Own(kMail);
    EXPECT_EQ("LimitsExceeded", client.Change("Subscribe", kMail, "activated"));
    EXPECT_EQ("(false,)", client.Change("Subscribe", kMail)) << "it is there";
    EXPECT_EQ("(true,)", client.Change("Unsubscribe", kMail));
    EXPECT_EQ("(true,)", client.Change("Subscribe", ""));

    client.Change("Unsubscribe", "");
    client.Change("Subscribe", kMail);
    std::ofstream(DASubscriberStore::Path() + ".names") << "[users]\n" << kMail << '=' << getuid() + 1 << '\n';
    EXPECT_EQ("LimitsExceeded", client.Change("Subscribe", kMail, "activated")) << "the records of another come with the name";
}

TEST_F(Subscriptions, FailWithTheStoresReason)
{
    Client client(bus);
    EXPECT_EQ("([],)", client.Call("List")); // the service has read the store once
    std::ofstream(DASubscriberStore::Path()) << "this is no store";
    const std::string list = client.Call("List");
    for (const std::string& answer : {client.Change("Subscribe", ""), client.Change("Unsubscribe", ""), list})
        EXPECT_EQ("Failed", answer);
    EXPECT_THAT(client.reason, HasSubstr(DASubscriberStore::Path()));
    std::filesystem::remove(DASubscriberStore::Path());
    EXPECT_EQ("(true,)", client.Change("Subscribe", ""));
}

TEST_F(Subscriptions, AcceptOnlyArgumentsOfTheRightTypes)
{
    Client client(bus);
    for (const char* method : {"Subscribe", "Unsubscribe", "List"})
    {
        for (const char* body : {"(1,)", "('a',)", "(handle 0,)", "('auth', 'all', '', '/a', 'a.b')",
                 "('auth', 'all', '', objectpath '/a', 'a.b', 'more')", "(('auth', 'all', '', objectpath '/a', 'a.b'),)"})
        {
            g_autoptr(GVariant) arguments = g_variant_parse(nullptr, body, nullptr, nullptr, nullptr);
            EXPECT_EQ("InvalidArgs", client.Call(method, arguments)) << method << body;
        }
    }
    EXPECT_EQ("UnknownMethod", client.Call("Other"));
    EXPECT_THAT(Stored(), IsEmpty());
}

TEST_F(Subscriptions, OfACallerWithTooManyOpenCallsAreRefused)
{
    constexpr unsigned kMore = 20;
    Client client(bus), other(bus);
    other.Change("Subscribe", "");
    EXPECT_EQ("LimitsExceeded", client.Change("Subscribe", "", "push", std::string(CallLimit::kMostBytes, 'k').c_str()));
    struct
    {
        unsigned done = 0, refused = 0;
    } answers;
    using Answers = decltype(answers);
    const GAsyncReadyCallback count = [](GObject* connection, GAsyncResult* result, gpointer counts)
    {
        g_autoptr(GVariant) reply = g_dbus_connection_call_finish(G_DBUS_CONNECTION(connection), result, nullptr);
        auto& [done, refused] = *static_cast<Answers*>(counts);
        ++(reply != nullptr ? done : refused);
    };
    {
        const StoreLock lock;
        for (unsigned i = 0; i < CallLimit::kMostWaiting + kMore; ++i)
        {
            g_dbus_connection_call(client.Bus(), "org.kiv.Subscriptions", "/org/kiv/Subscriptions", "org.kiv.Subscriptions1",
                "Subscribe", g_variant_new("(sssos)", "push", std::to_string(i).c_str(), "", kPath, kInterface), nullptr,
                G_DBUS_CALL_FLAGS_NONE, -1, nullptr, count, &answers);
        }
        IterateUntil([&] { return answers.refused == kMore; });
        EXPECT_EQ(0U, answers.done);
    }
    IterateUntil([&] { return answers.done == CallLimit::kMostWaiting; });
    EXPECT_EQ(kMore, answers.refused);
    EXPECT_EQ("(true,)", client.Change("Subscribe", "")) << "its places are free again";
    EXPECT_EQ("(true,)", other.Change("Unsubscribe", ""));
}

} // namespace
} // namespace kiv::test
