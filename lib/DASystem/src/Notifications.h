/// @file
/// The notifications: one row per event and one per type. Notifications to subscribers and to the service manager both use these
/// rows.
#ifndef KIV_NOTIFICATIONS_H
#define KIV_NOTIFICATIONS_H

#include <DADBusManager.h>

namespace kiv
{

/// One kind of event: its kind and key in the subscriber store, and the method to call.
struct Notification
{
    char kind[16];
    char key[4]; ///< empty for the service id
    char method[16];
};

// clang-format off
//                                            kind              key      method
inline constexpr Notification kPolicy        {"policy",         "",      "policy"};
inline constexpr Notification kStatus        {"status",         "",      "status"};
inline constexpr Notification kAuth          {"auth",           "all",   "auth"};
inline constexpr Notification kActivated     {"activated",      "all",   "activate"};
inline constexpr Notification kNumberChanged {"number_changed", "all",   "number_change"};
// clang-format on

/// The values that are sent in addition to the IMSI.
enum class Body
{
    Flag,   ///< a number
    Status, ///< the service id and a text
    Policy, ///< the service id and the four texts of a policy
    Number  ///< four texts; only to subscribers
};

/// The event and the values of a notification type.
struct NotificationType
{
    _KIV_NOTI_TYPE_E type;
    Body body;
    const Notification& event;
    int (DADBusManager::*sendFlag)(char*, int); ///< the member that sends a Body::Flag to subscribers
    int flag;                                   ///< for Body::Flag
    char status[4];                             ///< for Body::Status
};

// clang-format off
inline constexpr NotificationType kNotificationTypes[] = {
    // type                        body          event           sendFlag                                 flag  status
    {KIV_NOTI_TYPE_AUTH_SUCCESS,   Body::Flag,   kAuth,          &DADBusManager::SendAuthNotification,      1, ""},
    {KIV_NOTI_TYPE_AUTH_FAIL,      Body::Flag,   kAuth,          &DADBusManager::SendAuthNotification,      0, ""},
    {KIV_NOTI_TYPE_STATUS_ON,      Body::Status, kStatus,        nullptr,                                   0, "on"},
    {KIV_NOTI_TYPE_STATUS_OFF,     Body::Status, kStatus,        nullptr,                                   0, "off"},
    {KIV_NOTI_TYPE_POLICY,         Body::Policy, kPolicy,        nullptr,                                   0, ""},
    {KIV_NOTI_TYPE_ACTIVATED,      Body::Flag,   kActivated,     &DADBusManager::SendActivatedNotification, 1, ""},
    {KIV_NOTI_TYPE_DEACTIVATED,    Body::Flag,   kActivated,     &DADBusManager::SendActivatedNotification, 0, ""},
    {KIV_NOTI_TYPE_NUMBER_CHANGED, Body::Number, kNumberChanged, nullptr,                                   0, ""},
};
// clang-format on

/// Returns the row of a type; null when there is none.
inline const NotificationType* FindType(_KIV_NOTI_TYPE_E type)
{
    for (const NotificationType& row : kNotificationTypes)
    {
        if (row.type == type)
            return &row;
    }
    return nullptr;
}

} // namespace kiv

#endif
