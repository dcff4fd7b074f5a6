#include "Subscribers.h"

#include "NoThrow.h"
#include "SharedConnection.h"

#include <DASubscribeDataManager.h>
#include <RecordRules.h>
#include <ResultCode.h>

#include <list>

using namespace kiv;

namespace
{

/// Takes a new connection if the present one is closed.
bool IsConnected(GDBusConnection*& connection, GError** error)
{
    if (connection != nullptr && g_dbus_connection_is_closed(connection))
        g_clear_object(&connection);
    if (connection == nullptr)
        connection = TakeConnection(error);
    return connection != nullptr;
}

bool IsCallable(const _SubscriberInfo& subscriber, GError** error)
{
    const char* const flaw = Flaw(subscriber);
    if (flaw != nullptr)
        g_set_error_literal(error, G_IO_ERROR, G_IO_ERROR_INVALID_ARGUMENT, flaw);
    return flaw == nullptr;
}

/// Calls every subscriber in order, and continues after failures.
void CallEach(const Place& here, const std::list<_SubscriberInfo>& subscribers, const char* method, GVariant* body)
{
    g_autoptr(GDBusConnection) connection = nullptr;
    for (const _SubscriberInfo& subscriber : subscribers)
    {
        LogRecord(here, subscriber);
        g_autoptr(GError) error = nullptr;
        const bool isReachable = IsCallable(subscriber, &error) && IsConnected(connection, &error);
        const ProxyScope scope;
        g_autoptr(GDBusProxy) proxy =
            isReachable ? g_dbus_proxy_new_sync(connection, G_DBUS_PROXY_FLAGS_NONE, nullptr, subscriber.busname.c_str(),
                              subscriber.objectpath.c_str(), subscriber.interface.c_str(), nullptr, &error)
                        : nullptr;
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

} // namespace

const char* kiv::Flaw(const _SubscriberInfo& subscriber)
{
    switch (FlawOf(subscriber.busname, subscriber.objectpath, subscriber.interface))
    {
    case RecordFlaw::None:
        return nullptr;
    case RecordFlaw::BusName:
        return "busname is not a bus name";
    case RecordFlaw::ObjectPath:
        return "objectpath is not an object path";
    case RecordFlaw::Interface:
        return "interface is not an interface name";
    case RecordFlaw::ReservedPath:
        return "objectpath is reserved";
    case RecordFlaw::ReservedInterface:
        return "interface is reserved";
    }
    return nullptr;
}

void kiv::LogRecord(const Place& here, const _SubscriberInfo& subscriber)
{
    KIV_INFO_AT(here, "busname: %s", subscriber.busname.c_str());
    KIV_INFO_AT(here, "objectpath: %s", subscriber.objectpath.c_str());
    KIV_INFO_AT(here, "interface: %s", subscriber.interface.c_str());
}

int kiv::Notify(const Place& here, const Notification& notification, int serviceId, Values values)
{
    KIV_INFO_AT(here, "begin");
    if (values.begin()->text == nullptr)
    {
        KIV_ERROR_AT(here, "IMSI is null");
        return KIV_RESULT_INVALID_ARGUMENT;
    }
    if (!HaveTexts(here, values) || !AreUtf8(here, values))
        return KIV_RESULT_INVALID_ARGUMENT;

    return kiv::NoThrow<int>(KIV_RESULT_SUCCESS,
        [&]
        {
            DASubscribeDataManager store;
            std::list<_SubscriberInfo> subscribers;
            char serviceKey[10] = {}; // keys of the store have at most nine characters
            g_snprintf(serviceKey, sizeof serviceKey, "%d", serviceId);
            store.GetSubscriber(notification.kind, notification.key[0] == '\0' ? serviceKey : notification.key, subscribers);

            if (!subscribers.empty())
            {
                g_autoptr(GVariant) body = g_variant_ref_sink(StructureArgument(values));
                CallEach(here, subscribers, notification.method, body);
            }
            KIV_INFO_AT(here, "end");
            return KIV_RESULT_SUCCESS;
        });
}
