#include "DADBusManager.h"

#include "Handles.h"
#include "Policy.h"
#include "Singleton.h"

#include <DADatabaseManager.h>
#include <DASubscribeDataManager.h>

#include <cstring>
#include <initializer_list>
#include <list>
#include <mutex>

using kiv::Place;

DADBusManager* DADBusManager::__pInstance = nullptr;

namespace
{

enum ResultCode
{
    kSuccess = 0,
    kBusUnreachable = 1,
    kNoReply = 2,
    kBusTimedOut = 3,
    kInvalidArgument = 4,
    kNoProxy = 5
};

/// The reason of a failure in words. GDBus fails without a GError when a name, path or interface can not be one.
const char* Reason(const GError* error)
{
    return error == nullptr || error->message == nullptr ? "no reason given" : error->message;
}

// The connection ---------------------------------------------------------------------------------------------------------------

/// Makes a context the thread's default one for a scope.
class ThreadDefault
{
public:
    explicit ThreadDefault(GMainContext* context) : context_(context) { g_main_context_push_thread_default(context_); }
    ThreadDefault(const ThreadDefault&) = delete;
    ThreadDefault& operator=(const ThreadDefault&) = delete;
    ~ThreadDefault() { g_main_context_pop_thread_default(context_); }

private:
    GMainContext* context_;
};

/// Dispatches what is ready and never waits.
void Drain(GMainContext* context)
{
    while (g_main_context_iteration(context, FALSE))
    {
    }
}

/// A main context for the proxies of one operation: what they leave behind is dispatched here at the end, and the caller's
/// context, which may never be iterated, sees nothing of it.
class OperationContext
{
public:
    OperationContext() : context_(g_main_context_new()) {}
    OperationContext(const OperationContext&) = delete;
    OperationContext& operator=(const OperationContext&) = delete;
    ~OperationContext() { LetGo(); }

    /// Makes it the thread's default one for a scope: for making proxies and calling over them, not for taking the connection,
    /// within which a handler of the agent's may run.
    ThreadDefault Use() const { return ThreadDefault(context_.get()); }

