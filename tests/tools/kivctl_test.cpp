#include "support/Deliveries.h"
#include "support/PrivateBus.h"
#include "support/Texts.h"

#include <csignal>
#include <regex>

using testing::AllOf;
using testing::HasSubstr;

namespace kiv::test
{
namespace
{

using Words = std::set<std::string>;

/// What the pattern's group holds at every place where the pattern fits.
Words All(const char* pattern, const std::string& text)
{
    const std::regex regex(pattern);
    return {std::sregex_token_iterator(text.begin(), text.end(), regex, 1), std::sregex_token_iterator()};
}

/// The text without what differs from run to run and from machine to machine: times, addresses, directories, widths of columns.
std::string Steady(const std::string& text)
{
    const std::regex passing(R"(\d{4}-\d\d-\d\d \d\d:\d\d:\d\d|waited seconds +\d+|\d+(?= s:)|unix:[^ "]*|[^ "]*/)");
    return std::regex_replace(std::regex_replace(text, passing, ""), std::regex(" +"), " ");
}

/// A program that runs beside the test, in its directory, and is killed with its owner.
struct Program
{
    /// @param command  as a shell takes it
    explicit Program(const std::string& command)
    {
        const std::string line = "exec " + command + " >" + name + ".out 2>" + name + ".err";
        process.reset(g_subprocess_new(G_SUBPROCESS_FLAGS_NONE, nullptr, "sh", "-c", line.c_str(), nullptr));
    }
    ~Program() { g_subprocess_force_exit(process.get()); }

    std::string Out() const { return Contents(name + ".out"); }
    std::string Err() const { return Contents(name + ".err"); }

    /// Waits until it printed that.
    void Await(const std::string& text) const
    {
        SCOPED_TRACE(text);
        IterateUntil([&] { return Out().find(text) != std::string::npos; });
    }

    /// Waits for its end, which the signal brings about if there is one. @return the exit code; -1 when a signal ended it
    int End(int signal = 0)
    {
        g_subprocess_send_signal(process.get(), signal);
        g_subprocess_wait(process.get(), nullptr, nullptr);
        return g_subprocess_get_if_exited(process.get()) ? g_subprocess_get_exit_status(process.get()) : -1;
    }

    static inline int count = 0;
    const std::string name = std::to_string(++count);
    std::unique_ptr<GSubprocess, Unref> process;
};

/// One that says when it is ready.
struct Service : Program
{
    explicit Service(const std::string& command) : Program(command) { Await("ready"); }
};

/// One that has ended.
struct Outcome : Program
{
    explicit Outcome(const std::string& command) : Program(command) {}

    const int exit = End();
    const std::string out = Out(), err = Err();
};

Outcome Kivctl(const std::string& arguments)
{
    return Outcome(KIVCTL " " + arguments);
}

/// What bash offers behind those words, one a line.
std::string Complete(const std::string& words)
{
    return Outcome("bash -c 'source <(" KIVCTL " print-bash-completion); COMP_WORDS=(kivctl " + words +
                   R"( ""); COMP_CWORD=$((${#COMP_WORDS[@]} - 1)); _kivctl; printf "%s\n" "${COMPREPLY[@]}"')")
        .out;
}

/// A bus, a subscriber store and a directory of its own for each test.
struct KivctlTest : testing::Test
{
    KivctlTest()
    {
        std::filesystem::current_path(directory);
        g_setenv("KIV_SUBSCRIBERS", (directory + "/subscribers.db").c_str(), TRUE);
    }
    ~KivctlTest() override { std::filesystem::remove_all(directory); }

