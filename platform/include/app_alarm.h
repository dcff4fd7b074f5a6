/// @file
/// Alarms, and the clock that alarms use.
#ifndef KIV_PLATFORM_APP_ALARM_H
#define KIV_PLATFORM_APP_ALARM_H

#include "platform_decls.h"

PLATFORM_BEGIN_DECLS

struct tm;

/// @param date  receives the broken-down local time; untouched on failure
/// @return 0, else an error code, as after 19 January 2038 on a platform with a 32-bit time_t
/// Any thread.
int alarm_get_current_time(struct tm* date);

PLATFORM_END_DECLS

#endif
