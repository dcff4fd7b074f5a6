#include "DADBusManager.h"

#include "Handles.h"
#include "NoThrow.h"
#include "Policy.h"
#include "SharedConnection.h"
#include "Singleton.h"
#include "Subscribers.h"

#include <DADatabaseManager.h>
#include <ResultCode.h>

#include <cstring>
#include <list>
#include <memory>
#include <vector>

using kiv::Place;
using kiv::Reason;
using kiv::Values;

DADBusManager* DADBusManager::__pInstance = nullptr;

DADBusManager* DADBusManager::GetInstance()
{
    return kiv::Singleton(__pInstance, KIV_HERE, "DBusManager() failed.");
}

DADBusManager::DADBusManager() = default;
DADBusManager::~DADBusManager() = default;

GDBusConnection* DADBusManager::InitDbusConnection(int* error)
{
    g_autoptr(GError) failure = nullptr;
    GDBusConnection* const connection = kiv::TakeConnection(&failure);
    if (connection != nullptr)
        return connection;

    KIV_ERROR("GDBusConnection is NULL");
    if (failure == nullptr)
    {
        *error = KIV_RESULT_NO_BUS;
        KIV_ERROR("[dbus] CORE_DBUS_ERROR_CONNECTION_FAIL");
        return nullptr;
    }
    KIV_ERROR("g_bus_get_sync() failed:[%d:%s]", failure->code, Reason(failure));
    if (std::strstr(Reason(failure), "Time") != nullptr)
    {
        *error = KIV_RESULT_BUS_TIMED_OUT;
        KIV_ERROR("[dbus] DBUS_ERROR_CONNECTION_TIME_OUT");
        return nullptr;
    }
    *error = KIV_RESULT_NO_BUS;
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
        *error = KIV_RESULT_NO_REPLY;
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
    *error = KIV_RESULT_NO_REPLY;
    KIV_ERROR("[dbus] CORE_DBUS_ERROR_REPLY_FAIL");
    return nullptr;
}

char* DADBusManager::ParseDeviceUniqueID(GDBusMessage* reply, int* error)
{
    if (g_dbus_message_get_message_type(reply) != G_DBUS_MESSAGE_TYPE_ERROR)
        return g_strdup(g_dbus_message_get_arg0(reply));

    g_autoptr(GError) failure = nullptr;
    if (g_dbus_message_to_gerror(reply, &failure))
        KIV_ERROR("g_dbus_message_to_gerror() failed:[%d:%s]", failure->code, Reason(failure));
    *error = KIV_RESULT_NO_REPLY;
    return nullptr;
}

