#include "support/PrivateBus.h"

#include <gmock/gmock.h>

#include <csignal>
#include <filesystem>
#include <fstream>
#include <sstream>

using testing::AllOf;
using testing::HasSubstr;
using testing::Not;

namespace kiv::test
{
namespace
{

std::string Contents(const std::string& file)
{
    return (std::ostringstream() << std::ifstream(file).rdbuf()).str();
}

std::string MakeDirectory()
{
    g_autofree char* path = g_dir_make_tmp(nullptr, nullptr);
    return path;
}

/// A program that runs beside the test and is killed with its owner.
class Program
{
public:
    /// @param files    beginning of the names of the files that take what it prints
    /// @param command  as a shell takes it
    Program(std::string files, const std::string& command) : files_(std::move(files))
    {
        g_autoptr(GSubprocessLauncher) launcher = g_subprocess_launcher_new(G_SUBPROCESS_FLAGS_NONE);
        g_subprocess_launcher_set_stdout_file_path(launcher, (files_ + "out").c_str());
        g_subprocess_launcher_set_stderr_file_path(launcher, (files_ + "err").c_str());
        g_auto(GStrv) arguments = nullptr;
        g_shell_parse_argv(command.c_str(), nullptr, &arguments, nullptr);
        process_.reset(g_subprocess_launcher_spawnv(launcher, arguments, nullptr));
    }
    ~Program() { g_subprocess_force_exit(process_.get()); }

    std::string Out() const { return Contents(files_ + "out"); }
    std::string Err() const { return Contents(files_ + "err"); }

    /// Waits until it printed that; fails after ten seconds.
    void Await(const std::string& text) const
    {
        const gint64 deadline = g_get_monotonic_time() + gint64{10} * G_USEC_PER_SEC;
        while (Out().find(text) == std::string::npos && g_get_monotonic_time() < deadline)
            g_usleep(5000);
        EXPECT_THAT(Out(), HasSubstr(text)) << Err();
    }

    /// Waits for its end. @return the exit code; -1 when a signal ended it
    int End()
    {
        g_subprocess_wait(process_.get(), nullptr, nullptr);
        return g_subprocess_get_if_exited(process_.get()) ? g_subprocess_get_exit_status(process_.get()) : -1;
    }

    int End(int signal)
    {
        g_subprocess_send_signal(process_.get(), signal);
        return End();
    }

private:
    std::string files_;
    std::unique_ptr<GSubprocess, Unref> process_;
};

/// How a program ended.
struct Outcome
{
    int exit;
    std::string out, err;
};

/// A bus, a subscriber store and a directory of its own for each test.
class KivctlTest : public testing::Test
{
protected:
    KivctlTest() { g_setenv("KIV_SUBSCRIBERS", (directory + "/subscribers.db").c_str(), TRUE); }
    ~KivctlTest() override { std::filesystem::remove_all(directory); }

    /// Runs a program to its end.
    Outcome Finish(const std::string& command)
    {
        Program program(NextFiles(), command);
        const int exit = program.End();
        return {exit, program.Out(), program.Err()};
    }

    Outcome Kivctl(const std::string& arguments) { return Finish(KIVCTL " " + arguments); }

    /// Starts a program that says when it is ready.
    std::unique_ptr<Program> Start(const std::string& command)
    {
        auto program = std::make_unique<Program>(NextFiles(), command);
        program->Await("ready");
        return program;
    }

    const std::string directory = MakeDirectory();
    PrivateBus bus;

private:
    std::string NextFiles() { return directory + '/' + std::to_string(++programs_) + '.'; }

