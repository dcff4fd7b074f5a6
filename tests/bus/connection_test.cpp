// What the library makes of GIO's answers that no real bus gives on demand: two functions of GIO have a double in front of them.
#include "bus/BusTest.h"

#include <dlfcn.h>

namespace
{

/// What the doubles do; each does what GIO does unless told otherwise.
struct
{
    bool connects = true;
    const char* refusal = nullptr;         // the message of the error; null: no error is set
    GDBusConnection* connection = nullptr; // handed out instead of the shared one
    bool makesProxies = true;
    int proxyFlags = 0; // of the last one
} gio;

template <class Function>
Function* Real(const char* name)
{
    return reinterpret_cast<Function*>(dlsym(RTLD_NEXT, name));
}

} // namespace

extern "C" GDBusConnection* g_bus_get_sync(GBusType type, GCancellable* cancellable, GError** error)
{
    if (!gio.connects && gio.refusal != nullptr)
        g_set_error_literal(error, G_IO_ERROR, 24, gio.refusal);
    if (!gio.connects)
        return nullptr;
    if (gio.connection != nullptr)
        return G_DBUS_CONNECTION(g_object_ref(gio.connection));
    return Real<decltype(g_bus_get_sync)>("g_bus_get_sync")(type, cancellable, error);
}

extern "C" GDBusProxy* g_dbus_proxy_new_sync(GDBusConnection* connection, GDBusProxyFlags flags, GDBusInterfaceInfo* info,
    const gchar* name, const gchar* path, const gchar* interface, GCancellable* cancellable, GError** error)
{
    gio.proxyFlags = flags;
    return !gio.makesProxies ? nullptr
                             : Real<decltype(g_dbus_proxy_new_sync)>("g_dbus_proxy_new_sync")(
                                   connection, flags, info, name, path, interface, cancellable, error);
}

namespace
{

using namespace kiv::test;
using testing::ElementsAre;
using testing::MatchesRegex;

struct ConnectionTrouble : BusTest
{
    ~ConnectionTrouble() override { gio = {}; }
};

TEST_F(ConnectionTrouble, IsATimeOutWhenTheMessageSaysTimeAndUnreachableElse)
{
    const std::tuple<const char*, int, std::vector<std::string>> cases[] = {
        {"Timeout was reached", 3, {"g_bus_get_sync() failed:[24:Timeout was reached]", "[dbus] DBUS_ERROR_CONNECTION_TIME_OUT"}},
        {"the time is over", 1, {"g_bus_get_sync() failed:[24:the time is over]", "[dbus] DBUS_ERROR_CONNECTION_FAIL"}},
        {nullptr, 1, {"[dbus] CORE_DBUS_ERROR_CONNECTION_FAIL"}},
    };
    gio.connects = false;
    for (const auto& [message, code, lines] : cases)
    {
        gio.refusal = message;
        std::vector<std::string> expected = {"GDBusConnection is NULL"};
        expected.insert(expected.end(), lines.begin(), lines.end());
        for (auto& line : expected)
            line = Line(line, "E", "InitDbusConnection");

        int error = 77;
        EXPECT_EQ(nullptr, manager.InitDbusConnection(&error));
        EXPECT_EQ(code, error);
        EXPECT_EQ(expected, log.Take());

        const char* id = "stale";
        EXPECT_EQ(code, manager.GetDeviceUniqueID(id));
        EXPECT_EQ(nullptr, id);
        auto queryLines = expected;
        queryLines.push_back(Line("dbus error occured", "E", "GetDeviceUniqueID"));
        EXPECT_EQ(queryLines, log.TakeErrors());

        expected.push_back(Line("dbus connection error occured"));
        for (const auto type : {KIV_NOTI_TYPE_STATUS_ON, static_cast<_KIV_NOTI_TYPE_E>(9)})
        {
            EXPECT_EQ(code, NotifyServiceManager(type));
            EXPECT_EQ(expected, log.TakeErrors());
        }
    }
}

TEST_F(ConnectionTrouble, LeavesTheErrorAloneWhenThereIsNoneAndDoesNotEndTheProcessWhoeverConnectedFirst)
{
    const Connection agents(g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, nullptr));
    g_dbus_connection_set_exit_on_close(agents.get(), TRUE);
    int error = 77;
    const Connection connection(manager.InitDbusConnection(&error));
    EXPECT_EQ(agents, connection);
    EXPECT_EQ(77, error);
    EXPECT_FALSE(g_dbus_connection_get_exit_on_close(agents.get()));
}

TEST_F(ConnectionTrouble, IsCode5WhenNoProxyComesWhichIsNeverToStartTheServiceManager)
{
    const Connection closed = bus.Connect();
    g_dbus_connection_close_sync(closed.get(), nullptr, nullptr);
    for (GDBusConnection* const connection : {static_cast<GDBusConnection*>(nullptr), closed.get()})
    {
        gio.makesProxies = connection != nullptr;
        gio.connection = connection; // the shared one may have closed since it was handed out
        EXPECT_EQ(5, NotifyServiceManager(KIV_NOTI_TYPE_NUMBER_CHANGED));
        EXPECT_THAT(log.TakeErrors(), ElementsAre(MatchesRegex(Line("Unable to create proxy: .+"))));
    }
    EXPECT_EQ(G_DBUS_PROXY_FLAGS_DO_NOT_AUTO_START, gio.proxyFlags);
}

} // namespace
