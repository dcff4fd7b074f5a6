// What the library makes of GIO's answers that no real bus gives on demand: two functions of GIO have a double in front of them.
#include "bus/BusTest.h"

namespace
{

struct
{
    const char* refusal = nullptr;         // the message of the error; null: no error is set
    GDBusConnection* connection = nullptr; // the shared one; null: there is none
} gio;

} // namespace

extern "C" GDBusConnection* g_bus_get_sync(GBusType, GCancellable*, GError** error)
{
    if (gio.refusal != nullptr)
        g_set_error_literal(error, G_IO_ERROR, 24, gio.refusal);
    return gio.connection == nullptr ? nullptr : G_DBUS_CONNECTION(g_object_ref(gio.connection));
}

extern "C" GDBusProxy* g_dbus_proxy_new_sync(
    GDBusConnection*, GDBusProxyFlags, GDBusInterfaceInfo*, const gchar*, const gchar*, const gchar*, GCancellable*, GError**)
{
    return nullptr;
}

namespace
{

using namespace kiv::test;
using testing::ElementsAre;

struct ConnectionTrouble : BusTest
{
    ~ConnectionTrouble() override { gio = {}; }
};

TEST_F(ConnectionTrouble, IsATimeOutOnlyWhenTheMessageSaysTime)
{
    const std::tuple<const char*, int, std::vector<std::string>> cases[] = {
        {"Timeout was reached", 3, {"g_bus_get_sync() failed:[24:Timeout was reached]", "[dbus] DBUS_ERROR_CONNECTION_TIME_OUT"}},
        {"the time is over", 1, {"g_bus_get_sync() failed:[24:the time is over]", "[dbus] DBUS_ERROR_CONNECTION_FAIL"}},
        {nullptr, 1, {"[dbus] CORE_DBUS_ERROR_CONNECTION_FAIL"}},
    };
    for (const auto& [message, code, reasons] : cases)
    {
        gio.refusal = message;
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
    }
}

TEST_F(ConnectionTrouble, IsCode5WhenNoProxyComesOverTheConnection)
{
    const Connection agents = bus.Connect();
    g_dbus_connection_set_exit_on_close(agents.get(), TRUE);
    gio.connection = agents.get();
    int error = 77;
    EXPECT_EQ(agents, Connection(manager.InitDbusConnection(&error)));
    EXPECT_EQ(77, error) << "which is left alone";
    EXPECT_FALSE(g_dbus_connection_get_exit_on_close(agents.get()));

    for (const char* const reason : {"no reason given", "The connection is closed"})
    {
        EXPECT_EQ(5, NotifyServiceManager(KIV_NOTI_TYPE_NUMBER_CHANGED)) << "before its type matters";
        EXPECT_THAT(log.TakeErrors(), ElementsAre(Line(std::string("Unable to create proxy: ") + reason)));
        g_dbus_connection_close_sync(agents.get(), nullptr, nullptr);
        IterateUntil([&] { return g_dbus_connection_is_closed(agents.get()) != FALSE; });
    }
}

} // namespace