    const std::string directory = mkdtemp((std::filesystem::temp_directory_path() / "kivctl-XXXXXX").string().data());
    PrivateBus bus;
};

TEST_F(KivctlTest, EndsWithTheDocumentedExitCode)
{
    const std::tuple<std::string, int, const char*, const char*> cases[] = {
        {"--version", 0, "kivctl " KIV_VERSION "\n", ""},
        {"sim wate", 2, "", "did you mean \"wait\"?"},
        {"sim --slott 1", 2, "", "did you mean \"--slot\"?"},
        {"sim --profile Singel", 10, "", "host (did you mean \"single\"?)"},
        {"device set --profile ./x sim1.mscn=1", 10, "", "did you mean \"sim1.msin\"?"},
        {"device set --profile ./x sim0.mcc=45", 10, "", "./x: [sim0] mcc: \"45\" is wrong; 3 digits would be right"},
        {"device set --profile ./x sim0.mnc=4x", 10, "", "[sim0] mnc: \"4x\" is wrong; 2 to 3 digits would be right"},
        {"device set --profile ./x 'sim0.card-status=2;;3'", 10, "",
            "\"2;;3\" is wrong; a number from 0 to 255, or several with ;"},
        {"device set --profile ./x sim1.cp-name=modem0", 10, "", "[sim1] cp-name: \"modem0\" is that of sim0"},
        {"device set --profile ./x sim4.cp-name=modem4", 10, "", "[sim2] cp-name: missing"},
        {"device set --profile ./x sim8.cp-name=modem8", 10, "", "[sim8]: no such group; slots are sim0 to sim7"},
        {"device set --profile ./x sim1.mnc=123", 10, "", "[sim1] msin: too long"},
        {"device set --profile ./x 'network.cellular=5 bars'", 10, "", "\"5 bars\" is wrong; a number from 0 to 5 would be right"},
        {"device set --profile ./x network.wifi-connection=-2", 10, "", "\"-2\" is wrong; a number from -1 to 3 would be right"},
        {"device set --profile ./x storage.block-size=4294967296", 10, "", "[storage] block-size: \"4294967296\" is wrong"},
        {"device set --profile ./x 'run\ttime.wifi=1'", 10, "", "a bracket, a blank or a control character in it"},
        {"device set --profile ./x sim2.cp-name=modem2 sim2.mcc=450", 10, "",
            "[sim2] mnc: missing; mcc, mnc and msin stand together"},
        {"device set --profile ./x flight-mode=true", 10, "", "GROUP.KEY=VALUE is needed"},
        {"device set --profile ./broken runtime.flight-mode=true", 10, "", "./broken: [device] serial: not UTF-8, or a backslash"},
        {"device set --profile ./x device.serial=\xff", 10, "", "[device] serial: the value is not UTF-8"},
        {"device set --profile host runtime.flight-mode=true", 2, "", "what can be changed here is a device file"},
        {"sim --profile host", 1, "", "ModemManager does not run"},
        {"network --profile host", 1, "off (NetworkManager does not run)", ""},
        {"device --profile host", 0, "(not available on this machine)", ""},
        {"doctor --profile host", 1, "ModemManager      no   does not run", ""},
        {"subscribers", 2, "", "a verb is needed: list, add, remove"},
        {"country 450 kr", 2, "", "one word too many"},
        {"sim --slot 1 wait", 2, "", "--slot belongs to \"sim\" alone"},
        {"country 352", 0, "Grenada", "--by calling"},
        {"country 352 --by calling", 0, "Luxembourg", ""},
        {"device --profile no-telephony", 0, "no modem answered", ""},
        {"device --package a.b --json", 0, "\"package_version\": null", ""},
        {"device set runtime.flight-mode=true", 2, "", "--profile"},
        {"sim --show-ids --json", 0, "\"450050123456789\"", ""},
        {"sim --slot -1", 2, "", "a number from 0 up"},
        {"sim --slot 2", 1, "", "slots count from 0"},
        {"notify on", 2, "", "--service"},
        {"notify policy --service 7", 2, "", "--texts"},
        {"notify on --service 7", 1, "subscribers=0", "nobody has subscribed"},
        {"notify on --service 7 --to manager", 1, "", "no call result"},
        {"notify auth-success --profile none", 1, "", "--imsi"},
        {"subscribe --kind status", 2, "", "--key"},
        {"subscribers add status 7 7up /a a.b", 4, "", "7up"},
        {"subscribers remove status 7 a.b /a a.b", 1, "", "no such subscription"},
        {"subscribers list --json", 0, "[]", "nobody"},
    };
    std::ofstream("broken") << "[device]\nserial=\\q\n";
    for (const auto& [arguments, exit, out, err] : cases)
    {
        const Outcome outcome = Kivctl(arguments);
        EXPECT_EQ(exit, outcome.exit) << arguments << "\n" << outcome.err;
        EXPECT_THAT(outcome.out, HasSubstr(out)) << arguments;
        EXPECT_THAT(outcome.err, HasSubstr(err)) << arguments;
        EXPECT_EQ(*out == '\0', outcome.out.empty()) << arguments;
    }
    EXPECT_FALSE(std::filesystem::exists("x"));
    EXPECT_EQ(10, Outcome("env KIV_PROFILE=tripel " KIVCTL " network").exit);
}

TEST_F(KivctlTest, CarriesEveryNotificationToItsReceivers)
{
    const Service services(KIVCTL " services --serial S1");
    const Service all(KIVCTL " subscribe --name a.all --key 7 --kind policy --kind status --kind auth --kind activated"
                             " --kind number_changed --push mail");
    const Service other(KIVCTL " subscribe --kind status --key 8");
    EXPECT_EQ("device id  S1\n", Kivctl("device id").out);

    const std::pair<std::string, const char*> cases[] = {
        {"activated", "activate imsi='1' active=1\n"},
        {"auth-fail", "auth imsi='1' success=0\n"},
        {"auth-success", "auth imsi='1' success=1\n"},
        {"deactivated", "activate imsi='1' active=0\n"},
        {"number-changed --texts w x y z", "number_change imsi='1' text1='w' text2='x' text3='y' text4='z'\n"},
        {"off --service 7", "status imsi='1' service_id=7 status='off'\n"},
        {"on --service 7", "status imsi='1' service_id=7 status='on'\n"},
        {"policy --service 7 --texts w x y z",
            "policy imsi='1' service_id=7 service_status='w' policy_feature='x' policy_version='y' policy_doc_url='z'\n"},
    };
    std::string types = "right are";
    for (const auto& [arguments, call] : cases)
    {
        types += ' ' + arguments.substr(0, arguments.find(' ')) + ',';
        const Outcome told = Kivctl("notify --imsi 1 " + arguments);
        EXPECT_EQ("sent subscribers=1 delivered=1\n", told.out) << arguments << "\n" << told.err;
        all.Await(call);
        const bool isRefused = Kivctl("notify --to manager --imsi 1 " + arguments).exit == 4;
        EXPECT_EQ(arguments.find("number-changed") == 0, isRefused) << arguments;
        if (!isRefused)
            services.Await(call);
    }
    types.back() = ';';
    EXPECT_THAT(Kivctl("notify nothing").err, HasSubstr(types));
    EXPECT_EQ("sent subscribers=2 delivered=2\n", Kivctl("notify --imsi 1 on off --service 8 --service 7").out);
    other.Await("status imsi='1' service_id=8 status='on'\n");

    for (const char* what : {"status 7", "push mail"})
        ASSERT_EQ(0, Kivctl(std::string("subscribers add ") + what + " org.gone.Away /a a.b").exit);
    for (const char* arguments :
        {"notify --imsi 1 on --service 7", "push mail --data '{\"a\":1}' --message 'two words' --time -5000000000"})
    {
        const Outcome told = Kivctl(arguments);
        EXPECT_EQ(1, told.exit) << arguments;
        EXPECT_EQ("sent subscribers=2 delivered=1\n", told.out) << arguments;
        EXPECT_THAT(told.err, HasSubstr("ServiceUnknown")) << arguments;
    }
    all.Await("push service_id='mail' data='{\"a\":1}' message='two words' time=-5000000000\n");
}

TEST_F(KivctlTest, ServicesHoldTheirNamesAndSubscriptionsUntilTheyEnd)
{
    const std::pair<int, std::string> services[] = {
        {SIGINT, KIVCTL " subscribe --name a.b --kind auth"}, {SIGTERM, KIV_BOARD_DAEMON}, {SIGHUP, KIV_SERVICE_MANAGER}};
    for (const auto& [signal, command] : services)
    {
        Service service(command);
        const Outcome second(command);
        EXPECT_EQ(1, second.exit);
        EXPECT_THAT(second.err, HasSubstr("is taken"));
        EXPECT_EQ(0, service.End(signal));
        EXPECT_EQ("", Kivctl("subscribers list").out);
    }
    Service service(KIV_BOARD_DAEMON);
    bus.Stop();
    EXPECT_EQ(1, service.End());
}

TEST_F(KivctlTest, SubscribesByTheServiceAsItDoesInTheFile)
{
    Service service("env KIV_SUBSCRIBERS=" + directory + "/served.db " KIV_SUBSCRIPTION_SERVICE);
    const std::string file = "env KIV_SUBSCRIBERS=served.db " KIVCTL " subscribers list";
    {
        Service client(KIVCTL " subscribe --name a.b --kind auth");
        EXPECT_EQ("", Kivctl("subscribers list").out);
        EXPECT_THAT(Outcome(file).out, HasSubstr("a.b"));
        EXPECT_EQ(0, client.End(SIGINT));
        EXPECT_EQ("", Outcome(file).out);
    }
    const auto compare = [](const std::string& command, int exit)
    {
        const Outcome byService = Kivctl(command), inFile = Kivctl(command + " --store served.db");
        EXPECT_EQ(exit, byService.exit) << command;
        EXPECT_EQ(exit, inFile.exit) << command;
        EXPECT_EQ(inFile.err, byService.err);
    };
    compare("subscribe --push '' --name a.b", 4);
    std::ofstream("served.db") << std::string(4096, 'x');
    compare("subscribe --push a --name a.b", 6);
}

TEST_F(KivctlTest, TellsAMissingBusFromABrokenStore)
{
    std::ofstream("subscribers.db") << std::string(4096, 'x');
    for (const char* arguments :
        {"subscribers list", "notify --imsi 1 auth-fail", "push mail --data d --message m", "subscribe --push a"})
        EXPECT_EQ(6, Kivctl(arguments).exit) << arguments;
    const Outcome examined = Kivctl("doctor");
    EXPECT_EQ(1, examined.exit);
    EXPECT_THAT(Steady(examined.out),
        AllOf(HasSubstr("bus yes"), HasSubstr("deviced is not on the bus start it: kiv-board-daemon"),
            testing::ContainsRegex("subscriber store no .*: file is not a database the file is damaged: move it away"),
            HasSubstr("library yes")));
    bus.Stop();
    EXPECT_THAT(Steady(Kivctl("doctor --profile nosuch").out), AllOf(HasSubstr("bus no"), HasSubstr("device no")));
    for (const char* arguments : {"device id", "notify --imsi 1 auth-fail", "notify --imsi 1 auth-fail --to manager",
             "push mail --data d --message m", "subscribe --push a", "services"})
        EXPECT_EQ(8, Kivctl(arguments).exit) << arguments;
    // The library tells a bus that is too slow by the word in the reason, which names an unknown transport.
    EXPECT_EQ(9, Outcome("env DBUS_SYSTEM_BUS_ADDRESS=Time: " KIVCTL " device id").exit);
}

TEST_F(KivctlTest, PrintsWhatThePagesShow)
{
    std::map<std::string, Service> beside; // by what each is to print
    const std::string pages = Contents(KIV_DOCS "/profiles.md") + Contents(KIV_DOCS "/kivctl.md");
    g_auto(GStrv) examples = g_strsplit(pages.c_str(), "\n$ kivctl ", -1);
    EXPECT_LT(36U, g_strv_length(examples));
    for (char** rest = examples + 1; *rest != nullptr; ++rest)
    {
        const std::string text = *rest, example = text.substr(0, text.find("\n```")) + '\n';
        const std::string arguments = example.substr(0, example.find('\n'));
        const std::string printed = example.substr(arguments.size() + 1);
        if (arguments.back() == '&')
        {
            beside.try_emplace(printed, KIVCTL " " + arguments.substr(0, arguments.size() - 2));
            continue;
        }
        const Outcome outcome = Kivctl(arguments);
        const std::string end = outcome.exit ? "(exit code " + std::to_string(outcome.exit) + ")\n" : "";
        EXPECT_EQ(Steady(printed), Steady(outcome.out + outcome.err + end)) << arguments;
    }
    for (const auto& [printed, program] : beside)
    {
        program.Await(printed);
        EXPECT_EQ(printed, program.Out());
    }

    const Words rows = All("\n(\\| `kivctl [^`]*` \\| (?:object|array) \\| .*) \\|", pages); // of the fields in JSON
    EXPECT_EQ(13U, rows.size());
    for (const std::string& row : rows)
    {
        const std::string out = Kivctl("--json --profile single " + *All("`kivctl (.*?)`", row).begin()).out;
        Words names = All("\"(\\w+)\": ?", out);
        names.erase("notes");
        EXPECT_EQ(All("`(\\w+)`", row), names) << row;
        EXPECT_EQ(row.find("| array |") != row.npos, out.front() == '[') << row;
    }
}

TEST_F(KivctlTest, PagesAndCompletionListAllThatTheHelpLists)
{
    const std::string man = std::regex_replace(Kivctl("print-man-page").out, std::regex(R"(\\([-:]))"), "$1");
    const std::string general = Kivctl("--help").out, page = Contents(KIV_DOCS "/kivctl.md");
    const char* const inHelp = "(?:\n  |,)(--?[a-z-]+)";
    const Words everywhere = All(inHelp, general);
    EXPECT_THAT(everywhere, testing::Contains("--json"));
    std::vector<std::string> verbs{""};
    for (size_t i = 0; i < verbs.size(); ++i)
    {
        const std::string verb = verbs[i], help = Kivctl(verb + " --help").out;
        Words words = All("\n  ([a-z]+)  ", help);
        for (const std::string& name : words)
            verbs.push_back(verb + (verb.empty() ? "" : " ") + name);
        words.merge(All(inHelp, help));
        words.insert(everywhere.begin(), everywhere.end());
        EXPECT_THAT(All("(.+)\n", Complete(verb)), testing::IsSupersetOf(words)) << verb;

        const std::string below = man.substr(man.find(verb.empty() ? ".SH OPTIONS" : ".SS \"" + verb + " ["));
        Words described = All(R"((?:\\fB|, )(--?[a-z-]+))", below.substr(0, below.find("\n.S")));
        described.insert({"-h", "--help"}); // told once for all verbs
        EXPECT_THAT(described, testing::IsSupersetOf(All(inHelp, help))) << verb;
    }
    EXPECT_EQ(20U, verbs.size());
    EXPECT_EQ("subscribers\nmanager\n", Complete("notify on --to"));
    EXPECT_THAT(Complete("device set"), HasSubstr("\nruntime.flight-mode=\n"));

    const Words codes = All("\n +([0-9]+  .*)", general);
    EXPECT_EQ(10U, codes.size());
    for (const std::string& code : codes)
    {
        EXPECT_THAT(page, HasSubstr("| " + std::regex_replace(code, std::regex("  "), " | ") + " |\n"));
        EXPECT_THAT(man, HasSubstr("\\fB" + std::regex_replace(code, std::regex("  "), "\\fR\n")));
    }
}

TEST_F(KivctlTest, ShowsColoursAndProgressOnATerminal)
{
    const std::string colour = "\033[1m", progress = "\r\033[Klooking at the bus";
    const std::string onTerminal = " script --quiet --command '" KIVCTL " doctor' /dev/null";
    EXPECT_THAT(Outcome("env -u NO_COLOR TERM=xterm" + onTerminal).out, AllOf(HasSubstr(colour), HasSubstr(progress)));
    EXPECT_THAT(Outcome("env NO_COLOR=1 TERM=xterm" + onTerminal).out, AllOf(testing::Not(HasSubstr(colour)), HasSubstr(progress)));
}

} // namespace
} // namespace kiv::test
