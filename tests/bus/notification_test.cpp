// What goes over the bus for each notification, and what becomes of those that can not be delivered.
#include "bus/BusTest.h"

#include <climits>

namespace
{

using namespace kiv::test;
using namespace std::string_literals;
using testing::AllOf;
using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::StartsWith;

const struct
{
    _KIV_NOTI_TYPE_E type;
    const char* function; // the member that tells subscribers
    const char* question; // what the store is asked
    std::string method, signature, values;
} kEvents[] = {
    {KIV_NOTI_TYPE_AUTH_SUCCESS, "SendAuthNotification", "auth all", "auth", "si", "'450', 1"},
    {KIV_NOTI_TYPE_AUTH_FAIL, "SendAuthNotification", "auth all", "auth", "si", "'450', 0"},
    {KIV_NOTI_TYPE_STATUS_ON, "SendStatusNotification", "status 7", "status", "sis", "'450', 7, 'on'"},
    {KIV_NOTI_TYPE_STATUS_OFF, "SendStatusNotification", "status 7", "status", "sis", "'450', 7, 'off'"},
    {KIV_NOTI_TYPE_POLICY, "SendPolicyNotification", "policy 7", "policy", "sissss", "'450', 7, 'on', 'voice', '1.0', 'url'"},
    {KIV_NOTI_TYPE_ACTIVATED, "SendActivatedNotification", "activated all", "activate", "si", "'450', 1"},
    {KIV_NOTI_TYPE_DEACTIVATED, "SendActivatedNotification", "activated all", "activate", "si", "'450', 0"},
    {KIV_NOTI_TYPE_NUMBER_CHANGED, "SendNumberChangedNotification", "number_changed all", "number_change", "sssss",
        "'450', 'on', 'voice', '1.0', 'url'"},
};

struct Notification : BusTest
{
    static std::string Status(const std::string& values)
    {
        return "/example/client org.example.Client.status ((sis)) (('450', " + values + "),)";
    }

