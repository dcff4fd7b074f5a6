/// @file
/// The platform log: named buffers of lines, each with a priority and a tag.
#ifndef KIV_PLATFORM_DLOG_H
#define KIV_PLATFORM_DLOG_H

#include "platform_decls.h"

PLATFORM_BEGIN_DECLS

/// Log buffers.
typedef enum
{
    LOG_ID_MAIN = 0,
    LOG_ID_RADIO = 1,
    LOG_ID_SYSTEM = 2,
    LOG_ID_APPS = 3
} log_id_t;

/// Priorities, least urgent first.
typedef enum
{
    DLOG_VERBOSE = 2,
    DLOG_DEBUG = 3,
    DLOG_INFO = 4,
    DLOG_WARN = 5,
    DLOG_ERROR = 6,
    DLOG_FATAL = 7
} log_priority;

/// Appends one line to a log buffer. The text must contain the newline.
/// @param log_id  a log_id_t
/// @param prio    a log_priority
/// @param tag     name of the writer; borrowed
/// @param fmt     a format as for printf()
/// @return the number of bytes written, or a negative value; callers ignore it
/// Any thread; does not block.
int __dlog_print(log_id_t log_id, int prio, const char* tag, const char* fmt, ...) __attribute__((format(printf, 4, 5)));

PLATFORM_END_DECLS

#endif