    /// Dispatches what the proxies left behind so far, which may hold the connection.
    void LetGo() const { Drain(context_.get()); }

private:
    kiv::Owned<GMainContext, g_main_context_unref> context_;
};

/// Where the shared connection is made, and the lock under which it is. GDBus tells that a connection closed through a source in
/// the context in which it was made, and until that source has run, the dead connection stays the shared one; so that context
/// lives as long as the process. The lock is recursive for an agent whose own "closed" handler calls the library.
std::recursive_mutex connectLock;
GMainContext* connectContext = nullptr; // made under the lock, and then there for good
gboolean OutliveBus(GSignalInvocationHint* hint, guint count, const GValue* values, gpointer context);

/// The context, made on first use; the lock is held.
GMainContext* ConnectContext()
{
    if (connectContext == nullptr)
    {
        connectContext = g_main_context_new();
        g_type_class_ref(G_TYPE_DBUS_CONNECTION); // which brings its signals into being, and stays
        g_signal_add_emission_hook(g_signal_lookup("closed", G_TYPE_DBUS_CONNECTION), 0, OutliveBus, connectContext, nullptr);
    }
    return connectContext;
}

/// Whether the calling thread is dispatching something of a context.
bool IsDispatching(GMainContext* context)
{
    GSource* const source = g_main_current_source();
    return source != nullptr && g_source_get_context(source) == context;
}

/// Runs before anything else that a closed connection does. One that was made here may have closed before the request for it was
/// told of: it does not end the process either.
gboolean OutliveBus(GSignalInvocationHint*, guint, const GValue* values, gpointer context)
{
    if (IsDispatching(static_cast<GMainContext*>(context)))
        g_dbus_connection_set_exit_on_close(G_DBUS_CONNECTION(g_value_get_object(values)), FALSE);
    return TRUE;
}

/// The shared connection that was seen last, as long as somebody holds it.
GWeakRef lastConnection;

/// Notes a shared connection, and lets the process outlive the bus.
void Adopt(GDBusConnection* connection)
{
    g_dbus_connection_set_exit_on_close(connection, FALSE);
    g_weak_ref_set(&lastConnection, connection);
}

/// The closed connection that outlasted the wait for a new one, as long as somebody holds it.
GWeakRef heldConnection;

/// Whether a connection closed, and may still be let go: GDBus's own thread holds one for a moment after it closed. One whose
/// "closed" handler is running is held until that returns.
bool IsPassing(GDBusConnection* connection)
{
    if (connection == nullptr || !g_dbus_connection_is_closed(connection))
        return false;
    if (IsDispatching(connectContext))
        return false;
    g_autoptr(GObject) held = static_cast<GObject*>(g_weak_ref_get(&heldConnection));
    return held != G_OBJECT(connection);
}

/// Takes what GDBus shares at the moment, a new one where nobody holds any: a new reference, or null and a GError.
GDBusConnection* TakeShared(GError** error)
{
    const std::lock_guard<std::recursive_mutex> lock(connectLock);
    Drain(ConnectContext());
    const ThreadDefault isDefault(ConnectContext());
    GDBusConnection* const connection = g_bus_get_sync(G_BUS_TYPE_SYSTEM, nullptr, error);
    if (connection != nullptr)
        Adopt(connection);
    return connection;
}

/// Takes the process's shared system-bus connection: a new reference, or null and a GError. A connection that closed is left for a
/// new one unless somebody else still holds it; then the closed one comes back.
GDBusConnection* TakeConnection(GError** error)
{
    g_autoptr(GDBusConnection) connection = TakeShared(error);
    constexpr int kTries = 20;
    constexpr gulong kPauseUs = 1000;
    for (int tries = 1; IsPassing(connection); ++tries)
    {
        if (tries == kTries)
        {
            g_weak_ref_set(&heldConnection, connection);
            break;
        }
        g_clear_object(&connection);
        if (tries > 1)
            g_usleep(kPauseUs);
        connection = TakeShared(error);
    }
    return static_cast<GDBusConnection*>(g_steal_pointer(&connection));
}

/// Dispatches what GDBus has to say of the shared connection, unless somebody is at it: for operations that may not wait.
void DrainIfFree()
{
    const std::unique_lock<std::recursive_mutex> lock(connectLock, std::try_to_lock);
    if (lock.owns_lock())
        Drain(ConnectContext());
}

/// The shared connection that was seen last; null when nobody holds it any more.
GDBusConnection* SeenConnection()
{
    return static_cast<GDBusConnection*>(g_weak_ref_get(&lastConnection));
}

/// Whether a proxy can be made on a connection; on a closed one GDBus would print warnings.
bool IsUsable(GDBusConnection* connection, GError** error)
{
    if (!g_dbus_connection_is_closed(connection))
        return true;
    g_set_error_literal(error, G_IO_ERROR, G_IO_ERROR_CLOSED, "The connection is closed");
    return false;
}

// What goes on the bus ---------------------------------------------------------------------------------------------------------

/// One value of a body: a named text or a number.
struct Value
{
    Value(const char* textName, const char* value) : name(textName), text(value) {}
    Value(int value) : number(value) {}
    Value(gint64 value) : number(value), isWide(true) {}

