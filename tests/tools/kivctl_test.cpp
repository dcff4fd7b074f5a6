#include "tools/KivctlTest.h"

namespace kiv::test
{
namespace
{

TEST_F(KivctlTest, EndsWithTheDocumentedExitCode)
{
    const std::tuple<std::string, int, const char*, const char*> cases[] = {
        {"-V", 0, "kivctl " KIV_VERSION "\n", ""},
        {"sim wate", 2, "", "did you mean \"wait\"?"},
        {"sim --slott 1", 2, "", "did you mean \"--slot\"?"},
        {"sim --profile Singel", 10, "", "host (did you mean \"single\"?)"},
        {"device set --profile ./no/x sim1.msin=1", 10, "", "./no/x: its directory cannot be opened: No such file or directory"},
        {"device set --profile ./x sim1.mscn=1", 10, "", "did you mean \"msin\"?"},
        {"device set --profile ./x sim0.mcc=45", 10, "", "./x: [sim0] mcc: \"45\" is invalid; expected 3 digits"},
        {"device set --profile ./x sim0.mnc=4x", 10, "", "[sim0] mnc: \"4x\" is invalid; expected 2 to 3 digits"},
        {"device set --profile ./x 'sim0.card-status=2;;3'", 10, "", "\"2;;3\" is invalid; expected card-error (0), no-card (1), "},
        {"device set --profile ./x sim1.cp-name=modem0", 10, "", "[sim1] cp-name: \"modem0\" is the name of sim0"},
        {"device set --profile ./x sim4.cp-name=modem4", 10, "", "[sim2] cp-name: missing"},
        {"device set --profile ./x sim8.cp-name=modem8", 10, "", "[sim8]: no such group; slots are sim0 to sim7"},
        {"device set --profile ./x sim1.mnc=123", 10, "", "[sim1] msin: too long"},
        {"device set --profile ./x 'network.cellular=5 bars'", 10, "", "available (4) or connected (5)"},
        {"device set --profile ./x network.wifi-connection=-2", 10, "", "\"-2\" is invalid; expected failure (-1), "},
        {"device set --profile ./x storage.block-size=4294967296", 10, "", "[storage] block-size: \"4294967296\" is invalid"},
        {"device set --profile ./x 'run\ttime.wifi=1'", 10, "", "a bracket, a blank or a control character in its group or key"},
        {"device set --profile ./x sim2.cp-name=modem2 sim2.mcc=450", 10, "",
            "[sim2] mnc: missing; expected all of mcc, mnc and msin, or none"},
        {"device set --profile ./x network.wifi=conected", 10, "", "(did you mean \"connected\"?)"},
        {"device set --profile ./x run-time.flight-mode=true", 10, "", "faults (did you mean \"runtime\"?)"},
        {"device set --profile ./x faults.tel_inti=-5", 10, "", "no such function of the platform (did you mean \"tel_init\"?)"},
        {"device set --profile ./x faults.tel_init@0=-5", 10, "", "\"@0\" is invalid; expected @ and a number from 1 to 1000000"},
        {"device set --profile ./x faults.tel_init=0", 10, "",
            "\"0\" is invalid; expected a number from -2147483648 to 2147483647, but not 0"},
        {"network --profile ./fifo", 10, "", "./fifo: not a regular file"},
        {"device set --profile ./x flight-mode=true", 10, "", "expected GROUP.KEY=VALUE"},
        {"device set --profile ./broken runtime.flight-mode=true", 10, "", "./broken: [device] serial: not UTF-8, or a backslash"},
        {"device set --profile ./x device.serial=\xff", 10, "", "[device] serial: the value is not UTF-8"},
        {"device set --profile host runtime.flight-mode=true", 2, "", "only a device file can be changed"},
        {"sim --profile host", 1, "", "ModemManager does not run"},
        {"network --profile host", 1, "off (NetworkManager does not run)", ""},
        {"device --profile host", 0, "(not available on this machine)", ""},
        {"doctor --profile host", 1, "ModemManager          no   does not run", ""},
        {"doctor --profile host", 1, "NetworkManager        no   does not run", ""},
        {"subscribers", 2, "", "missing verb; expected one of list, add, remove"},
        {"country 450 kr", 2, "", "unexpected word \"kr\" after kivctl country; see kivctl country --help"},
        {"sim --slot 1 wait", 2, "", "--slot is an option of \"sim\"; those of \"sim wait\" go after it"},
        {"country 352", 0, "Grenada", "--by calling"},
        {"country 352 --by calling", 0, "Luxembourg", ""},
        {"device --profile no-telephony", 0, "no modem answered", ""},
        {"device --package a.b --json", 0, "\"package_version\": null", ""},
        {"device set runtime.flight-mode=true", 2, "", "--profile"},
        {"sim --show-ids --json", 0, "\"450050123456789\"", ""},
        {"sim --slot -1", 2, "", "expected 0 or a positive whole number"},
        {"sim --slot 2", 1, "", "slots are counted from 0"},
        {"notify on", 2, "", "--service"},
        {"notify policy --service 7", 2, "", "--texts"},
        {"notify on --service 7", 1, "subscribers=0", "there are no subscribers to this event"},
        {"notify on --service 7 --to manager", 1, "", "no program owns the name"},
        {"notify auth-success --profile none", 1, "", "--imsi"},
        {"subscribe --kind status", 2, "", "--key"},
        {"subscribe --kind auth --name :1.7", 2, "", "--name: \":1.7\" is invalid; expected elements joined by dots, such as"},
        {"services --serial \xff", 2, "", "--serial: \"\\xff\" is invalid; expected UTF-8"},
        {"subscribers add status 7 7up /a a.b", 4, "", "7up"},
        {"subscribers remove status 7 a.b /a a.b", 1, "", "no such subscription"},
        {"sim wait --profile none", 1, "", "waiting does not make a SIM usable"},
        {"sim wait --profile pin-required --timeout 0", 3, "", "no SIM is usable after 0 s"},
        {"network --profile no-telephony", 1, "out of service", ""},
        {"country +81", 0, "Japan", ""},
        {"-t --fields imsi,number sim -p single", 0, "45005**********:***********78\n", ""},
        {"device -t --fields imei", 0, "***********3809\n", ""},
        {"device --show-ids --fields imei,platform_device_id -j", 0, "\"imei\": \"356938035643809\"", ""},
        {"device set -p ./w network.cellular=0 network.wifi=2 device.tizen-id=1234", 0, "", ""},
        {"network -p ./w --bt", 1, "connected  no", ""},
        {"network -p ./w --wifi", 0, "connected  yes", ""},
        {"device set -p ./w network.wifi=0 network.bluetooth=2 settings.device-name='a:\\\xe2\x80\xae'", 0, "", ""},
        {"network -p ./w --bt", 0, "connected  yes", ""},
        {"device -p ./w -t --fields platform_device_id,name", 0, "****:a\\:\\\\\\u202e\n", ""},
        {"device -p ./w --fields name", 0, "name  a:\\\\u202e\n", ""},
        {"device get -p ./w settings.device-name", 0, "a:\\\\u202e\n", ""},
        {"device -p ./w -j --fields name", 0, "\"a:\\\\\\u202e\"", ""},
        {"network -p './\x1b[31m\n'", 10, "", "./\\x1b[31m\\n"},
        {"device --fields nam,model", 2, "", "there is no field \"nam\" (did you mean \"name\"?); the fields are name, model,"},
        {"subscribers list --fields key,x", 2, "", "the fields are kind, key, bus_name, object_path, interface"},
        {"sim wait -p none --fields slot", 2, "", "the fields are usable_slot, waited_seconds"}, // before it waits
        {"notify auth --fields event", 2, "", "--fields and --terse are for queries"},
        {"-j --fields slot,service-type,imsi sim -p single", 0,
            "{\n    \"slot\": 0,\n    \"service_type\": 6,\n    \"imsi\": \"45005**********\",\n    \"notes\": {\n"
            "      \"imsi\": \"masked; --show-ids shows all of it\"\n",
            ""},
        {"sim --slot 0 --slot 1", 2, "", "--slot is given more than once; see kivctl sim --help"},
        {"sim --json --terse", 2, "", "--json cannot be used with --terse"},
        {"network --wifi=no", 2, "", "--wifi takes no value; see kivctl network --help"},
        {"--version=1", 2, "", "--version takes no value"},
        {"sim --slot 0x1", 2, "", "--slot: \"0x1\" is invalid"},
        {"sim --slot 01 -t --fields slot", 0, "1\n", ""},
        {"sim wait --timeout nan", 2, "", "--timeout: \"nan\" is invalid; expected 0 or a positive number"},
        {"push m --data d --message m --time now", 2, "", "--time: \"now\" is invalid; expected a 64-bit whole number"},
        {"device --storage x", 2, "", "--storage: \"x\" is invalid; expected a number"},
        {"notify policy --service 7 --texts a b", 2, "", "--texts needs 4 values, not 2; see"},
        {"notify policy --service 7 --texts a b c d e", 2, "", "--texts needs 4 values, not 5; see"},
        {"country 450 --by", 2, "", "--by needs a value: mcc|alpha2|calling|service"},
        {"--color always -p single --fields slot sim", 0, "\033[1mslot\033[0m\n", ""},
        {"subscribers list --json", 0, "[]", "there are no subscriptions in "},
        {"subscribers add auth-fail all a.b /a a.b --json", 0, "\"result\": \"added\",\n  \"kind\": \"auth\"", ""},
        {"subscribers add auth all a.b /a a.b --json", 0, "\"result\": \"unchanged\"", "this subscription already exists"},
        {"subscribers remove auth all a.b /a a.b --json", 0, "\"result\": \"removed\"", ""},
    };
    EXPECT_EQ(0, mkfifo("fifo", 0600));
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
    const Outcome mistyped("env KIV_PROFILE=tripel KIV_LOG=loud\x1b " KIVCTL " network");
    EXPECT_EQ(10, mistyped.exit);
    EXPECT_EQ(2, std::count(mistyped.err.begin(), mistyped.err.end(), '\n')) << mistyped.err;
    EXPECT_THAT(mistyped.err, HasSubstr("kivctl: KIV_LOG: \"loud\\x1b\" is invalid; expected error, info or journal\n"));
}

TEST_F(KivctlTest, SaysThatTheOutputCannotBeWritten)
{
    for (const char* service : {KIV_BOARD_DAEMON, KIV_SERVICE_MANAGER, KIV_SUBSCRIPTION_SERVICE})
    {
        const Outcome outcome("sh -c '" + std::string(service) + " >/dev/full'");
        EXPECT_EQ(1, outcome.exit) << service;
        EXPECT_THAT(outcome.err, HasSubstr(": cannot write to standard output: No space left on device\n"));
    }
    EXPECT_EQ(7, Outcome("sh -c '" KIVCTL " services >/dev/full'").exit);
    const Service services(KIVCTL " services"), client(KIVCTL " subscribe --kind auth --push m");
    Kivctl("device set -p ./followed runtime.flight-mode=false");
    std::vector<std::string> commands{"device", "sim", "country 450 -t", "network -j", "profiles -j", "device get sim0.mcc",
        "profiles show dual", "--version", "completion bash", "device id", "doctor -t", "notify auth",
        "notify auth -j --to manager", "push m --data d --message m", "subscribers list", "subscribers add auth all a.b /a a.b -j",
        "subscribe --push n", "sim wait -j", "-p ./followed watch"};
    for (const std::string& verb : Verbs())
        commands.push_back(verb + " --help");
    for (const std::string& arguments : commands)
    {
        const Outcome outcome("sh -c '" KIVCTL " " + arguments + " >/dev/full'");
        EXPECT_EQ(7, outcome.exit) << arguments;
        EXPECT_EQ("kivctl: cannot write to standard output: No space left on device\n", outcome.err) << arguments;
    }
    // A reader that closes a stream ends it without an error.
    const std::string closed = "env --default-signal=PIPE bash -c 'exec 3> >(:); wait $!; " KIVCTL;
    EXPECT_EQ(0, Outcome(closed + " subscribe --kind auth >&3'").exit);
    const Outcome ended(closed + " device >&3; exit $?'");
    EXPECT_EQ(128 + SIGPIPE, ended.exit) << ended.err;
    EXPECT_EQ("", ended.err);
}

/// The lines that the program prints on a terminal of that width.
std::vector<std::string> OnTerminal(const std::string& columns, const std::string& arguments)
{
    const std::string out = Outcome(
        "script --quiet --echo never --command 'stty cols " + columns + "; " KIVCTL " " + arguments + "' /dev/null <>keyboard")
                                .out;
    const std::regex ends("\r*\n");
    return {std::sregex_token_iterator(out.begin(), out.end(), ends, -1), std::sregex_token_iterator()};
}

/// The words of a text, in which "," and "|" end a word too.
std::vector<std::string> Words(const std::string& text)
{
    const std::regex ends("[\\s,|]+");
    return {std::sregex_token_iterator(text.begin(), text.end(), ends, -1), std::sregex_token_iterator()};
}

TEST_F(KivctlTest, WrapsLinesAtTheWidthOfTheTerminal)
{
    std::vector<std::string> commands{"notify wrong", "sim", "device", "device keys", "-p pin-required sim"};
    for (const std::string& verb : Verbs())
        commands.push_back(verb + " --help");
    for (const std::string columns : {"80", "40"})
    {
        for (const std::string& arguments : commands)
        {
            std::string printed;
            for (const std::string& line : OnTerminal(columns, "--color never " + arguments))
            {
                EXPECT_LE(line.size(), std::stoul(columns)) << arguments << "\n" << line;
                printed += line + '\n';
            }
            if (arguments.find("--help") != arguments.npos)
            {
                EXPECT_EQ(Words(Kivctl(arguments).out), Words(printed));
            }
        }
    }
    EXPECT_EQ((std::vector<std::string>{"slot  0", "card  ready", "", "slot  1", "card  ready"}),
        OnTerminal("40", "--color never --fields slot,card sim"));
    EXPECT_EQ((std::vector<std::string>{"slot  card", "0     ready", "1     ready"}),
        OnTerminal("80", "--color never --fields slot,card sim"));
    EXPECT_THAT(OnTerminal("40", "sim --help"), testing::IsSupersetOf({"  --slot N", "    Use only this slot, counted from 0"}));
    EXPECT_THAT(OnTerminal("80", "--help"), testing::Contains(std::string(28, ' ') + "(default: auto)"));

    EXPECT_THAT(OnTerminal("20", "push m --data d --message m"), testing::Contains("  delivered=0"));
    EXPECT_THAT(OnTerminal("2", "country \u6f22\u5b57"), testing::IsSupersetOf({"\u6f22", "\u5b57"})); // as wide as the terminal

    // A word that is longer than its column begins further left; one that is longer than the line ends after a slash.
    const std::string word = "./" + std::string(35, 'w'), folder(20, 'd'), file(25, 'f');
    std::filesystem::create_directory(folder);
    for (const auto& [device, lines] :
        {std::pair<std::string, std::vector<std::string>>(word, {"finding  file", "  " + word + ","}),
            {"./" + folder + "/" + file, {"finding  file ./" + folder + "/", "         " + file + ", two"}}})
    {
        Kivctl("device set runtime.flight-mode=false -p " + device);
        EXPECT_THAT(OnTerminal("40", "doctor --color never --fields finding -p " + device), testing::IsSupersetOf(lines));
    }
}

TEST_F(KivctlTest, PausesBetweenTwoChecksWhileItWaitsForASim)
{
    Kivctl("device set -p ./slow 'sim0.card-status=2;2;3' sim1.card-status=1");
    const Outcome waited = Kivctl("sim wait -p ./slow -t --fields usable_slot,waited_seconds --timeout 60");
    EXPECT_THAT(waited.out, testing::ContainsRegex("^0:[1-9]")) << waited.err;
}

TEST_F(KivctlTest, ShowsColoursAndProgressOnATerminal)
{
    const std::string colour = "\033[1m", progress = "\r\033[Kchecking the bus";
    const std::string onTerminal = " script --quiet --echo never --command '" KIVCTL " doctor' /dev/null <>keyboard";
    EXPECT_THAT(Outcome("env -u NO_COLOR TERM=xterm" + onTerminal).out, AllOf(HasSubstr(colour), HasSubstr(progress)));
    EXPECT_THAT(Outcome("env NO_COLOR=1 TERM=xterm" + onTerminal).out, AllOf(testing::Not(HasSubstr(colour)), HasSubstr(progress)));
}

} // namespace
} // namespace kiv::test