    Peer client{bus, "org.example.Subscriber"}, serviceManager{bus, kServiceManager};
};

TEST_F(Notification, OfEveryTypeReachesASubscriberAsOneStructureAndButForTheNumberTheServiceManagerWithFlatArguments)
{
    Subscribe(client);
    std::vector<std::string> toClient, toManager;
    for (const auto& [type, function, question, method, signature, values] : kEvents)
    {
        EXPECT_EQ(0, NotifySubscribers(type));
        toClient.push_back("/example/client org.example.Client." + method + " ((" + signature + ")) ((" + values + "),)");
        EXPECT_EQ(question, store.asked.back());
        const bool isForManager = type != KIV_NOTI_TYPE_NUMBER_CHANGED;
        EXPECT_EQ(isForManager ? 0 : 4, NotifyServiceManager(type));
        if (isForManager)
            toManager.push_back(
                "/org/tizen/servicemanager org.tizen.servicemanager." + method + " (" + signature + ") (" + values + ")");
        const std::vector<std::string> refused(isForManager ? 0 : 1, Line("noti type error [8]"));
        EXPECT_EQ(refused, log.TakeErrors());
    }
    EXPECT_EQ(toClient, client.Calls());
    EXPECT_EQ(toManager, serviceManager.Calls());
    EXPECT_EQ(std::size(kEvents), store.asked.size());
}

struct RefusedNotification : Notification
{
    ~RefusedNotification() override
    {
        EXPECT_THAT(store.asked, IsEmpty());
        EXPECT_THAT(serviceManager.Calls(), IsEmpty());
    }
};

TEST_F(RefusedNotification, IsOneOfAnUnknownTypeOrWithoutAnImsi)
{
    for (const int type : {-1, 0, 9, INT_MAX})
    {
        const std::string message = "noti type error [" + std::to_string(type) + "]";
        EXPECT_EQ(4, NotifyServiceManager(static_cast<_KIV_NOTI_TYPE_E>(type)));
        EXPECT_EQ(4, NotifySubscribers(static_cast<_KIV_NOTI_TYPE_E>(type)));
        EXPECT_THAT(log.TakeErrors(), ElementsAre(Line(message), "E DASystem.cpp SendNotiToServiceManager > " + message));
    }
    for (const auto& event : kEvents)
    {
        EXPECT_EQ(0, facade.SendNotiToServiceManager(event.type, nullptr, 7, "a", "b", "c", "d"));
        EXPECT_EQ(4, manager.SendNotiToServiceManager(event.type, nullptr, 7, "a", "b", "c", "d"));
        EXPECT_THAT(log.TakeErrors(), ElementsAre(Line("IMSI is null", "E", event.function), Line("IMSI is null")));
    }
}

TEST_F(RefusedNotification, IsAPolicyWithoutOneOfItsFourTexts)
{
    for (int missing = 0; missing < 4; ++missing)
    {
        char text[] = "text";
        char* t[] = {text, text, text, text};
        t[missing] = nullptr;
        g_autofree gchar* message = g_strdup_printf("NULL value: ServiceStatus(%p), PolicyFeature(%p), PolicyVersion(%p), "
                                                    "PolicyDocURL(%p)",
            static_cast<void*>(t[0]), static_cast<void*>(t[1]), static_cast<void*>(t[2]), static_cast<void*>(t[3]));
        EXPECT_EQ(4, facade.SendNotiToServiceManager(KIV_NOTI_TYPE_POLICY, imsi, 7, t[0], t[1], t[2], t[3]));
        EXPECT_EQ(4, manager.SendNotiToServiceManager(KIV_NOTI_TYPE_POLICY, imsi, 7, t[0], t[1], t[2], t[3]));
        EXPECT_EQ(4, manager.SendPolicyNotification(imsi, 7, t[0], t[1], t[2], t[3]));
        EXPECT_THAT(log.TakeErrors(), ElementsAre(std::string("E DASystem.cpp SendNotiToServiceManager > ") + message,
                                          Line(message), StartsWith(Line("", "E", "SendPolicyNotification"))));
    }
}

TEST_F(RefusedNotification, IsOneWithATextThatTheBusCanNotCarry)
{
    constexpr char kBad[] = "caf\xe9";
    char badImsi[] = "4500\xff";
    const std::tuple<const char*, const char*, int> cases[] = {
        {"SendNotiToServiceManager", "imsi",
            manager.SendNotiToServiceManager(KIV_NOTI_TYPE_AUTH_FAIL, badImsi, 7, "a", "b", "c", "d")},
        {"SendNotiToServiceManager", "PolicyDocURL",
            manager.SendNotiToServiceManager(KIV_NOTI_TYPE_POLICY, imsi, 7, "a", "b", "c", kBad)},
        {"SendAuthNotification", "imsi", manager.SendAuthNotification(badImsi, 1)},
        {"SendActivatedNotification", "imsi", manager.SendActivatedNotification(badImsi, 1)},
        {"SendStatusNotification", "status", manager.SendStatusNotification(imsi, 7, nullptr)},
        {"SendStatusNotification", "status", manager.SendStatusNotification(imsi, 7, kBad)},
        {"SendPolicyNotification", "PolicyVersion", manager.SendPolicyNotification(imsi, 7, "a", "b", kBad, "d")},
        {"SendNumberChangedNotification", "first", manager.SendNumberChangedNotification(imsi, nullptr, "b", "c", "d")},
        {"SendNumberChangedNotification", "fourth", manager.SendNumberChangedNotification(imsi, "a", "b", "c", kBad)},
    };
    std::vector<testing::Matcher<std::string>> expected;
    for (const auto& [function, argument, code] : cases)
    {
        EXPECT_EQ(4, code) << function;
        expected.push_back(StartsWith(Line(argument, "E", function)));
    }
    EXPECT_THAT(log.TakeErrors(), ElementsAreArray(expected));
}

TEST_F(Notification, AsksForALongServiceIdByItsFirstNineCharactersAndSendsItWhole)
{
    Subscribe(client);
    for (const auto& [id, question] : {std::pair(999999999, "status 999999999"), {INT_MAX, "status 214748364"},
             {-12345678, "status -12345678"}, {INT_MIN, "status -21474836"}, {0, "status 0"}})
    {
        EXPECT_EQ(0, NotifySubscribers(KIV_NOTI_TYPE_STATUS_ON, id));
        EXPECT_EQ(question, store.asked.back());
        EXPECT_EQ(Status(std::to_string(id) + ", 'on'"), client.Calls().back());
    }
}

TEST_F(Notification, OfSeveralServicesIsOneStatusCallEach)
{
    Subscribe(client);
    int ids[] = {3, 12, 5};
    char on[] = "on", off[] = "off", free[] = "any text";
    char* statuses[] = {on, nullptr, free, off};
    EXPECT_EQ(0, facade.SendMultiOnOffNotiToServiceManager(imsi, 3, ids, statuses));
    EXPECT_THAT(store.asked, ElementsAre("status 3", "status 5"));
    log.Take();
    EXPECT_EQ(0, facade.SendMultiOnOffNotiToServiceManager(imsi, 0, ids, statuses));
    EXPECT_EQ(0, facade.SendMultiOnOffNotiToServiceManager(imsi, -1, ids, statuses));
    EXPECT_EQ(0, facade.SendMultiOnOffNotiToServiceManager(imsi, 1, nullptr, statuses));
    EXPECT_EQ(0, facade.SendMultiOnOffNotiToServiceManager(imsi, 1, ids, nullptr));
    EXPECT_EQ(std::vector<std::string>(4, "E DASystem.cpp SendMultiOnOffNotiToServiceManager > Invalid parameter"), log.Take());
    EXPECT_THAT(client.Calls(), ElementsAre(Status("3, 'on'"), Status("5, 'any text'")));
}

TEST_F(Notification, PassesOverSubscribersThatCanNotBeCalledAreGoneRefuseOrLeaveWithoutAnAnswer)
{
    Peer last(bus), other(bus, "", Peer::Reply("(@as [], 7)")), gone(bus), refusing(bus, "", Peer::Refuse()), leaving(bus);
    leaving.Set(leaving.Leave());
    gone.Close();
    Subscribe(client);
    std::vector<testing::Matcher<std::string>> expectedErrors;
    for (const auto& [record, flaw] : kBadRecords)
    {
        store.records.push_back(record);
        for (const auto& line : NoProxyLines("SendStatusNotification", record))
            expectedErrors.push_back(line);
    }
    for (const Peer* peer : {&gone, &refusing, &leaving, &other, &last})
        Subscribe(*peer);
    const auto noResult = StartsWith(Line("no call result: ", "E", "SendStatusNotification"));
    expectedErrors.insert(expectedErrors.end(), {noResult, AllOf(noResult, HasSubstr("not today")), noResult});

    EXPECT_EQ(0, manager.SendStatusNotification(imsi, 7, "on"));

    EXPECT_THAT(log.TakeErrors(), ElementsAreArray(expectedErrors));
    for (const Peer* peer : {&client, &refusing, &leaving, &other, &last})
        EXPECT_THAT(peer->Calls(), ElementsAre(Status("7, 'on'")));
}

TEST_F(Notification, GoesToWhoOwnsTheNameWhenItsRecordIsReached)
{
    constexpr char kName[] = "org.example.Moving";
    Peer before(bus, kName), after(bus);
    store.records.assign(3, Record(before));
    Subscribe(client);
    int record = 0;
    kiv::sim::SetLogSink(
        [&](const kiv::sim::LogLine& line)
        {
            record += line.text.find("] interface: ") != std::string::npos;
            if (record == 2)
                after.Own(kName);
            if (record == 3)
                after.Close();
        });
    EXPECT_EQ(0, manager.SendStatusNotification(imsi, 7, "on"));
    kiv::sim::SetLogSink(nullptr);
    EXPECT_EQ(4, record);
    for (const Peer* peer : {&before, &after, &client})
        EXPECT_THAT(peer->Calls(), ElementsAre(Status("7, 'on'")));
    EXPECT_THAT(log.TakeErrors(), ElementsAre(StartsWith(Line("no call result: ", "E", "SendStatusNotification"))));
}

TEST_F(Notification, ToTheServiceManagerTellsWhetherItWasAnswered)
{
    serviceManager.Set(Peer::Reply("('no', 13)"));
    EXPECT_EQ(0, NotifyServiceManager(KIV_NOTI_TYPE_ACTIVATED)) << "what stands in the answer does not matter";
    serviceManager.Set(Peer::Refuse());
    EXPECT_EQ(2, NotifyServiceManager(KIV_NOTI_TYPE_ACTIVATED));
    serviceManager.Set(serviceManager.Leave());
    EXPECT_EQ(2, NotifyServiceManager(KIV_NOTI_TYPE_ACTIVATED));
    EXPECT_EQ(2, NotifyServiceManager(KIV_NOTI_TYPE_ACTIVATED)) << "it is not there";
    const auto noResult = StartsWith(Line("no call result: "));
    EXPECT_THAT(log.TakeErrors(), ElementsAre(AllOf(noResult, HasSubstr("not today")), noResult, noResult));
}

TEST_F(BusTest, AsksTheBoardDaemonForTheSerialNumberAfreshEachTime)
{
    const auto ask = [this](int code, const char* expected)
    {
        const char* id = "stale";
        EXPECT_EQ(code, facade.GetDeviceUniqueID(&id));
        EXPECT_STREQ(expected, id);
        g_free(const_cast<char*>(id));
        std::vector<testing::Matcher<std::string>> lines = {Line("", "I", "GetDeviceUniqueID")};
        if (code != 0)
            lines.emplace_back(StartsWith(Line("g_dbus_message_to_gerror() failed:[", "E", "ParseDeviceUniqueID")));
        EXPECT_THAT(log.Take(), ElementsAreArray(lines));
    };
    ask(2, nullptr); // nobody is there
    Peer daemon(bus, kBoardDaemon);
    const std::tuple<Peer::Answer, int, const char*> cases[] = {{Peer::Reply("('R58M123',)"), 0, "R58M123"},
        {Peer::Reply("('', 'more', 7)"), 0, ""}, {Peer::Reply("(7,)"), 0, nullptr}, {Peer::Reply("(['list'],)"), 0, nullptr},
        {Peer::Answer(), 0, nullptr}, {Peer::Refuse(), 2, nullptr}, {daemon.Leave(), 2, nullptr}};
    for (const auto& [answer, code, expected] : cases)
    {
        daemon.Set(answer);
        ask(code, expected);
    }
    EXPECT_EQ(std::vector(std::size(cases), "/Org/Tizen/System/DeviceD/Board org.tizen.system.deviced.Board.GetSerial () ()"s),
        daemon.Calls());
}

} // namespace