int DADBusManager::GetDeviceUniqueID(const char*& uniqueId)
{
    KIV_INFO("");
    int code = KIV_RESULT_SUCCESS;
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

/// Returns the body of a type's call to the service manager, floating; null for a type that only subscribers receive.
GVariant* ManagerBody(const kiv::NotificationType& row, const char* imsi, int serviceId, Values policy)
{
    switch (row.body)
    {
    case kiv::Body::Flag:
        return kiv::Tuple({{"imsi", imsi}, row.flag});
    case kiv::Body::Status:
        return kiv::Tuple({{"imsi", imsi}, serviceId, {"status", row.status}});
    case kiv::Body::Policy:
        return kiv::Tuple(policy);
    case kiv::Body::Number:
        break;
    }
    return nullptr;
}

GDBusProxy* MakeServiceManagerProxy(GDBusConnection* connection, GError** error)
{
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
        return KIV_RESULT_INVALID_ARGUMENT;
    }
    const bool isPolicy = type == KIV_NOTI_TYPE_POLICY;
    const Values policy = {{"imsi", imsi}, service_id, {"ServiceStatus", ServiceStatus}, {"PolicyFeature", PolicyFeature},
        {"PolicyVersion", PolicyVersion}, {"PolicyDocURL", PolicyDocURL}};
    if (!kiv::AreUtf8(KIV_HERE, isPolicy ? policy : Values{{"imsi", imsi}}))
        return KIV_RESULT_INVALID_ARGUMENT;

    int code = KIV_RESULT_SUCCESS;
    g_autoptr(GDBusConnection) connection = InitDbusConnection(&code);
    if (connection == nullptr)
    {
        KIV_ERROR("dbus connection error occured");
        return code;
    }
    const kiv::ProxyScope scope;
    g_autoptr(GError) error = nullptr;
    g_autoptr(GDBusProxy) proxy = MakeServiceManagerProxy(connection, &error);
    if (proxy == nullptr)
    {
        KIV_ERROR("Unable to create proxy: %s", Reason(error));
        return KIV_RESULT_NO_PROXY;
    }
    if (isPolicy && !kiv::HavePolicyTexts(KIV_HERE, ServiceStatus, PolicyFeature, PolicyVersion, PolicyDocURL))
        return KIV_RESULT_INVALID_ARGUMENT;
    const kiv::NotificationType* const row = kiv::FindType(type);
    GVariant* const values = row == nullptr ? nullptr : ManagerBody(*row, imsi, service_id, policy);
    if (values == nullptr)
    {
        KIV_ERROR("noti type error [%d]", type);
        return KIV_RESULT_INVALID_ARGUMENT;
    }

    g_autoptr(GVariant) body = g_variant_ref_sink(values); // GDBus frees a floating one when the service manager is not running
    g_autoptr(GVariant) reply =
        g_dbus_proxy_call_sync(proxy, row->event.method, body, G_DBUS_CALL_FLAGS_NONE, G_MAXINT, nullptr, &error);
    if (reply == nullptr)
    {
        KIV_ERROR("no call result: %s", Reason(error));
        return KIV_RESULT_NO_REPLY;
    }
    KIV_INFO("SendNotiToServiceManager end!!");
    return KIV_RESULT_SUCCESS;
}

int DADBusManager::SendPolicyNotification(char* imsi, int service_id, const char* ServiceStatus, const char* PolicyFeature,
    const char* PolicyVersion, const char* PolicyDocURL)
{
    return kiv::Notify(KIV_HERE, kiv::kPolicy, service_id,
        {{"imsi", imsi}, service_id, {"ServiceStatus", ServiceStatus}, {"PolicyFeature", PolicyFeature},
            {"PolicyVersion", PolicyVersion}, {"PolicyDocURL", PolicyDocURL}});
}

int DADBusManager::SendStatusNotification(char* imsi, int service_id, const char* status)
{
    return kiv::Notify(KIV_HERE, kiv::kStatus, service_id, {{"imsi", imsi}, service_id, {"status", status}});
}

int DADBusManager::SendAuthNotification(char* imsi, int flag)
{
    return kiv::Notify(KIV_HERE, kiv::kAuth, 0, {{"imsi", imsi}, flag});
}

int DADBusManager::SendActivatedNotification(char* imsi, int flag)
{
    return kiv::Notify(KIV_HERE, kiv::kActivated, 0, {{"imsi", imsi}, flag});
}

int DADBusManager::SendNumberChangedNotification(
    char* imsi, const char* first, const char* second, const char* third, const char* fourth)
{
    return kiv::Notify(KIV_HERE, kiv::kNumberChanged, 0,
        {{"imsi", imsi}, {"first", first}, {"second", second}, {"third", third}, {"fourth", fourth}});
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

/// The data of one delivery's callbacks: copies of service id, data and message, and the time, in this order.
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
        g_autoptr(GDBusProxy) proxy = G_DBUS_PROXY(source); // the reference from proxy_new_cb()
        g_autoptr(GError) error = nullptr;
        g_autoptr(GVariant) reply = g_dbus_proxy_call_finish(proxy, result, &error);
        if (reply == nullptr)
            KIV_ERROR("g_dbus_proxy_call_finish error (%s)", Reason(error));
        if (error != nullptr)
            KIV_ERROR("g_dbus_proxy_call_finish error (%s)", Reason(error));
    }
    KIV_INFO("end");
}

