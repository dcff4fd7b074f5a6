/// @file
/// Calling those who subscribed.
#ifndef KIV_SUBSCRIBERS_H
#define KIV_SUBSCRIBERS_H

#include "BusValues.h"
#include "Notifications.h"

#include <DASubscriberInfo.h>

namespace kiv
{

/// Why a record cannot be called, null when it can. GDBus does not tell a malformed record apart, and the bus answers the
/// reserved path and interface, and all that begin with their letters, by closing the connection.
const char* Flaw(const _SubscriberInfo& subscriber);

/// Logs the three fields of a record.
void LogRecord(const Place& here, const _SubscriberInfo& subscriber);

/// Sends one notification to its subscribers, one after the other. One that cannot be reached is logged and passed over.
/// @param values  of the body; the first is the IMSI
/// @return a result code: success, whatever became of the calls, or invalid argument
/// Blocks until the last subscriber answered or left the bus.
int Notify(const Place& here, const Notification& notification, int serviceId, Values values);

} // namespace kiv

#endif
