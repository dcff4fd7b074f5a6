#include "support/PrivateBus.h"

#include <DASubscriberStore.h>

#include <csignal>

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

std::string Replaced(const std::string& text, const std::string& pattern, const char* by)
{
    g_autoptr(GRegex) regex = g_regex_new(pattern.c_str(), G_REGEX_MULTILINE, GRegexMatchFlags(0), nullptr);
    g_autofree char* replaced = g_regex_replace(regex, text.c_str(), -1, 0, by, GRegexMatchFlags(0), nullptr);
    return replaced;
}

/// What the pattern's group holds at every place where the pattern fits.
template <typename Texts = std::set<std::string>>
Texts All(const char* pattern, const std::string& text)
{
    Texts all;
    g_autoptr(GRegex) regex = g_regex_new(pattern, G_REGEX_MULTILINE, GRegexMatchFlags(0), nullptr);
    g_autoptr(GMatchInfo) match = nullptr;
    g_regex_match(regex, text.c_str(), GRegexMatchFlags(0), &match);
    for (; g_match_info_matches(match); g_match_info_next(match, nullptr))
    {
        g_autofree char* group = g_match_info_fetch(match, 1);
        all.insert(all.end(), group);
    }
    return all;
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
        const std::string directory = std::filesystem::path(files_).parent_path();
        const std::string line = "cd " + directory + " && exec " + command + " >" + files_ + "out 2>" + files_ + "err";
        process_.reset(g_subprocess_new(G_SUBPROCESS_FLAGS_NONE, nullptr, "sh", "-c", line.c_str(), nullptr));
    }
    ~Program() { g_subprocess_force_exit(process_.get()); }

    std::string Out() const { return Contents(files_ + "out"); }
    std::string Err() const { return Contents(files_ + "err"); }

    /// Waits until it printed that; fails after ten seconds, and when it ended without.
    void Await(const std::string& text) const
    {
        const gint64 deadline = g_get_monotonic_time() + gint64{10} * G_USEC_PER_SEC;
        while (Out().find(text) == std::string::npos && g_get_monotonic_time() < deadline && IsRunning())
            g_usleep(5000);
        EXPECT_THAT(Out(), HasSubstr(text)) << Err();
    }

    /// Waits for its end, which the signal brings about if there is one. @return the exit code; -1 when a signal ended it
    int End(int signal = 0)
    {
        g_subprocess_send_signal(process_.get(), signal);
        g_subprocess_wait(process_.get(), nullptr, nullptr);
        return g_subprocess_get_if_exited(process_.get()) ? g_subprocess_get_exit_status(process_.get()) : -1;
    }

private:
    bool IsRunning() const { return g_subprocess_get_identifier(process_.get()) != nullptr; }

    std::string files_;
    std::unique_ptr<GSubprocess, Unref> process_;
};

/// How a program ended.
struct Outcome
{
    int exit;
    std::string out, err;
};

/// The text without what differs from run to run and from machine to machine: times, addresses, directories, widths of columns.
std::string Steady(const std::string& text)
{
    const char* const passing = R"(\d{4}-\d\d-\d\d \d\d:\d\d:\d\d|(?<=waited seconds)  \d+|\d+(?= s:)|unix:[^ "]*|[^ "]*/)";
    return Replaced(Replaced(text, passing, ""), " +", " ");
}

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

    /// What bash offers behind those words, one a line.
    std::string Complete(const std::string& words)
    {
        return Finish("bash -c 'source <(" KIVCTL " print-bash-completion); COMP_WORDS=(kivctl " + words +
                      R"( ""); COMP_CWORD=$((${#COMP_WORDS[@]} - 1)); _kivctl; printf "%s\n" "${COMPREPLY[@]}"')")
            .out;
    }

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
    const std::tuple<std::string, int, const char*, const char*> cases[] = {
        {"", 2, "", "a verb is needed"},
        {"--version", 0, "kivctl " KIV_VERSION "\n", ""},
        {"sim wate", 2, "", "did you mean \"wait\"?"},
        {"sim --slott 1", 2, "", "did you mean \"--slot\"?"},
        {"sim --profile Singel", 10, "", "did you mean \"single\"?"},
        {"device set sim1.mscn=1 --profile ./x", 10, "", "did you mean \"sim1.msin\"?"},
        {"subscribers", 2, "", "a verb is needed: list, add, remove"},
        {"country 450 kr", 2, "", "one word too many"},
        {"sim --slot 1 wait", 2, "", "--slot belongs to \"sim\" alone"},
        {"country 352", 0, "Grenada", "--by calling"},
        {"country 352 --by calling", 0, "Luxembourg", ""},
        {"country KR", 1, "", "lower-case"},
        {"country 450-1", 2, "", "three digits"},
        {"device id", 1, "", "ServiceUnknown"},
        {"device --profile no-telephony", 0, "no modem answered", ""},
        {"device set runtime.flight-mode=true", 2, "", "--profile"},
        {"device --show-ids", 0, "imei                356938035643809\n", ""},
        {"sim --show-ids --json", 0, "\"450050123456789\"", ""},
        {"sim --profile dual-first-locked --json", 0, "\"imsi\": \"PIN required\"", ""},
        {"sim --slot -1", 2, "", "a number from 0 up"},
        {"sim --slot 2", 1, "", "slots count from 0"},
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
    for (const auto& [arguments, exit, out, err] : cases)
    {
        const Outcome outcome = Kivctl(arguments);
        EXPECT_EQ(exit, outcome.exit) << arguments << "\n" << outcome.err;
        EXPECT_THAT(outcome.out, HasSubstr(out)) << arguments;
        EXPECT_THAT(outcome.err, HasSubstr(err)) << arguments;
        EXPECT_TRUE(outcome.exit == 0 || !outcome.err.empty()) << arguments << " fails without a word";
    }
}

