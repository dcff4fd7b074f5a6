// The messages of each notification, and notifications that cannot be delivered.
#include "bus/BusTest.h"

#include <climits>

namespace
{

using namespace kiv::test;
using testing::AllOf;
using testing::Each;
using testing::ElementsAre;
using testing::ElementsAreArray;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::SizeIs;
using testing::StartsWith;
using Lines = std::vector<testing::Matcher<std::string>>;

const struct
{
    _KIV_NOTI_TYPE_E type;
    const char* question; // the query to the store
    std::string method, signature, values;
} kEvents[] = {
    {KIV_NOTI_TYPE_AUTH_SUCCESS, "auth all", "auth", "si", "'450', 1"},
    {KIV_NOTI_TYPE_AUTH_FAIL, "auth all", "auth", "si", "'450', 0"},
    {KIV_NOTI_TYPE_STATUS_ON, "status 7", "status", "sis", "'450', 7, 'on'"},
    {KIV_NOTI_TYPE_STATUS_OFF, "status 7", "status", "sis", "'450', 7, 'off'"},
    {KIV_NOTI_TYPE_POLICY, "policy 7", "policy", "sissss", "'450', 7, 'a', 'b', 'c', 'd'"},
    {KIV_NOTI_TYPE_ACTIVATED, "activated all", "activate", "si", "'450', 1"},
    {KIV_NOTI_TYPE_DEACTIVATED, "activated all", "activate", "si", "'450', 0"},
    {KIV_NOTI_TYPE_NUMBER_CHANGED, "number_changed all", "number_change", "sssss", "'450', 'a', 'b', 'c', 'd'"},
};

struct Notification : BusTest
{
    /// The call of a status notification.
    static std::string Status(const std::string& values)
    {
        return "/example/client org.example.Client.status ((sis)) (('450', " + values + "),)";
    }
    static auto StatusError(const std::string& message) { return StartsWith(Line(message, "E", "SendStatusNotification")); }

    void NotifyStatus() { EXPECT_EQ(0, manager.SendStatusNotification(imsi, 7, "on")); }