    int programs_ = 0;
};

TEST_F(KivctlTest, AnswersAndRefusesWithTheDocumentedExitCode)
{
    struct
    {
        const char* arguments;
        int exit;
        const char* out;
        const char* err;
    } const cases[] = {
        {"--help", 0, "Exit codes:", ""},
        {"", 2, "", "subcommand is required"},
        {"nosuchverb", 2, "", "\"nosuchverb\" is no verb"},
        {"country 450", 0, "name          Korea, South\n", ""},
        {"country +590", 0, "alpha2 of calling code  mq\n", ""},
        {"country 352", 0, "Grenada", "--by calling"},
        {"country 352 --by calling", 0, "Luxembourg", ""},
        {"country 406 --json", 0, "\"name\": \"none recorded for this MCC\"", ""},
        {"country KR", 1, "", "lower-case"},
        {"country 450-1", 2, "", "three digits"},
        {"device id", 1, "", "ServiceUnknown"},
        {"device --profile no-telephony", 0, "no modem answered", ""},
        {"device set runtime.flight-mode=true", 2, "", "--profile"},
        {"sim --profile dual-first-locked --json", 0, "\"imsi\": \"PIN required\"", ""},
        {"sim --profile no-telephony", 1, "", "no modem"},
        {"sim --slot -1", 2, "", "a number from 0 up"},
        {"sim --slot 2", 1, "", "slots count from 0"},
        {"sim --profile nosuch", 10, "", "nosuch"},
        {"sim wait", 0, "usable slot     0\n", ""},
        {"sim wait --profile none", 1, "", "slot 0: no card"},
        {"sim wait --profile pin-required --timeout 0", 3, "", "slot 0: PIN required"},
        {"notify on", 2, "", "--service"},
        {"notify policy --service 7 --texts a b c", 2, "", "--texts"},
        {"notify on --service 7", 1, "subscribers=0", "nobody has subscribed"},
        {"notify on --service 7 --to manager", 1, "", "no call result"},
        {"notify number-changed --texts a b c d --to manager", 4, "", "noti type error [8]"},
        {"notify auth-success --profile none", 1, "", "--imsi"},
        {"push mail --data d --message m", 1, "subscribers=0", "nobody has subscribed"},
        {"subscribe --kind status", 2, "", "--key"},
        {"subscribers add status 7 7up /a a.b", 4, "", "7up"},
        {"subscribers remove status 7 a.b /a a.b", 1, "", "no such subscription"},
        {"subscribers list --json", 0, "[]", "nobody"},
    };
    for (const auto& row : cases)
    {
        const Outcome outcome = Kivctl(row.arguments);
        EXPECT_EQ(row.exit, outcome.exit) << row.arguments << "\n" << outcome.err;
        EXPECT_THAT(outcome.out, HasSubstr(row.out)) << row.arguments;
        EXPECT_THAT(outcome.err, HasSubstr(row.err)) << row.arguments;
        EXPECT_TRUE(outcome.exit == 0 || !outcome.err.empty()) << row.arguments << " fails without a word";
    }
}

TEST_F(KivctlTest, ShowsIdentifiersWholeOnlyWhenAsked)
{
    EXPECT_THAT(Kivctl("sim").out, AllOf(HasSubstr(" 45005**********  ***********78 "), Not(HasSubstr("450050123456789"))));
    EXPECT_THAT(Kivctl("sim --show-ids --json").out, AllOf(HasSubstr("\"450050123456789\""), HasSubstr("\"+821012345678\"")));
    EXPECT_THAT(Kivctl("device").out, HasSubstr("imei                ***********3809\n"));
    EXPECT_THAT(Kivctl("device --show-ids").out, HasSubstr("imei                356938035643809\n"));
}

TEST_F(KivctlTest, CarriesEveryNotificationToSubscribersAndToTheServiceManager)
{
    const auto services = Start(KIVCTL " services --serial S1");
    const auto all = Start(KIVCTL
        " subscribe --name a.all --key 7 --kind policy --kind status --kind auth --kind activated --kind number_changed --json");
    const auto other = Start(KIVCTL " subscribe --kind status --key 8");
    EXPECT_EQ("device id  S1\n", Kivctl("device id").out);

    struct
    {
        const char* arguments;
        const char* manager; ///< null where the service manager takes none
        const char* subscriber;
    } const cases[] = {
        {"auth-success", "auth imsi='1' success=1\n", R"({"event":"auth","imsi":"1","success":1})"},
        {"auth-fail", "auth imsi='1' success=0\n", R"({"event":"auth","imsi":"1","success":0})"},
        {"on --service 7", "status imsi='1' service_id=7 status='on'\n",
            R"({"event":"status","imsi":"1","service_id":7,"status":"on"})"},
        {"off --service 7", "status imsi='1' service_id=7 status='off'\n",
            R"({"event":"status","imsi":"1","service_id":7,"status":"off"})"},
        {"policy --service 7 --texts w x y z",
            "policy imsi='1' service_id=7 service_status='w' policy_feature='x' policy_version='y' policy_doc_url='z'\n",
            R"("service_id":7,"service_status":"w","policy_feature":"x","policy_version":"y","policy_doc_url":"z"})"},
        {"activated", "activate imsi='1' active=1\n", R"({"event":"activate","imsi":"1","active":1})"},
        {"deactivated", "activate imsi='1' active=0\n", R"({"event":"activate","imsi":"1","active":0})"},
        {"number-changed --texts w x y z", nullptr,
            R"({"event":"number_change","imsi":"1","text1":"w","text2":"x","text3":"y","text4":"z"})"},
    };
    for (const auto& row : cases)
    {
        const std::string notify = std::string("notify --imsi 1 ") + row.arguments;
        EXPECT_EQ("sent subscribers=1 delivered=1\n", Kivctl(notify).out) << row.arguments;
        all->Await(std::string(row.subscriber) + '\n');
        if (row.manager)
        {
            EXPECT_EQ(0, Kivctl(notify + " --to manager").exit) << row.arguments;
            services->Await(row.manager);
        }
    }

    EXPECT_EQ("sent subscribers=2 delivered=2\n", Kivctl("notify --imsi 1 on off --service 8 --service 7").out);
    other->Await("status imsi='1' service_id=8 status='on'\n");
}

TEST_F(KivctlTest, TellsWhichDeliveriesFailed)
{
    const auto client = Start(KIVCTL " subscribe --kind status --key 7 --push mail");
    for (const char* what : {"status 7", "push mail"})
        ASSERT_EQ(0, Kivctl(std::string("subscribers add ") + what + " org.gone.Away /a a.b").exit);

    const Outcome notified = Kivctl("notify --imsi 1 on --service 7");
    EXPECT_EQ(1, notified.exit);
    EXPECT_EQ("sent subscribers=2 delivered=1\n", notified.out);
    EXPECT_THAT(notified.err, HasSubstr("not delivered to org.gone.Away: no call result: "));

    const Outcome pushed = Kivctl("push mail --data '{\"a\":1}' --message 'two words' --time -5000000000 --json");
    EXPECT_EQ(1, pushed.exit);
    EXPECT_EQ("{\"event\":\"sent\",\"subscribers\":2,\"delivered\":1}\n", pushed.out);
    EXPECT_THAT(pushed.err, HasSubstr("ServiceUnknown"));
    client->Await("push service_id='mail' data='{\"a\":1}' message='two words' time=-5000000000\n");
}

TEST_F(KivctlTest, AClientServiceTakesItsSubscriptionsBackWhenItEnds)
{
    for (const int signal : {SIGINT, SIGTERM, SIGHUP})
    {
        const auto client = Start(KIVCTL " subscribe --kind auth --kind status --key 7");
        EXPECT_THAT(Kivctl("subscribers list").out, AllOf(HasSubstr("auth"), HasSubstr("status")));
        EXPECT_EQ(0, client->End(signal));
        EXPECT_EQ("", Kivctl("subscribers list").out);
    }
}

TEST_F(KivctlTest, AWatcherHearsOfChangesOfTheDeviceFile)
{
    const std::string profile = " --profile " + directory + "/phone";
    ASSERT_EQ(0, Kivctl("device set runtime.flight-mode=false" + profile).exit);
    const auto watcher = Start(KIVCTL " watch --json" + profile);
    EXPECT_EQ(0, Kivctl("network" + profile).exit);

    ASSERT_EQ(0, Kivctl("device set runtime.flight-mode=true network.cellular=1" + profile).exit);
    watcher->Await("{\"event\":\"flight_mode\",\"value\":true}\n");
    EXPECT_EQ(1, Kivctl("network" + profile).exit);
    EXPECT_EQ(10, Kivctl("device set network.cellular=99" + profile).exit);
    EXPECT_EQ(0, watcher->End(SIGINT));
}

TEST_F(KivctlTest, ServicesTakeTheirNamesOrSayWhyNot)
{
    for (const char* program : {KIV_BOARD_DAEMON, KIV_SERVICE_MANAGER})
    {
        const auto service = Start(program);
        const Outcome second = Finish(program);
        EXPECT_EQ(1, second.exit);
        EXPECT_THAT(second.err, HasSubstr("is taken"));
        EXPECT_EQ(0, service->End(SIGTERM));
    }
    const auto service = Start(KIV_BOARD_DAEMON " --serial S2");
    EXPECT_EQ("device id  S2\n", Kivctl("device id").out);
    bus.Stop();
    EXPECT_EQ(1, service->End());
    EXPECT_THAT(Finish(KIV_SERVICE_MANAGER).err, HasSubstr("DBUS_SYSTEM_BUS_ADDRESS"));
}

TEST_F(KivctlTest, TellsAMissingBusFromABrokenStore)
{
    std::ofstream(directory + "/subscribers.db") << std::string(4096, 'x');
    for (const char* arguments :
        {"subscribers list", "notify --imsi 1 auth-fail", "push mail --data d --message m", "subscribe --push a"})
        EXPECT_EQ(6, Kivctl(arguments).exit) << arguments;
    bus.Stop();
    for (const char* arguments : {"device id", "notify --imsi 1 auth-fail", "notify --imsi 1 auth-fail --to manager",
             "push mail --data d --message m", "subscribe --push a", "services"})
        EXPECT_EQ(8, Kivctl(arguments).exit) << arguments;
}

} // namespace
} // namespace kiv::test
