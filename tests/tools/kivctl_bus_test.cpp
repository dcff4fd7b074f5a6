#include "support/Peer.h"
#include "tools/KivctlTest.h"

#include <gio/gunixsocketaddress.h>

namespace kiv::test
{
namespace
{

TEST_F(KivctlTest, CarriesEveryNotificationToItsReceivers)
{
    const Service services(KIVCTL " services --serial S1");
    const Service all(KIVCTL " subscribe --name a.all --key 7 --kind policy --kind status --kind auth --kind activated"
                             " --kind number_changed --push mail");
    const Service other(KIVCTL " subscribe --kind status --key 8");
    EXPECT_EQ("ready bus_names=org.tizen.system.deviced,org.tizen.servicemanager.service\n", services.Out());
    EXPECT_EQ(
        "ready bus_name='a.all' subscribed=policy:7,status:7,auth:all,activated:all,number_changed:all,push:mail\n", all.Out());
    EXPECT_EQ("device id  S1\n", Kivctl("device id").out);

    const std::pair<std::string, const char*> cases[] = {
        {"activated", "activated imsi='1' active=1\n"},
        {"auth-fail", "auth imsi='1' success=0\n"},
        {"auth-success", "auth imsi='1' success=1\n"},
        {"deactivated", "activated imsi='1' active=0\n"},
        {"number_changed --texts a b c d", "number_changed imsi='1' text1='a' text2='b' text3='c' text4='d'\n"},
        {"off --service 7", "status imsi='1' service_id=7 status='off'\n"},
        {"on --service 7", "status imsi='1' service_id=7 status='on'\n"},
        {"policy --service 7 --texts w x y z",
            "policy imsi='1' service_id=7 service_status='w' policy_feature='x' policy_version='y' policy_doc_url='z'\n"},
        {"auth", "auth imsi='1' success=1\n"}, // from here on, other words for these events
        {"number-changed --texts w x y z", "number_changed imsi='1' text1='w' text2='x' text3='y' text4='z'\n"},
        {"status --service 7", "status imsi='1' service_id=7 status='on'\n"},
    };
    std::string types = "expected one of";
    bool isListed = true;
    for (const auto& [arguments, call] : cases)
    {
        isListed = isListed && arguments != "auth";
        types += isListed ? ' ' + arguments.substr(0, arguments.find(' ')) + ',' : "";
        const Outcome sent = Kivctl("notify --imsi 1 " + arguments);
        EXPECT_EQ("sent subscribers=1 delivered=1\n", sent.out) << arguments << "\n" << sent.err;
        all.Await(call);
        const bool isRefused = Kivctl("notify --to manager --imsi 1 " + arguments).exit == 4;
        EXPECT_EQ(arguments.find("number") == 0, isRefused) << arguments;
        if (!isRefused)
            services.Await(call);
    }
    types.back() = ';';
    EXPECT_THAT(Kivctl("notify nothing").err, HasSubstr(types));
    EXPECT_EQ("sent subscribers=2 delivered=2\n", Kivctl("notify --imsi 1 on off --service 8 --service 7").out);
    other.Await("status imsi='1' service_id=8 status='on'\n");

    for (const char* what :
        {"push 7", "push other", "status 7", "status 9", "push mail"}) // advice names only the record that failed
        ASSERT_EQ(0, Kivctl(std::string("subscribers add ") + what + " org.gone.Away /a a.b").exit);
    for (const std::string arguments : {"notify --imsi 1 on off --service 8 --service 9", "notify --imsi 1 on --service 7",
             "push mail --data '{\"a\":1}' --message 'two words' --time -5000000000"})
    {
        const Outcome sent = Kivctl(arguments);
        EXPECT_EQ(1, sent.exit) << arguments;
        EXPECT_EQ("sent subscribers=2 delivered=1\n", sent.out) << arguments;
        const std::string event = arguments[0] == 'p' ? "push mail" : std::string("status ") + arguments.back();
        EXPECT_THAT(sent.err, HasSubstr("remove its record: kivctl subscribers remove " + event + " org.gone.Away /a a.b\n"));
    }
    all.Await("push service_id='mail' data='{\"a\":1}' message='two words' time=-5000000000\n");
    Kivctl("push mail --data d --message now\xe2\x80\xa8");
    EXPECT_THAT(Steady(all.Out()), testing::ContainsRegex("message='now\\\\u2028' time=[0-9]{10}\n")); // in seconds
}

TEST_F(KivctlTest, ServicesKeepNamesAndSubscriptionsUntilTheyEnd)
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
    Service client(KIVCTL " subscribe --kind auth"), both(KIVCTL " services"), installed(KIV_SUBSCRIPTION_SERVICE);
    bus.Stop();
    EXPECT_EQ(8, client.End());
    EXPECT_EQ(8, both.End());
    EXPECT_EQ(1, installed.End());
}

TEST_F(KivctlTest, InstalledServicesAnswerAndPrintWhatTheyReceive)
{
    const Service board(KIV_BOARD_DAEMON " --serial S23456"), manager(KIV_SERVICE_MANAGER);
    EXPECT_EQ("ready bus_names=org.tizen.system.deviced\n", board.Out());
    EXPECT_EQ("S23456\n", Kivctl("device id -t").out);
    EXPECT_EQ("**3456\n", Kivctl("device -t --fields serial").out);
    EXPECT_EQ(0, Kivctl("notify activated --imsi \"'1\xe2\x80\xa8\" --to manager").exit);
    EXPECT_EQ("ready bus_names=org.tizen.servicemanager.service\nactivated imsi=\"'1\\u2028\" active=1\n", manager.Out());
}

TEST_F(KivctlTest, SaysInPlainWordsAndEscapedWhyACallFailed)
{
    for (const char* record : {"auth all", "push m"})
        Kivctl(std::string("subscribers add ") + record + " a.b /a a.b");
    for (const auto& [name, reason] :
        std::map<std::string, const char*>{{"org.freedesktop.DBus.Error.AccessDenied", "this user is not allowed to call it\n"},
            {"org.freedesktop.DBus.Error.NoReply", "it left the bus without an answer\n"},
            {"a.b.Error", "it answered with the error a.b.Error: (\\x1b[31m\\nforged)\n"}})
    {
        const auto fail = [error = name](GDBusMessage* call)
        { return g_dbus_message_new_method_error_literal(call, error.c_str(), "(\x1b[31m\nforged)"); };
        const Peer manager(bus, "org.tizen.servicemanager.service", fail), client(bus, "a.b", fail),
            board(bus, "org.tizen.system.deviced", fail);
        for (const char* arguments : {"notify auth --to manager", "notify auth", "push m --data d --message m", "device id"})
            EXPECT_THAT(Outcome("env KIV_LOG=error " KIVCTL " " + std::string(arguments)).err,
                AllOf(HasSubstr(reason), testing::Not(HasSubstr("\x1b")), testing::Not(HasSubstr("\nforged"))))
                << arguments;
    }
    EXPECT_THAT(Kivctl("notify auth --to manager").err, HasSubstr("\n  no program owns the name\n"));
}

TEST_F(KivctlTest, LimitsTheWaitForAServiceThatIsStuck)
{
    const auto stop = [](const Service& service) // at once, before anybody calls it
    { kill(std::stoi(g_subprocess_get_identifier(service.process.get())), SIGSTOP); };
    Service board(KIV_BOARD_DAEMON), manager(KIV_SERVICE_MANAGER), client(KIVCTL " subscribe --kind auth --name a.b");
    const Service modems(KIVCTL " subscribe --kind number_changed --name org.freedesktop.ModemManager1");
    stop(modems);
    // Later than the services, whose names it would own for a moment.
    const Program host(KIVCTL " doctor --fields check,finding --profile host");
    for (const Service* stuck : {&board, &manager, &client})
        stop(*stuck);
    const Program examined(KIVCTL " doctor --fields check,finding"); // its time limits are far below GDBus's
    for (const auto& [receiver, trouble] : std::map<std::string, const char*>{
             {"subscribers", "kivctl: not delivered to a.b: no answer in time\n"}, {"manager", "did not answer in time"}})
    {
        const Outcome sent = Kivctl("notify auth --timeout 0.2 --to " + receiver);
        EXPECT_EQ(3, sent.exit) << receiver;
        EXPECT_THAT(sent.err, HasSubstr(trouble));
    }
    examined.Await("org.tizen.servicemanager.service does not answer");
    host.Await("ModemManager          does not answer: Timeout was reached");
    for (Service* stuck : {&board, &manager, &client})
        g_subprocess_send_signal(stuck->process.get(), SIGCONT);

    const auto answerLate = [](GDBusMessage* call)
    {
        g_usleep(100'000);
        return g_dbus_message_new_method_reply(call);
    };
    const Peer late(bus, "a.late", answerLate);
    Kivctl("subscribers add activated all a.late /a a.b");
    EXPECT_EQ(0, Kivctl("notify activated --timeout 60").exit);
}

TEST_F(KivctlTest, WatchNamesEachChange)
{
    Kivctl("device set -p ./watched runtime.flight-mode=false");
    const Service watch(KIVCTL " watch -p ./watched");
    const std::pair<const char*, const char*> changes[] = {
        {"runtime.flight-mode=true", "flight_mode value=yes\n"},
        {"runtime.packet-data=false", "packet_data value=no\n"},
        {"runtime.wifi-status=2", "wifi_connected value=yes\n"},
        {"runtime.wifi-status=1", "wifi_connected value=no\n"},
        {"runtime.wifi-status=0", "wifi_connected value=no\n"}, // reported once
        {"network.wifi-device=0", "wifi_device value='off'\n"},
        {"network.wifi-device=1", "wifi_device value='on'\n"},
        {"network.wifi-connection=-1", "wifi_connection value='failure'\n"},
        {"network.wifi-connection=1", "wifi_connection value='associating'\n"},
        {"network.wifi-connection=2", "wifi_connection value='configuring'\n"},
        {"network.wifi-connection=3", "wifi_connection value='connected'\n"},
        {"network.wifi-connection=0", "wifi_connection value='disconnected'\n"},
        {"sim1.card-status=4", "card slot=1 old='ready' new='PIN required'\n"},
    };
    for (const auto& [change, line] : changes)
    {
        EXPECT_EQ(0, Kivctl(std::string("device set -p ./watched ") + change).exit);
        watch.Await(line);
    }
    const std::string out = watch.Out(), repeated = "wifi_connected value=no\n";
    EXPECT_EQ(out.find(repeated), out.rfind(repeated));
}

TEST_F(KivctlTest, SubscribesOverTheBusAsInTheFile)
{
    Service service("env KIV_SUBSCRIBERS=" + directory + "/served.db " KIV_SUBSCRIPTION_SERVICE);
    EXPECT_THAT(Steady(Kivctl("doctor").out), HasSubstr("subscription service yes org.kiv.Subscriptions runs"));
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

TEST_F(KivctlTest, DistinguishesAMissingBusFromABrokenStore)
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
    for (const auto& [file, name] :
        {std::pair(KIV_SYSTEM_LIBRARY, "libkiv_system.so"), {KIV_PLATFORM_LIBRARY, "libkiv_platform.so"}})
    {
        const std::string other = name + std::string(".9.9.9");
        std::filesystem::copy_file(file, other);
        std::filesystem::create_symlink(other, name + std::string(".1"));
        EXPECT_THAT(Outcome("env LD_LIBRARY_PATH=. " KIVCTL " doctor").out, HasSubstr(other + " has version 9.9.9"));
    }
    bus.Stop();
    EXPECT_THAT(Steady(Kivctl("doctor --profile nosuch").out), AllOf(HasSubstr("bus no"), HasSubstr("device no")));
    for (const char* arguments : {"device id", "notify --imsi 1 auth-fail", "notify --imsi 1 auth-fail --to manager",
             "push mail --data d --message m", "subscribe --push a", "services"})
        EXPECT_EQ(8, Kivctl(arguments).exit) << arguments;
}

TEST_F(KivctlTest, LimitsTheWaitForABusThatNeverAnswers)
{
    g_autoptr(GSocket) deaf = g_socket_new(G_SOCKET_FAMILY_UNIX, G_SOCKET_TYPE_STREAM, G_SOCKET_PROTOCOL_DEFAULT, nullptr);
    g_autoptr(GSocketAddress) address = g_unix_socket_address_new("deaf");
    ASSERT_TRUE(g_socket_bind(deaf, address, TRUE, nullptr) && g_socket_listen(deaf, nullptr)); // connections are never accepted
    std::list<std::pair<std::string, Program>> programs;
    for (const char* arguments : {"services", "subscribe --push a", "device id", "device --fields serial", "notify --imsi 1 auth",
             "notify --imsi 1 auth --to manager", "push mail --data d --message m", "doctor --fields finding"})
        programs.emplace_back(arguments, "env DBUS_SYSTEM_BUS_ADDRESS=unix:path=deaf " KIVCTL " " + std::string(arguments));
    for (auto& [arguments, program] : programs)
    {
        const int exit = program.End();
        EXPECT_EQ(arguments.find("device --") == 0 ? 0 : arguments.find("doctor") == 0 ? 1 : 9, exit) << arguments;
        EXPECT_THAT(program.Out() + program.Err(), HasSubstr("connecting to the system bus timed out")) << arguments;
    }
}

TEST_F(KivctlTest, EscapesWhatOthersWroteIntoTheStore)
{
    const std::string plain(12, 'p'), forged("\x1b[2J\n\xe2\x80\xae\xff\xc2\x85\"");
    for (const std::string& event : {"push " + plain, std::string("auth all")})
        ASSERT_EQ(0, Kivctl("subscribers add " + event + " a." + plain + " /" + plain + " a." + plain).exit);
    std::string store = Contents("subscribers.db");
    for (size_t at = store.find(plain); at != store.npos; at = store.find(plain))
        store.replace(at, plain.size(), forged);
    std::ofstream("subscribers.db", std::ios::binary) << store;
    for (const char* arguments : {"subscribers list", "subscribers list -t", "subscribers list -j", "doctor", "doctor -t",
             "doctor -j", "notify --imsi 1 auth", "complete-words subscribers remove push ''"})
    {
        const Outcome outcome = Kivctl(arguments);
        const std::string printed = outcome.out + outcome.err;
        for (const char* part : {"\x1b", "\xff", "\xe2\x80\xae", "\xc2\x85", "2J\n"})
            EXPECT_EQ(printed.npos, printed.find(part)) << arguments << "\n" << printed;
        EXPECT_EQ(arguments[0] == 'c', printed.find("[2J") == printed.npos) << arguments << "\n" << printed;
    }
}

} // namespace
} // namespace kiv::test