    const char* name = nullptr; ///< null for a number
    const char* text = nullptr;
    gint64 number = 0;
    bool isWide = false; ///< "x" instead of "i"
};
using Values = std::initializer_list<Value>;

/// Whether no text is null; logs the first that is.
bool HaveTexts(const Place& here, Values values)
{
    for (const Value& value : values)
    {
        if (value.name != nullptr && value.text == nullptr)
        {
            KIV_ERROR_AT(here, "%s is null", value.name);
            return false;
        }
    }
    return true;
}

/// Whether every text that is there is valid UTF-8; logs the first that is not. GLib would put a text of its own in its place.
bool AreUtf8(const Place& here, Values values)
{
    for (const Value& value : values)
    {
        if (value.text != nullptr && !g_utf8_validate(value.text, -1, nullptr))
        {
            KIV_ERROR_AT(here, "%s is not valid UTF-8", value.name);
            return false;
        }
    }
    return true;
}

/// The values as a tuple, floating.
GVariant* Tuple(Values values)
{
    GVariantBuilder builder;
    g_variant_builder_init(&builder, G_VARIANT_TYPE_TUPLE);
    for (const Value& value : values)
    {
        if (value.name != nullptr)
            g_variant_builder_add(&builder, "s", value.text);
        else if (value.isWide)
            g_variant_builder_add(&builder, "x", value.number);
        else
            g_variant_builder_add(&builder, "i", static_cast<gint32>(value.number));
    }
    return g_variant_builder_end(&builder);
}

/// The values as the one structure argument that subscribers take, floating.
GVariant* StructureArgument(Values values)
{
    GVariant* const structure = Tuple(values);
    return g_variant_new_tuple(&structure, 1);
}

// Subscribers ------------------------------------------------------------------------------------------------------------------

/// One kind of notification: what the store is asked for, and what is called.
struct Notification
{
    char kind[16];
    char key[4]; ///< empty: the service id
    char method[16];
};

// clang-format off
//                                     kind              key      method
constexpr Notification kPolicy        {"policy",         "",      "policy"};
constexpr Notification kStatus        {"status",         "",      "status"};
constexpr Notification kAuth          {"auth",           "all",   "auth"};
constexpr Notification kActivated     {"activated",      "all",   "activate"};
constexpr Notification kNumberChanged {"number_changed", "all",   "number_change"};
// clang-format on

/// Why a record can not be called, null when it can. GDBus does not tell a malformed record apart, and the bus answers the
/// reserved path and interface, and all that begin with their letters, by closing the connection.
const char* Flaw(const _SubscriberInfo& subscriber)
{
    if (!g_dbus_is_name(subscriber.busname.c_str()))
        return "busname is not a bus name";
    if (!g_variant_is_object_path(subscriber.objectpath.c_str()))
        return "objectpath is not an object path";
    if (!g_dbus_is_interface_name(subscriber.interface.c_str()))
        return "interface is not an interface name";
    if (g_str_has_prefix(subscriber.objectpath.c_str(), "/org/freedesktop/DBus/Local"))
        return "objectpath is reserved";
    if (g_str_has_prefix(subscriber.interface.c_str(), "org.freedesktop.DBus.Local"))
        return "interface is reserved";
    return nullptr;
}

void LogRecord(const Place& here, const _SubscriberInfo& subscriber)
{
    KIV_INFO_AT(here, "busname: %s", subscriber.busname.c_str());
    KIV_INFO_AT(here, "objectpath: %s", subscriber.objectpath.c_str());
    KIV_INFO_AT(here, "interface: %s", subscriber.interface.c_str());
}

/// Whether a proxy can be made for a subscriber.
/// @param connection  the walk's reference to the shared connection; taken here for the first subscriber, and again after it closed
bool IsReachable(const OperationContext& context, GDBusConnection*& connection, const _SubscriberInfo& subscriber, GError** error)
{
    if (const char* const flaw = Flaw(subscriber))
    {
        g_set_error_literal(error, G_IO_ERROR, G_IO_ERROR_INVALID_ARGUMENT, flaw);
        return false;
    }
    if (connection == nullptr || g_dbus_connection_is_closed(connection))
    {
        g_clear_object(&connection);
        context.LetGo();
        connection = TakeConnection(error);
    }
    return connection != nullptr && IsUsable(connection, error);
}

/// Makes the proxy for one subscriber; null and a GError when it can not be made.
GDBusProxy* MakeProxy(const _SubscriberInfo& subscriber, GError** error)
{
    return g_dbus_proxy_new_for_bus_sync(G_BUS_TYPE_SYSTEM, G_DBUS_PROXY_FLAGS_NONE, nullptr, subscriber.busname.c_str(),
        subscriber.objectpath.c_str(), subscriber.interface.c_str(), nullptr, error);
}

/// Calls every subscriber, in order; none stops the walk.
void CallEach(const Place& here, const std::list<_SubscriberInfo>& subscribers, const char* method, GVariant* body)
{
    const OperationContext context;
    g_autoptr(GDBusConnection) connection = nullptr;
    for (const _SubscriberInfo& subscriber : subscribers)
    {
        LogRecord(here, subscriber);
        g_autoptr(GError) error = nullptr;
        const bool isReachable = IsReachable(context, connection, subscriber, &error);
        const ThreadDefault isDefault = context.Use();
        g_autoptr(GDBusProxy) proxy = isReachable ? MakeProxy(subscriber, &error) : nullptr;
        if (proxy == nullptr)
        {
            KIV_ERROR_AT(here, "Unable to create proxy: %s", Reason(error));
            KIV_ERROR_AT(here, " subscriber busname: %s", subscriber.busname.c_str());
            KIV_ERROR_AT(here, " subscriber objectpath: %s", subscriber.objectpath.c_str());
            KIV_ERROR_AT(here, " subscriber interface: %s", subscriber.interface.c_str());
            continue;
        }
        g_autoptr(GVariant) reply = g_dbus_proxy_call_sync(proxy, method, body, G_DBUS_CALL_FLAGS_NONE, G_MAXINT, nullptr, &error);
        if (reply == nullptr)
            KIV_ERROR_AT(here, "no call result: %s", Reason(error));
    }
}

/// Sends one notification to its subscribers.
/// @param values  of the body; the first is the IMSI
int Notify(const Place& here, const Notification& notification, int serviceId, Values values)
{
    KIV_INFO_AT(here, "begin");
    if (values.begin()->text == nullptr)
    {
        KIV_ERROR_AT(here, "IMSI is null");
        return kInvalidArgument;
    }
    if (!HaveTexts(here, values) || !AreUtf8(here, values))
        return kInvalidArgument;

    return kiv::NoThrow<int>(kSuccess,
        [&]
        {
            DASubscribeDataManager store;
            std::list<_SubscriberInfo> subscribers;
            char serviceKey[10] = {}; // as wide as the store's keys: what is longer is asked for by its first nine characters
            g_snprintf(serviceKey, sizeof serviceKey, "%d", serviceId);
            store.GetSubscriber(notification.kind, notification.key[0] == '\0' ? serviceKey : notification.key, subscribers);

            if (!subscribers.empty())
            {
                g_autoptr(GVariant) body = g_variant_ref_sink(StructureArgument(values));
                CallEach(here, subscribers, notification.method, body);
            }
            KIV_INFO_AT(here, "end");
            return kSuccess;
        });
}

} // namespace