/// @param source  the proxy to finish; null when there was no connection for one
void proxy_new_cb(GObject* source, GAsyncResult* result, gpointer user_data)
{
    KIV_INFO("begin");
    Delivery delivery(static_cast<GList*>(user_data));
    g_autoptr(GError) error = nullptr;
    g_autoptr(GDBusProxy) proxy = static_cast<GDBusProxy*>(
        source == nullptr ? g_task_propagate_pointer(G_TASK(result), &error) : g_dbus_proxy_new_finish(result, &error));
    if (proxy == nullptr)
    {
        KIV_ERROR("Unable to create proxy: %s", Reason(error));
        return;
    }

    const auto item = [&](guint position) { return static_cast<const char*>(g_list_nth_data(delivery.get(), position)); };
    const gint64 noti_time = *static_cast<const gint64*>(g_list_nth_data(delivery.get(), 3));
    KIV_INFO("service_id (%s), noti_data (%s), noti_msg (%s), noti_time (%lld)", item(0), item(1), item(2),
        static_cast<long long>(noti_time));

    GVariant* const body =
        kiv::StructureArgument({{"service_id", item(0)}, {"noti_data", item(1)}, {"noti_msg", item(2)}, noti_time});
    constexpr int kDefaultTimeout = -1;
    GDBusProxy* const called = static_cast<GDBusProxy*>(g_steal_pointer(&proxy));
    g_dbus_proxy_call(called, "push", body, G_DBUS_CALL_FLAGS_NONE, kDefaultTimeout, nullptr, proxy_call_cb, delivery.release());
    KIV_INFO("end");
}

/// A delivery that waits for the connection.
struct Start
{
    _SubscriberInfo subscriber;
    Delivery delivery;
};
using Push = std::vector<Start>;

/// Starts every delivery of a push on the requested connection.
void connection_cb(GObject*, GAsyncResult* result, gpointer push)
{
    g_autoptr(GError) error = nullptr;
    g_autoptr(GDBusConnection) connection = kiv::FinishConnection(result, &error);
    const std::unique_ptr<Push> starts(static_cast<Push*>(push));
    for (Start& start : *starts)
    {
        if (connection != nullptr && g_dbus_connection_is_closed(connection)) // GDBus would print messages about it
        {
            g_set_error_literal(&error, G_IO_ERROR, G_IO_ERROR_CLOSED, "The connection is closed");
            g_clear_object(&connection);
        }
        GList* const delivery = start.delivery.release();
        if (connection == nullptr)
            g_task_report_error(nullptr, proxy_new_cb, delivery, nullptr, g_error_copy(error));
        else
            g_dbus_proxy_new(connection, G_DBUS_PROXY_FLAGS_NONE, nullptr, start.subscriber.busname.c_str(),
                start.subscriber.objectpath.c_str(), start.subscriber.interface.c_str(), nullptr, proxy_new_cb, delivery);
    }
}

} // namespace

int DADBusManager::DeliverPushMessage(const char* service_id, const char* noti_data, const char* noti_msg, long long noti_time)
{
    KIV_INFO("begin");
    const Values texts = {{"service_id", service_id}, {"noti_data", noti_data}, {"noti_msg", noti_msg}};
    if (!kiv::HaveTexts(KIV_HERE, texts) || !kiv::AreUtf8(KIV_HERE, texts))
        return KIV_RESULT_SUCCESS;

    const Place here = KIV_HERE;
    return kiv::NoThrow<int>(KIV_RESULT_SUCCESS,
        [&]
        {
            DADatabaseManager store;
            std::list<_SubscriberInfo> subscribers;
            store.GetSubscriber("push", service_id, subscribers);

            auto push = std::make_unique<Push>();
            push->reserve(subscribers.size()); // from here on no allocation can throw
            for (_SubscriberInfo& subscriber : subscribers)
            {
                kiv::LogRecord(here, subscriber);
                if (const char* const flaw = kiv::Flaw(subscriber))
                    KIV_ERROR_AT(here, "Unable to create proxy: %s", flaw);
                else
                    push->push_back({std::move(subscriber), MakeDelivery(service_id, noti_data, noti_msg, noti_time)});
            }
            if (!push->empty())
                kiv::RequestConnection(connection_cb, push.release());
            KIV_INFO_AT(here, "end");
            return KIV_RESULT_SUCCESS;
        });
}
