#ifndef DATYPES_H
#define DATYPES_H

#include <DASubscriberInfo.h> // _SubscriberInfo, which the subscriber stores fill

/// Marks what the library exports.
#define KIV_SYSTEM_API __attribute__((visibility("default")))

/// The event that a notification reports. Members refuse other values.
enum _KIV_NOTI_TYPE_E : int
{
    KIV_NOTI_TYPE_AUTH_SUCCESS = 1,  ///< authentication succeeded
    KIV_NOTI_TYPE_AUTH_FAIL = 2,     ///< authentication failed
    KIV_NOTI_TYPE_STATUS_ON = 3,     ///< a service was switched on
    KIV_NOTI_TYPE_STATUS_OFF = 4,    ///< a service was switched off
    KIV_NOTI_TYPE_POLICY = 5,        ///< a service has a new policy
    KIV_NOTI_TYPE_ACTIVATED = 6,     ///< the agent was activated
    KIV_NOTI_TYPE_DEACTIVATED = 7,   ///< the agent was deactivated
    KIV_NOTI_TYPE_NUMBER_CHANGED = 8 ///< the subscriber number changed; for subscribers only
};

#endif