DADBusManager* DADBusManager::GetInstance()
{
    return kiv::Singleton(__pInstance, KIV_HERE, "DBusManager() failed.");
}

DADBusManager::DADBusManager() = default;
DADBusManager::~DADBusManager() = default;

GDBusConnection* DADBusManager::InitDbusConnection(int* error)
{
    g_autoptr(GError) failure = nullptr;
    GDBusConnection* const connection = TakeConnection(&failure);
    if (connection != nullptr)
        return connection;

    KIV_ERROR("GDBusConnection is NULL");
    if (failure == nullptr)
    {
        *error = kBusUnreachable;
        KIV_ERROR("[dbus] CORE_DBUS_ERROR_CONNECTION_FAIL");
        return nullptr;
    }
    KIV_ERROR("g_bus_get_sync() failed:[%d:%s]", failure->code, Reason(failure));
    if (std::strstr(Reason(failure), "Time") != nullptr)
    {
        *error = kBusTimedOut;
        KIV_ERROR("[dbus] DBUS_ERROR_CONNECTION_TIME_OUT");
        return nullptr;
    }
    *error = kBusUnreachable;
    KIV_ERROR("[dbus] DBUS_ERROR_CONNECTION_FAIL");
    return nullptr;
}

GDBusMessage* DADBusManager::SendDbusMethodNReceiveDID(GDBusConnection* connection, int* error)
{
    g_autoptr(GDBusMessage) request = g_dbus_message_new_method_call(
        "org.tizen.system.deviced", "/Org/Tizen/System/DeviceD/Board", "org.tizen.system.deviced.Board", "GetSerial");
    if (request == nullptr)
    {
        KIV_ERROR("g_dbus_message_new_method_call err");
        *error = kNoReply;
        return nullptr;
    }

    constexpr int kDefaultTimeout = -1;
    g_autoptr(GError) failure = nullptr;
    GDBusMessage* const reply = g_dbus_connection_send_message_with_reply_sync(
        connection, request, G_DBUS_SEND_MESSAGE_FLAGS_NONE, kDefaultTimeout, nullptr, nullptr, &failure);
    if (reply != nullptr)
        return reply;

    KIV_ERROR("reply is NULL");
    if (failure != nullptr)
        KIV_ERROR("g_dbus_connection_send_message_with_reply_sync() failed:[%d:%s]", failure->code, Reason(failure));
    *error = kNoReply;
    KIV_ERROR("[dbus] CORE_DBUS_ERROR_REPLY_FAIL");
    return nullptr;
}