TEST_F(KivctlTest, CarriesEveryNotificationToSubscribersAndToTheServiceManagerAndTellsWhichDeliveriesFailed)
{
    const auto services = Start(KIVCTL " services --serial S1");
    std::string kinds;
    for (const std::string& kind : DASubscriberStore::Kinds())
        kinds += kind == "push" ? " --push mail" : " --kind " + kind;
    const auto all = Start(KIVCTL " subscribe --name a.all --key 7" + kinds);
    const auto other = Start(KIVCTL " subscribe --kind status --key 8");
    EXPECT_EQ("device id  S1\n", Kivctl("device id").out);

    const struct
    {
        std::string arguments;
        const char* call;
        bool isForManager = true;
    } cases[] = {
        {"auth-success", "auth imsi='1' success=1\n"},
        {"auth-fail", "auth imsi='1' success=0\n"},
        {"on --service 7", "status imsi='1' service_id=7 status='on'\n"},
        {"off --service 7", "status imsi='1' service_id=7 status='off'\n"},
        {"policy --service 7 --texts w x y z",
            "policy imsi='1' service_id=7 service_status='w' policy_feature='x' policy_version='y' policy_doc_url='z'\n"},
        {"activated", "activate imsi='1' active=1\n"},
        {"deactivated", "activate imsi='1' active=0\n"},
        {"number-changed --texts w x y z", "number_change imsi='1' text1='w' text2='x' text3='y' text4='z'\n", false},
    };
    std::set<std::string> words;
    for (const auto& [arguments, call, isForManager] : cases)
    {
        words.insert(arguments.substr(0, arguments.find(' ')));
        const Outcome told = Kivctl("notify --imsi 1 " + arguments);
        EXPECT_EQ("sent subscribers=1 delivered=1\n", told.out) << arguments << "\n" << told.err;
        all->Await(call);
        EXPECT_EQ(isForManager ? 0 : 4, Kivctl("notify --to manager --imsi 1 " + arguments).exit) << arguments;
        if (isForManager)
            services->Await(call);
    }
    const std::string refusal = Kivctl("notify nothing").err;
    EXPECT_EQ(words, All("(?:right are |\\G(?<!^), )([a-z-]+)", refusal)) << refusal;
    EXPECT_EQ("sent subscribers=2 delivered=2\n", Kivctl("notify --imsi 1 on off --service 8 --service 7").out);
    other->Await("status imsi='1' service_id=8 status='on'\n");

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
    all->Await("push service_id='mail' data='{\"a\":1}' message='two words' time=-5000000000\n");
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
    const auto service = Start(KIV_BOARD_DAEMON);
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
    const Outcome examined = Kivctl("doctor");
    EXPECT_EQ(1, examined.exit);
    EXPECT_THAT(Steady(examined.out), AllOf(HasSubstr("bus yes"), HasSubstr("deviced is not on the bus start it: kiv-board-daemon"),
                                          HasSubstr("subscriber store no"), HasSubstr("library yes")));
    bus.Stop();
    EXPECT_THAT(Steady(Kivctl("doctor --profile nosuch").out), AllOf(HasSubstr("bus no"), HasSubstr("device no")));
    for (const char* arguments : {"device id", "notify --imsi 1 auth-fail", "notify --imsi 1 auth-fail --to manager",
             "push mail --data d --message m", "subscribe --push a", "services"})
        EXPECT_EQ(8, Kivctl(arguments).exit) << arguments;
    // The library tells a bus that is too slow by the word in the reason, which names an unknown transport.
    const Outcome slow = Finish("env DBUS_SYSTEM_BUS_ADDRESS=Time: " KIVCTL " device id");
    EXPECT_EQ(9, slow.exit) << slow.err;
    EXPECT_THAT(slow.err, HasSubstr("timed out"));
}

