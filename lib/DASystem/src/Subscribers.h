/// @file
/// Calls the subscribers of an event.
#ifndef KIV_SUBSCRIBERS_H
#define KIV_SUBSCRIBERS_H

#include "BusValues.h"
#include "Notifications.h"

#include <DASubscriberInfo.h>

namespace kiv
{

/// Returns why a record cannot be called, or null when it can. See FlawOf().
const char* Flaw(const _SubscriberInfo& subscriber);

/// Logs the three fields of a record.
void LogRecord(const Place& here, const _SubscriberInfo& subscriber);

/// Sends one notification to its subscribers, one after the other. A subscriber that cannot be reached is logged and skipped.
/// @param values  of the body; the first is the IMSI
/// @return KIV_RESULT_SUCCESS, even if calls failed, or KIV_RESULT_INVALID_ARGUMENT
/// Blocks until the last subscriber has answered or left the bus.
int Notify(const Place& here, const Notification& notification, int serviceId, Values values);

} // namespace kiv

#endif