char* DADBusManager::ParseDeviceUniqueID(GDBusMessage* reply, int* error)
{
    if (g_dbus_message_get_message_type(reply) != G_DBUS_MESSAGE_TYPE_ERROR)
        return g_strdup(g_dbus_message_get_arg0(reply));

    g_autoptr(GError) failure = nullptr;
    if (g_dbus_message_to_gerror(reply, &failure) && failure != nullptr)
        KIV_ERROR("g_dbus_message_to_gerror() failed:[%d:%s]", failure->code, Reason(failure));
    *error = kNoReply;
    return nullptr;
}

int DADBusManager::GetDeviceUniqueID(const char*& uniqueId)
{
    KIV_INFO("");
    int code = kSuccess;
    uniqueId = nullptr;

    g_autoptr(GDBusConnection) connection = InitDbusConnection(&code);
    if (connection == nullptr)
    {
        KIV_ERROR("dbus error occured");
        return code;
    }
    g_autoptr(GDBusMessage) reply = SendDbusMethodNReceiveDID(connection, &code);
    if (reply == nullptr)
        KIV_ERROR("dbus error occured");
    else
        uniqueId = ParseDeviceUniqueID(reply, &code);
    return code;
}

namespace
{

/// What one type says to the service manager; no method for a type that says nothing to it.
struct ManagerCall
{
    const char* method;
    GVariant* body; ///< floating
};

ManagerCall CallOfType(_KIV_NOTI_TYPE_E type, const char* imsi, int serviceId, Values policy)
{
    switch (type)
    {
    case KIV_NOTI_TYPE_AUTH_SUCCESS:
        return {"auth", Tuple({{"imsi", imsi}, 1})};
    case KIV_NOTI_TYPE_AUTH_FAIL:
        return {"auth", Tuple({{"imsi", imsi}, 0})};
    case KIV_NOTI_TYPE_STATUS_ON:
        return {"status", Tuple({{"imsi", imsi}, serviceId, {"status", "on"}})};
    case KIV_NOTI_TYPE_STATUS_OFF:
        return {"status", Tuple({{"imsi", imsi}, serviceId, {"status", "off"}})};
    case KIV_NOTI_TYPE_POLICY:
        return {"policy", Tuple(policy)};
    case KIV_NOTI_TYPE_ACTIVATED:
        return {"activate", Tuple({{"imsi", imsi}, 1})};
    case KIV_NOTI_TYPE_DEACTIVATED:
        return {"activate", Tuple({{"imsi", imsi}, 0})};
    default:
        return {nullptr, nullptr};
    }
}

GDBusProxy* MakeServiceManagerProxy(GDBusConnection* connection, GError** error)
{
    if (!IsUsable(connection, error))
        return nullptr;
    return g_dbus_proxy_new_sync(connection, G_DBUS_PROXY_FLAGS_DO_NOT_AUTO_START, nullptr, "org.tizen.servicemanager.service",
        "/org/tizen/servicemanager", "org.tizen.servicemanager", nullptr, error);
}

} // namespace