TEST_F(KivctlTest, PrintsWhatThePagesShow)
{
    std::vector<std::pair<std::unique_ptr<Program>, std::string>> beside;
    const std::string pages = Contents(KIV_DOCS "/profiles.md") + Contents(KIV_DOCS "/kivctl.md");
    const auto examples = All<std::vector<std::string>>(R"(^\$ kivctl ((?s:.*?))(?=^\$ |^```))", pages);
    EXPECT_LT(35U, examples.size());
    for (const std::string& example : examples)
    {
        const std::string arguments = example.substr(0, example.find('\n'));
        const std::string printed = example.substr(arguments.size() + 1);
        if (arguments.back() == '&')
        {
            beside.emplace_back(Start(KIVCTL " " + arguments.substr(0, arguments.size() - 2)), printed);
            continue;
        }
        const Outcome outcome = Kivctl(arguments);
        const std::string end = outcome.exit ? "(exit code " + std::to_string(outcome.exit) + ")\n" : "";
        EXPECT_EQ(Steady(printed), Steady(outcome.out + outcome.err + end)) << arguments;
    }
    for (const auto& [program, printed] : beside)
    {
        program->Await(printed);
        EXPECT_EQ(printed, program->Out());
    }

    const auto rows = All(R"(^(\| `kivctl [^`]*` \| (?:object|array) \| .*) \|$)", pages);
    EXPECT_EQ(13U, rows.size());
    for (const std::string& row : rows)
    {
        const std::string arguments = *All("`kivctl (.*?)`", row).begin();
        const std::string out = Kivctl("--json --profile single " + arguments).out;
        std::set<std::string> names = All(R"re("(\w+)": ?)re", out);
        names.erase("notes");
        EXPECT_EQ(All(R"(`(\w+)`)", row), names) << arguments;
        EXPECT_EQ(row.find("| array |") != row.npos, out.front() == '[') << arguments;
    }
}

TEST_F(KivctlTest, HelpManPageCompletionAndPageAgreeOnVerbsOptionsAndExitCodes)
{
    const std::string man = Replaced(Kivctl("print-man-page").out, R"(\\([-:]))", R"(\1)");
    const std::string general = Replaced(man, R"((?s)\A.*^\.SH OPTIONS|^\.SH VERBS.*)", "");
    const char* const inHelp = "(?:^  |\\G,)(--?[a-z-]+)";
    const char* const inMan = R"((?:^\\fB|\G, )(--?[a-z-]+))";
    const std::set<std::string> everywhere = All(inHelp, Kivctl("--help").out);
    EXPECT_EQ(everywhere, All(inMan, general));

    std::vector<std::string> verbs{""};
    for (size_t i = 0; i < verbs.size(); ++i)
    {
        const std::string verb = verbs[i];
        const std::string help = Kivctl(verb + " --help").out;
        const std::set<std::string> below = All("^  ([a-z]+)  ", help);
        for (const std::string& name : below)
            verbs.push_back(verb + (verb.empty() ? "" : " ") + name);

        std::set<std::string> options = All(inHelp, help);
        std::set<std::string> described =
            All(inMan, verb.empty() ? general : Replaced(man, R"((?s)\A.*^\.SS ")" + verb + R"( \[|^\.S.*)", ""));
        options.insert(everywhere.begin(), everywhere.end());
        described.insert(everywhere.begin(), everywhere.end());
        EXPECT_EQ(options, described) << verb;

        const std::string completed = Complete(verb);
        EXPECT_EQ(options, All("^(-.*)$", completed)) << verb;
        EXPECT_THAT(All("^(.*)$", completed), testing::IsSupersetOf(below)) << verb;
    }
    EXPECT_EQ(20U, verbs.size());
    EXPECT_EQ("subscribers\nmanager\n", Complete("notify on --to"));
    EXPECT_THAT(Complete("device set"), HasSubstr("\nruntime.flight-mode=\n"));

    const auto codes = All(R"(^ +(\d+  .*)$)", Kivctl("--help").out);
    EXPECT_EQ(10U, codes.size());
    const std::string page = Replaced(Contents(KIV_DOCS "/kivctl.md"), R"(^\| (\d+) \| (.*) \|$)", R"(code \1  \2)");
    EXPECT_EQ(codes, All(R"(^code (.*)$)", page));
    EXPECT_EQ(codes, All(R"(^code (.*)$)", Replaced(man, R"(^\\fB(\d+)\\fR\n(.*))", R"(code \1  \2)")));
}

TEST_F(KivctlTest, ColoursAndReportsProgressOnATerminalOnly)
{
    const std::string colour = "\033[1m", progress = "\r\033[Klooking at the bus";
    const std::string onTerminal = " script --quiet --command '" KIVCTL " doctor' /dev/null";
    EXPECT_THAT(Finish("env -u NO_COLOR TERM=xterm" + onTerminal).out, AllOf(HasSubstr(colour), HasSubstr(progress)));
    EXPECT_THAT(Finish("env NO_COLOR=1 TERM=xterm" + onTerminal).out, AllOf(Not(HasSubstr(colour)), HasSubstr(progress)));
    const Outcome piped = Kivctl("doctor");
    EXPECT_THAT(piped.out + piped.err, AllOf(HasSubstr("library"), Not(HasSubstr("\033"))));
}

} // namespace
} // namespace kiv::test