    Peer client{bus, "org.example.Subscriber"}, serviceManager{bus, kServiceManager};
};

TEST_F(Notification, OfEveryTypeReachesItsReceivers)
{
    Subscribe(client);
    std::vector<std::string> toClient, toManager, questions;
    for (const auto& [type, question, method, signature, values] : kEvents)
    {
        EXPECT_EQ(0, NotifySubscribers(type));
        questions.emplace_back(question);
        toClient.push_back("/example/client org.example.Client." + method + " ((" + signature + ")) ((" + values + "),)");
        if (type == KIV_NOTI_TYPE_NUMBER_CHANGED)
            continue;
        EXPECT_EQ(0, NotifyServiceManager(type));
        toManager.push_back(
            "/org/tizen/servicemanager org.tizen.servicemanager." + method + " (" + signature + ") (" + values + ")");
    }
    EXPECT_EQ(toClient, client.Calls());
    EXPECT_EQ(toManager, serviceManager.Calls());
    EXPECT_EQ(questions, store.asked);
    EXPECT_THAT(log.TakeErrors(), IsEmpty());
}

TEST_F(Notification, IsRefusedWithAnUnknownTypeOrABadText)
{
    constexpr auto kUnknown = static_cast<_KIV_NOTI_TYPE_E>(9);
    char bad[] = "caf\xe9";
    const auto tellManager = [this](_KIV_NOTI_TYPE_E type, const char* who, const char* last = "d")
    { return manager.SendNotiToServiceManager(type, who, 7, "a", "b", "c", last); };
    const std::pair<int, std::string> cases[] = {
        {tellManager(kUnknown, imsi), Line("noti type error [9]")},
        {tellManager(kUnknown, nullptr), Line("IMSI is null")},
        {tellManager(KIV_NOTI_TYPE_NUMBER_CHANGED, imsi), Line("noti type error [8]")},
        {tellManager(KIV_NOTI_TYPE_AUTH_FAIL, bad), Line("imsi is not valid UTF-8")},
        {tellManager(KIV_NOTI_TYPE_POLICY, imsi, bad), Line("PolicyDocURL is not valid UTF-8")},
        {manager.SendAuthNotification(bad, 1), Line("imsi is not valid UTF-8", "E", "SendAuthNotification")},
        {manager.SendActivatedNotification(nullptr, 1), Line("IMSI is null", "E", "SendActivatedNotification")},
        {manager.SendStatusNotification(imsi, 7, nullptr), Line("status is null", "E", "SendStatusNotification")},
        {manager.SendPolicyNotification(imsi, 7, "a", "b", "c", nullptr),
            Line("PolicyDocURL is null", "E", "SendPolicyNotification")},
        {manager.SendNumberChangedNotification(imsi, "a", "b", "c", bad),
            Line("fourth is not valid UTF-8", "E", "SendNumberChangedNotification")},
        {NotifySubscribers(kUnknown), "E DASystem.cpp SendNotiToServiceManager > noti type error [9]"},
    };
    std::vector<std::string> lines;
    for (const auto& [code, line] : cases)
    {
        EXPECT_EQ(4, code) << line;
        lines.push_back(line);
    }
    EXPECT_EQ(lines, log.TakeErrors());
    EXPECT_EQ(0, facade.SendNotiToServiceManager(KIV_NOTI_TYPE_AUTH_FAIL, nullptr, 7, "a", "b", "c", "d"))
        << "the result of the calls is not returned";
    EXPECT_THAT(log.TakeErrors(), ElementsAre(Line("IMSI is null", "E", "SendAuthNotification")));
    EXPECT_THAT(store.asked, IsEmpty());
    EXPECT_THAT(serviceManager.Calls(), IsEmpty());
}

TEST_F(Notification, OfAPolicyIsRefusedWithoutOneOfItsFourTexts)
{
    const std::string names[] = {"ServiceStatus", "PolicyFeature", "PolicyVersion", "PolicyDocURL"};
    for (std::size_t missing = 0; missing < std::size(names); ++missing)
    {
        const char* t[] = {"a", "b", "c", "d"};
        t[missing] = nullptr;
        EXPECT_EQ(4, facade.SendNotiToServiceManager(KIV_NOTI_TYPE_POLICY, imsi, 7, t[0], t[1], t[2], t[3]));
        EXPECT_EQ(4, manager.SendNotiToServiceManager(KIV_NOTI_TYPE_POLICY, imsi, 7, t[0], t[1], t[2], t[3]));
        const auto line = AllOf(HasSubstr("SendNotiToServiceManager > NULL value: "), HasSubstr(names[missing] + "((nil))"));
        EXPECT_THAT(log.TakeErrors(), ElementsAre(line, line));
    }
    EXPECT_THAT(serviceManager.Calls(), IsEmpty());
}

TEST_F(Notification, OfSeveralServicesIsOneStatusCallEach)
{
    Subscribe(client);
    int ids[] = {INT_MAX, 12, INT_MIN};
    char on[] = "on", free[] = "any text";
    char* statuses[] = {on, nullptr, free};
    EXPECT_EQ(0, facade.SendMultiOnOffNotiToServiceManager(imsi, 3, ids, statuses));
    EXPECT_THAT(store.asked, ElementsAre("status 214748364", "status -21474836"));
    EXPECT_THAT(client.Calls(), ElementsAre(Status("2147483647, 'on'"), Status("-2147483648, 'any text'")));
    EXPECT_EQ(0, facade.SendMultiOnOffNotiToServiceManager(imsi, 1, ids, statuses));
    EXPECT_THAT(client.Calls(), SizeIs(3));

    log.Take();
    EXPECT_EQ(0, facade.SendMultiOnOffNotiToServiceManager(imsi, 0, ids, statuses));
    EXPECT_EQ(0, facade.SendMultiOnOffNotiToServiceManager(imsi, 1, nullptr, statuses));
    EXPECT_EQ(0, facade.SendMultiOnOffNotiToServiceManager(imsi, 1, ids, nullptr));
    EXPECT_EQ(std::vector<std::string>(3, "E DASystem.cpp SendMultiOnOffNotiToServiceManager > Invalid parameter"), log.Take());
}

TEST_F(Notification, SkipsSubscribersThatDoNotAnswer)
{
    Peer last(bus), other(bus, "", Peer::Reply("(@as [], 7)")), refusing(bus, "", Peer::Refuse()), leaving(bus);
    leaving.Set(leaving.Leave());
    Lines errors;
    for (const auto& [record, flaw] : kBadRecords)
    {
        store.records.push_back(record);
        for (const std::string& line : {"Unable to create proxy: " + flaw, " subscriber busname: " + record.busname,
                 " subscriber objectpath: " + record.objectpath, " subscriber interface: " + record.interface})
            errors.push_back(StatusError(line));
    }
    store.records.push_back({"org.example.Nobody", "/x", "a.b"});
    for (const Peer* peer : {&refusing, &leaving, &other, &last})
        Subscribe(*peer);
    const auto noResult = StatusError("no call result: ");
    errors.insert(errors.end(), {noResult, AllOf(noResult, HasSubstr("not today")), noResult});

    NotifyStatus();

    EXPECT_THAT(log.TakeErrors(), ElementsAreArray(errors));
    for (const Peer* peer : {&refusing, &leaving, &other, &last})
        EXPECT_THAT(peer->Calls(), ElementsAre(Status("7, 'on'")));
}

TEST_F(Notification, GoesToTheOwnerOfTheNameAtTheMomentOfTheCall)
{
    constexpr char kName[] = "org.example.Moving";
    Peer before(bus, kName), after(bus);
    store.records.assign(3, Record(before));
    int record = 0;
    kiv::platform::SetLogSink(
        [&](const kiv::platform::LogLine& line)
        {
            record += line.text.find("] interface: ") != std::string::npos;
            if (record == 2)
                after.Own(kName);
            if (record == 3)
                after.Close();
        });
    NotifyStatus();
    kiv::platform::SetLogSink(nullptr);
    EXPECT_THAT(before.Calls(), ElementsAre(Status("7, 'on'")));
    EXPECT_EQ(before.Calls(), after.Calls());
    EXPECT_THAT(log.TakeErrors(), ElementsAre(StatusError("no call result: ")));
}

TEST_F(Notification, LogsEachSubscriberThatALostBusLeavesOut)
{
    Peer killing(bus, "", Peer::InsteadDo([this] { bus.Stop(); })), last(bus);
    store.records = {Record(client), Record(killing), Record(last)};
    NotifyStatus();
    EXPECT_THAT(log.TakeErrors(),
        ElementsAre(StatusError("no call result: "), StatusError("Unable to create proxy: "),
            StatusError(" subscriber busname: " + last.Name()), StatusError(" subscriber objectpath: /example/client"),
            StatusError(" subscriber interface: org.example.Client")));
    EXPECT_THAT(client.Calls(), SizeIs(1));
}

TEST_F(Notification, ContinuesOnANewBus)
{
    const auto restart = [this]
    {
        bus.Stop();
        bus.Start();
    };
    Peer killing(bus, "", Peer::InsteadDo(restart));
    store.records.assign(3, Record(killing));
    NotifyStatus();
    // The other two were requested from the new bus, which does not know them.
    EXPECT_THAT(log.TakeErrors(), AllOf(SizeIs(3), Each(StatusError("no call result: "))));
}

TEST_F(Notification, ToTheServiceManagerReturnsWhetherItWasAnswered)
{
    // The content of an answer does not matter. In the last case the service has already left the bus, and is not started.
    const std::tuple<Peer::Answer, int, const char*> cases[] = {{Peer::Reply("('no', 13)"), 0, ""},
        {Peer::Refuse(), 2, "not today"}, {serviceManager.Leave(), 2, ""}, {serviceManager.Leave(), 2, "DO_NOT_AUTO_START"}};
    for (const auto& [answer, code, reason] : cases)
    {
        serviceManager.Set(answer);
        EXPECT_EQ(code, NotifyServiceManager(KIV_NOTI_TYPE_ACTIVATED));
        EXPECT_THAT(log.TakeErrors(),
            AllOf(SizeIs(code == 0 ? 0 : 1), Each(AllOf(StartsWith(Line("no call result: ")), HasSubstr(reason)))));
    }
}

TEST_F(BusTest, RequestsTheSerialNumberOnEachCall)
{
    const auto sent = [](const char* message) { return Line(message, "E", "SendDbusMethodNReceiveDID"); };
    const Lines refused = {
        Line("g_dbus_message_to_gerror() failed:[36:GDBus.Error:org.example.Refused: not today]", "E", "ParseDeviceUniqueID")};
    const Lines failed = {sent("reply is NULL"),
        sent("g_dbus_connection_send_message_with_reply_sync() failed:[18:The connection is closed]"),
        sent("[dbus] CORE_DBUS_ERROR_REPLY_FAIL"), Line("dbus error occured", "E", "GetDeviceUniqueID")};
    const std::tuple<Peer::Answer, int, const char*, Lines> cases[] = {
        {Peer::Reply("('R58M123', 'more')"), 0, "R58M123", {}},
        {Peer::Reply("('',)"), 0, "", {}},
        {Peer::Reply("(7,)"), 0, nullptr, {}},
        {Peer::Answer(), 0, nullptr, {}},
        {Peer::Refuse(), 2, nullptr, refused},
        {Peer::InsteadDo([this] { bus.Stop(); }), 2, nullptr, failed},
    };
    Peer daemon(bus, kBoardDaemon);
    for (const auto& [answer, code, expected, errors] : cases)
    {
        daemon.Set(answer);
        const char* id = "stale";
        EXPECT_EQ(code, facade.GetDeviceUniqueID(&id));
        EXPECT_STREQ(expected, id);
        g_free(const_cast<char*>(id));
        EXPECT_THAT(log.TakeErrors(), ElementsAreArray(errors));
    }
    EXPECT_THAT(daemon.Calls(),
        AllOf(SizeIs(std::size(cases)), Each("/Org/Tizen/System/DeviceD/Board org.tizen.system.deviced.Board.GetSerial () ()")));
}

} // namespace