int DADBusManager::SendNotiToServiceManager(_KIV_NOTI_TYPE_E type, const char* imsi, int service_id, const char* ServiceStatus,
    const char* PolicyFeature, const char* PolicyVersion, const char* PolicyDocURL)
{
    KIV_INFO("SendNotiToServiceManager start!! [%d]", type);
    if (imsi == nullptr)
    {
        KIV_ERROR("IMSI is null");
        return kInvalidArgument;
    }
    const bool isPolicy = type == KIV_NOTI_TYPE_POLICY;
    const Values policy = {{"imsi", imsi}, service_id, {"ServiceStatus", ServiceStatus}, {"PolicyFeature", PolicyFeature},
        {"PolicyVersion", PolicyVersion}, {"PolicyDocURL", PolicyDocURL}};
    if (!AreUtf8(KIV_HERE, isPolicy ? policy : Values{{"imsi", imsi}}))
        return kInvalidArgument;

    int code = kSuccess;
    g_autoptr(GDBusConnection) connection = InitDbusConnection(&code);
    if (connection == nullptr)
    {
        KIV_ERROR("dbus connection error occured");
        return code;
    }
    const OperationContext context;
    const ThreadDefault isDefault = context.Use();
    g_autoptr(GError) error = nullptr;
    g_autoptr(GDBusProxy) proxy = MakeServiceManagerProxy(connection, &error);
    if (proxy == nullptr)
    {
        KIV_ERROR("Unable to create proxy: %s", Reason(error));
        return kNoProxy;
    }
    if (isPolicy && !kiv::HavePolicyTexts(KIV_HERE, ServiceStatus, PolicyFeature, PolicyVersion, PolicyDocURL))
        return kInvalidArgument;
    const ManagerCall call = CallOfType(type, imsi, service_id, policy);
    if (call.method == nullptr)
    {
        KIV_ERROR("noti type error [%d]", type);
        return kInvalidArgument;
    }

    g_autoptr(GVariant) body = g_variant_ref_sink(call.body); // GDBus drops a floating one when the service manager does not run
    g_autoptr(GVariant) reply = g_dbus_proxy_call_sync(proxy, call.method, body, G_DBUS_CALL_FLAGS_NONE, G_MAXINT, nullptr, &error);
    if (reply == nullptr)
    {
        KIV_ERROR("no call result: %s", Reason(error));
        return kNoReply;
    }
    KIV_INFO("SendNotiToServiceManager end!!");
    return kSuccess;
}

int DADBusManager::SendPolicyNotification(char* imsi, int service_id, const char* ServiceStatus, const char* PolicyFeature,
    const char* PolicyVersion, const char* PolicyDocURL)
{
    return Notify(KIV_HERE, kPolicy, service_id,
        {{"imsi", imsi}, service_id, {"ServiceStatus", ServiceStatus}, {"PolicyFeature", PolicyFeature},
            {"PolicyVersion", PolicyVersion}, {"PolicyDocURL", PolicyDocURL}});
}

