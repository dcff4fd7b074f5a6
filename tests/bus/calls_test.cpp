// Time limits and flags of every call on the bus, and the number of proxies. Doubles replace functions of GIO; they record their
// arguments and pass them on.
#include "bus/BusTest.h"

#include <climits>
#include <dlfcn.h>

namespace
{

std::mutex mutex;
std::vector<std::string> noted;
std::function<void(GDBusConnection*)> afterProxy; // runs after a proxy was requested

void Note(const char* what, int flags, int timeout)
{
    const std::lock_guard lock(mutex);
    noted.push_back(what + (" flags " + std::to_string(flags)) + " timeout " + std::to_string(timeout));
}

template <class Function>
Function Real(Function, const char* name)
{
    return reinterpret_cast<Function>(dlsym(RTLD_NEXT, name));
}

} // namespace

#define KIV_REAL(function) Real(&(function), #function)

extern "C" GDBusProxy* g_dbus_proxy_new_sync(GDBusConnection* connection, GDBusProxyFlags flags, GDBusInterfaceInfo* info,
    const gchar* name, const gchar* path, const gchar* interface, GCancellable* cancellable, GError** error)
{
    Note("proxy", flags, 0);
    return KIV_REAL(g_dbus_proxy_new_sync)(connection, flags, info, name, path, interface, cancellable, error);
}

extern "C" void g_dbus_proxy_new(GDBusConnection* connection, GDBusProxyFlags flags, GDBusInterfaceInfo* info, const gchar* name,
    const gchar* path, const gchar* interface, GCancellable* cancellable, GAsyncReadyCallback callback, gpointer data)
{
    Note("proxy", flags, 0);
    KIV_REAL(g_dbus_proxy_new)(connection, flags, info, name, path, interface, cancellable, callback, data);
    if (afterProxy)
        afterProxy(connection);
}

extern "C" GVariant* g_dbus_proxy_call_sync(GDBusProxy* proxy, const gchar* method, GVariant* body, GDBusCallFlags flags,
    gint timeout, GCancellable* cancellable, GError** error)
{
    Note(method, flags, timeout);
    return KIV_REAL(g_dbus_proxy_call_sync)(proxy, method, body, flags, timeout, cancellable, error);
}

extern "C" void g_dbus_proxy_call(GDBusProxy* proxy, const gchar* method, GVariant* body, GDBusCallFlags flags, gint timeout,
    GCancellable* cancellable, GAsyncReadyCallback callback, gpointer data)
{
    Note(method, flags, timeout);
    KIV_REAL(g_dbus_proxy_call)(proxy, method, body, flags, timeout, cancellable, callback, data);
}

extern "C" GDBusMessage* g_dbus_connection_send_message_with_reply_sync(GDBusConnection* connection, GDBusMessage* message,
    GDBusSendMessageFlags flags, gint timeout, volatile guint32* serial, GCancellable* cancellable, GError** error)
{
    Note(g_dbus_message_get_member(message), flags, timeout);
    return KIV_REAL(g_dbus_connection_send_message_with_reply_sync)(
        connection, message, flags, timeout, serial, cancellable, error);
}

namespace
{

using namespace kiv::test;
using testing::AllOf;
using testing::Each;
using testing::HasSubstr;
using testing::SizeIs;

struct Calls : BusTest
{
    ~Calls() override { afterProxy = nullptr; }

    static std::vector<std::string> Taken() { return std::exchange(noted, {}); }
};

TEST_F(Calls, HaveTheirTimeLimitsAndFlags)
{
    Peer client(bus), daemon(bus, kBoardDaemon, Peer::Reply("('KIV1',)")), serviceManager(bus, kServiceManager);
    Subscribe(client);
    const char* id = nullptr;
    EXPECT_EQ(0, manager.GetDeviceUniqueID(id));
    g_free(const_cast<char*>(id));
    EXPECT_EQ(std::vector<std::string>{"GetSerial flags 0 timeout -1"}, Taken());

    const auto forGood = " flags 0 timeout " + std::to_string(INT_MAX);
    for (int type = KIV_NOTI_TYPE_AUTH_SUCCESS; type <= KIV_NOTI_TYPE_NUMBER_CHANGED; ++type)
    {
        NotifySubscribers(static_cast<_KIV_NOTI_TYPE_E>(type));
        const std::vector<std::string> toSubscriber = Taken();
        ASSERT_THAT(toSubscriber, SizeIs(2)) << type;
        EXPECT_EQ("proxy flags 0 timeout 0", toSubscriber[0]);
        EXPECT_THAT(toSubscriber[1], HasSubstr(forGood));
        if (type == KIV_NOTI_TYPE_NUMBER_CHANGED)
            continue;
        NotifyServiceManager(static_cast<_KIV_NOTI_TYPE_E>(type));
        const std::vector<std::string> toManager = Taken();
        ASSERT_THAT(toManager, SizeIs(2)) << type;
        EXPECT_EQ("proxy flags 4 timeout 0", toManager[0]);
        EXPECT_THAT(toManager[1], HasSubstr(forGood));
    }

    EXPECT_EQ(0, manager.DeliverPushMessage("7", "data", "message", 1));
    Settle();
    EXPECT_EQ((std::vector<std::string>{"proxy flags 0 timeout 0", "push flags 0 timeout -1"}), Taken());
}

TEST_F(Calls, OfAPushAreNotStartedOverAConnectionThatDied)
{
    store.records.assign(3, {"org.example.Nobody", "/", "a.b"});
    afterProxy = [this](GDBusConnection* connection)
    {
        bus.Stop();
        while (!g_dbus_connection_is_closed(connection))
            g_usleep(1000);
    };
    EXPECT_EQ(0, manager.DeliverPushMessage("7", "data", "message", 1));
    Settle();
    EXPECT_THAT(Taken(), SizeIs(1)) << "and no more proxies";
    const auto noProxy = HasSubstr("proxy_new_cb > Unable to create proxy: ");
    EXPECT_THAT(log.TakeErrors(), AllOf(SizeIs(3), Each(noProxy)));
}

} // namespace
