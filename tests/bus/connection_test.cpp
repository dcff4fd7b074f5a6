// The library's reaction to answers of GIO that a real bus does not give on demand. Doubles replace three functions of GIO.
#include "bus/BusTest.h"

namespace
{

struct
{
    int code = 0;                          // of the error
    const char* refusal = nullptr;         // its message; null: no error is set
    GDBusConnection* connection = nullptr; // the shared one; null: there is none
    bool closesAtOnce = false;             // before the caller receives it
} gio;

} // namespace

extern "C" GDBusConnection* g_bus_get_sync(GBusType, GCancellable*, GError** error)
{
    if (gio.refusal != nullptr)
        g_set_error_literal(error, G_IO_ERROR, gio.code, gio.refusal);
    if (gio.closesAtOnce)
        g_signal_emit_by_name(gio.connection, "closed", TRUE, nullptr);
    return gio.connection == nullptr ? nullptr : G_DBUS_CONNECTION(g_object_ref(gio.connection));
}

extern "C" GDBusProxy* g_dbus_proxy_new_sync(
    GDBusConnection*, GDBusProxyFlags, GDBusInterfaceInfo*, const gchar*, const gchar*, const gchar*, GCancellable*, GError**)
{
    return nullptr;
}

extern "C" GDBusMessage* g_dbus_message_new_method_call(const gchar*, const gchar*, const gchar*, const gchar*)
{
    return nullptr;
}

namespace
{

using namespace kiv::test;

struct ConnectionTrouble : BusTest
{
    ~ConnectionTrouble() override { gio = {}; }

    int NotifyPolicyWithoutTexts()
    {
        return manager.SendNotiToServiceManager(KIV_NOTI_TYPE_POLICY, imsi, 7, nullptr, nullptr, nullptr, nullptr);
    }
};

TEST_F(ConnectionTrouble, IsATimeoutOnlyWhenTheMessageSaysSo)
{
    const std::tuple<int, const char*, int, std::vector<std::string>> cases[] = {
        {24, "Timeout was reached", 3,
            {"g_bus_get_sync() failed:[24:Timeout was reached]", "[dbus] DBUS_ERROR_CONNECTION_TIME_OUT"}},
        {24, "the time is over", 1, {"g_bus_get_sync() failed:[24:the time is over]", "[dbus] DBUS_ERROR_CONNECTION_FAIL"}},
        {0, nullptr, 1, {"[dbus] CORE_DBUS_ERROR_CONNECTION_FAIL"}},
        {0, "no way", 1, {"g_bus_get_sync() failed:[0:no way]", "[dbus] DBUS_ERROR_CONNECTION_FAIL"}}, // without a bus
    };
    for (const auto& [errorCode, message, code, reasons] : cases)
    {
        gio.code = errorCode;
        gio.refusal = message;
        if (errorCode == 0 && message != nullptr)
            bus.Stop();
        std::vector<std::string> lines = {Line("GDBusConnection is NULL", "E", "InitDbusConnection")};
        for (const std::string& reason : reasons)
            lines.push_back(Line(reason, "E", "InitDbusConnection"));

        lines.push_back(Line("dbus error occured", "E", "GetDeviceUniqueID"));
        const char* id = "stale";
        EXPECT_EQ(code, manager.GetDeviceUniqueID(id));
        EXPECT_EQ(nullptr, id);
        EXPECT_EQ(lines, log.TakeErrors());

        lines.back() = Line("dbus connection error occured");
        EXPECT_EQ(code, NotifyServiceManager(KIV_NOTI_TYPE_NUMBER_CHANGED)) << "before its type matters";
        EXPECT_EQ(lines, log.TakeErrors());
        EXPECT_EQ(code, NotifyPolicyWithoutTexts()) << "before its texts matter";
        EXPECT_EQ(lines, log.TakeErrors());
    }
}

TEST_F(ConnectionTrouble, IsAvoidedByAPrivateConnection)
{
    store.records = {{"org.example.Nobody", "/", "a.b"}};
    const Connection dead = bus.Connect();
    g_dbus_connection_close_sync(dead.get(), nullptr, nullptr);
    gio.refusal = "The connection is closed"; // GDBus repeats it for a connection whose set-up failed
    gio.code = G_IO_ERROR_CLOSED;
    for (GDBusConnection* const shared : {static_cast<GDBusConnection*>(nullptr), dead.get()})
    {
        gio.connection = shared;
        int error = 77;
        const Connection taken(manager.InitDbusConnection(&error));
        ASSERT_NE(nullptr, taken);
        EXPECT_FALSE(g_dbus_connection_is_closed(taken.get()));
        EXPECT_NE(nullptr, g_dbus_connection_get_unique_name(taken.get()));
        EXPECT_EQ(77, error) << "unchanged on success";
        EXPECT_THAT(log.TakeErrors(), testing::IsEmpty());
        EXPECT_EQ(0, manager.SendActivatedNotification(imsi, 1));
        EXPECT_THAT(log.TakeErrors(), testing::Contains(testing::EndsWith("Unable to create proxy: no reason given")))
            << "and nothing of the shared connection";
        gio.refusal = nullptr;
    }
    bus.Stop();
    int error = 0;
    EXPECT_EQ(nullptr, manager.InitDbusConnection(&error));
    EXPECT_EQ(1, error);
    EXPECT_THAT(log.TakeErrors(), testing::Contains(testing::HasSubstr("g_bus_get_sync() failed:[")));
}

TEST_F(ConnectionTrouble, DoesNotEndTheProcessButThatOfAnAgentDoes)
{
    const Connection agents = bus.Connect(), other = bus.Connect();
    gio.connection = agents.get();
    for (const bool closesAtOnce : {true, false})
    {
        g_dbus_connection_set_exit_on_close(agents.get(), TRUE);
        gio.closesAtOnce = closesAtOnce;
        int error = 77;
        EXPECT_EQ(agents, Connection(manager.InitDbusConnection(&error)));
        EXPECT_EQ(77, error) << "unchanged on success";
        EXPECT_FALSE(g_dbus_connection_get_exit_on_close(agents.get()));
    }
    g_dbus_connection_set_exit_on_close(other.get(), TRUE);
    g_signal_emit_by_name(other.get(), "closed", FALSE, nullptr);
    EXPECT_TRUE(g_dbus_connection_get_exit_on_close(other.get()));
}

TEST_F(ConnectionTrouble, IsCode2WithoutARequestAndCode5WithoutAProxy)
{
    const Connection agents = bus.Connect();
    gio.connection = agents.get();
    const char* id = "stale";
    EXPECT_EQ(2, manager.GetDeviceUniqueID(id));
    EXPECT_EQ(nullptr, id);
    EXPECT_THAT(log.TakeErrors(), testing::ElementsAre(Line("g_dbus_message_new_method_call err", "E", "SendDbusMethodNReceiveDID"),
                                      Line("dbus error occured", "E", "GetDeviceUniqueID")));

    for (const int code : {NotifyServiceManager(KIV_NOTI_TYPE_NUMBER_CHANGED), NotifyPolicyWithoutTexts()})
        EXPECT_EQ(5, code) << "before its type or its texts matter";
    EXPECT_EQ(std::vector<std::string>(2, Line("Unable to create proxy: no reason given")), log.TakeErrors());
}

} // namespace