int DADBusManager::SendStatusNotification(char* imsi, int service_id, const char* status)
{
    return Notify(KIV_HERE, kStatus, service_id, {{"imsi", imsi}, service_id, {"status", status}});
}

int DADBusManager::SendAuthNotification(char* imsi, int flag)
{
    return Notify(KIV_HERE, kAuth, 0, {{"imsi", imsi}, flag});
}

int DADBusManager::SendActivatedNotification(char* imsi, int flag)
{
    return Notify(KIV_HERE, kActivated, 0, {{"imsi", imsi}, flag});
}

int DADBusManager::SendNumberChangedNotification(
    char* imsi, const char* first, const char* second, const char* third, const char* fourth)
{
    return Notify(
        KIV_HERE, kNumberChanged, 0, {{"imsi", imsi}, {"first", first}, {"second", second}, {"third", third}, {"fourth", fourth}});
}

// Push -------------------------------------------------------------------------------------------------------------------------

namespace
{

void free_user_data(GList* list)
{
    KIV_INFO("begin");
    g_list_free_full(list, g_free);
    KIV_INFO("end");
}

/// What travels with one delivery through its callbacks: copies of service id, data and message, and the time, in this order.
using Delivery = kiv::Owned<GList, free_user_data>;

Delivery MakeDelivery(const char* service_id, const char* noti_data, const char* noti_msg, gint64 noti_time)
{
    GList* items = g_list_append(nullptr, g_strdup(service_id));
    items = g_list_append(items, g_strdup(noti_data));
    items = g_list_append(items, g_strdup(noti_msg));
    return Delivery(g_list_append(items, g_memdup2(&noti_time, sizeof noti_time)));
}

void proxy_call_cb(GObject* source, GAsyncResult* result, gpointer user_data)
{
    KIV_INFO("begin");
    {
        const Delivery delivery(static_cast<GList*>(user_data));
        g_autoptr(GDBusProxy) proxy = G_DBUS_PROXY(source); // the reference that proxy_new_cb() got
        g_autoptr(GError) error = nullptr;
        g_autoptr(GVariant) reply = g_dbus_proxy_call_finish(proxy, result, &error);
        if (reply == nullptr)
            KIV_ERROR("g_dbus_proxy_call_finish error (%s)", Reason(error));
        if (error != nullptr)
            KIV_ERROR("g_dbus_proxy_call_finish error (%s)", Reason(error));
    }
    DrainIfFree(); // the request for the connection holds it until it is told of
    KIV_INFO("end");
}

void proxy_new_cb(GObject*, GAsyncResult* result, gpointer user_data)
{
    KIV_INFO("begin");
    Delivery delivery(static_cast<GList*>(user_data));
    g_autoptr(GError) error = nullptr;
    g_autoptr(GDBusProxy) proxy = g_dbus_proxy_new_for_bus_finish(result, &error);
    if (proxy == nullptr)
    {
        KIV_ERROR("Unable to create proxy: %s", Reason(error));
        delivery.reset();
        DrainIfFree(); // as below: the request may have failed too
        return;
    }
    Adopt(g_dbus_proxy_get_connection(proxy)); // which may have been made for this proxy

    const auto item = [&](guint position) { return static_cast<const char*>(g_list_nth_data(delivery.get(), position)); };
    const gint64 noti_time = *static_cast<const gint64*>(g_list_nth_data(delivery.get(), 3));
    KIV_INFO("service_id (%s), noti_data (%s), noti_msg (%s), noti_time (%lld)", item(0), item(1), item(2),
        static_cast<long long>(noti_time));

    GVariant* const body = StructureArgument({{"service_id", item(0)}, {"noti_data", item(1)}, {"noti_msg", item(2)}, noti_time});
    constexpr int kDefaultTimeout = -1;
    GDBusProxy* const called = static_cast<GDBusProxy*>(g_steal_pointer(&proxy));
    g_dbus_proxy_call(called, "push", body, G_DBUS_CALL_FLAGS_NONE, kDefaultTimeout, nullptr, proxy_call_cb, delivery.release());
    KIV_INFO("end");
}

void connection_cb(GObject*, GAsyncResult* result, gpointer)
{
    g_autoptr(GDBusConnection) connection = g_bus_get_finish(result, nullptr);
    if (connection != nullptr)
        Adopt(connection);
}

/// Asks for the shared connection without waiting for it. One that is not there yet is made in the context where it always is,
/// unless another thread is about to make it at this very moment: then it may be made in the caller's. One that the agent made has
/// to be adopted in the agent's own, before it can close there.
void RequestConnection()
{
    const std::unique_lock<std::recursive_mutex> lock(connectLock, std::try_to_lock);
    if (lock.owns_lock())
    {
        const ThreadDefault isDefault(ConnectContext());
        g_bus_get(G_BUS_TYPE_SYSTEM, nullptr, connection_cb, nullptr);
    }
    g_bus_get(G_BUS_TYPE_SYSTEM, nullptr, connection_cb, nullptr);
}

/// Whether a delivery can be started; asks for the connection where nobody holds one. A record that can not be called never would
/// be called back for, and over a closed connection that somebody still holds GDBus would print warnings.
/// @param connection  receives the shared connection, to be held until the delivery has started: the last reference would take it
///                    along; null when it was asked for
bool PrepareDelivery(const _SubscriberInfo& subscriber, GDBusConnection*& connection, bool& isRequested, GError** error)
{
    if (const char* const flaw = Flaw(subscriber))
    {
        g_set_error_literal(error, G_IO_ERROR, G_IO_ERROR_INVALID_ARGUMENT, flaw);
        return false;
    }
    connection = SeenConnection();
    if (!isRequested && (connection == nullptr || g_dbus_connection_is_closed(connection)))
    {
        g_clear_object(&connection);
        DrainIfFree(); // lets go of a closed one, and tells of one that an earlier push asked for
        connection = SeenConnection();
    }
    if (connection != nullptr)
        return IsUsable(connection, error);
    if (!isRequested)
        RequestConnection();
    isRequested = true;
    return true;
}

} // namespace

int DADBusManager::DeliverPushMessage(const char* service_id, const char* noti_data, const char* noti_msg, long long noti_time)
{
    KIV_INFO("begin");
    const Values texts = {{"service_id", service_id}, {"noti_data", noti_data}, {"noti_msg", noti_msg}};
    if (!HaveTexts(KIV_HERE, texts) || !AreUtf8(KIV_HERE, texts))
        return kSuccess;

    const Place here = KIV_HERE;
    return kiv::NoThrow<int>(kSuccess,
        [&]
        {
            DADatabaseManager store;
            std::list<_SubscriberInfo> subscribers;
            store.GetSubscriber("push", service_id, subscribers);

            bool isRequested = false;
            for (const _SubscriberInfo& subscriber : subscribers)
            {
                LogRecord(here, subscriber);
                g_autoptr(GError) error = nullptr;
                g_autoptr(GDBusConnection) connection = nullptr;
                if (!PrepareDelivery(subscriber, connection, isRequested, &error))
                {
                    KIV_ERROR_AT(here, "Unable to create proxy: %s", Reason(error));
                    continue;
                }
                g_dbus_proxy_new_for_bus(G_BUS_TYPE_SYSTEM, G_DBUS_PROXY_FLAGS_NONE, nullptr, subscriber.busname.c_str(),
                    subscriber.objectpath.c_str(), subscriber.interface.c_str(), nullptr, proxy_new_cb,
                    MakeDelivery(service_id, noti_data, noti_msg, noti_time).release());
            }
            KIV_INFO_AT(here, "end");
            return kSuccess;
        });
}
