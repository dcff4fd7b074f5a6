/// @file
/// Writes lines to the platform log, each with a file, a member and a source line.
#ifndef KIV_LOG_H
#define KIV_LOG_H

#include <dlog.h>

namespace kiv
{

/// The origin of a log line. A function that works for a member receives the member's place and logs in its name.
struct Place
{
    const char* file;     ///< base name of the source file
    const char* function; ///< bare name of the member
    int line;
};

} // namespace kiv

/// The place of the line that contains the macro; the compiler finds the base name.
#define KIV_HERE (::kiv::Place{__builtin_strrchr("/" __FILE__, '/') + 1, __func__, __LINE__})

/// Logs an error or information line: a printf format without the final newline, and at most five values.
#define KIV_ERROR(...) KIV_LOG(DLOG_ERROR, "Error", KIV_HERE, __VA_ARGS__)
#define KIV_INFO(...) KIV_LOG(DLOG_INFO, "Info", KIV_HERE, __VA_ARGS__)
#define KIV_ERROR_AT(place, ...) KIV_LOG(DLOG_ERROR, "Error", place, __VA_ARGS__)
#define KIV_INFO_AT(place, ...) KIV_LOG(DLOG_INFO, "Info", place, __VA_ARGS__)

// Standard C++17 cannot drop the comma after a format without values, so the number of arguments selects the macro.
#define KIV_LOG(priority, label, place, ...)                                                                                       \
    KIV_PICK(__VA_ARGS__, KIV_LOG_VALUES, KIV_LOG_VALUES, KIV_LOG_VALUES, KIV_LOG_VALUES, KIV_LOG_VALUES, KIV_LOG_TEXT, 0)         \
    (priority, label, place, __VA_ARGS__)
#define KIV_PICK(a, b, c, d, e, f, picked, ...) picked
#define KIV_LOG_TEXT(priority, label, place, text)                                                                                 \
    static_cast<void>(__dlog_print(LOG_ID_SYSTEM, priority, "KIV_AGENT", "%s: %s(%d) > [*" label "*] " text "\n", (place).file,    \
        (place).function, (place).line))
#define KIV_LOG_VALUES(priority, label, place, format, ...)                                                                        \
    static_cast<void>(__dlog_print(LOG_ID_SYSTEM, priority, "KIV_AGENT", "%s: %s(%d) > [*" label "*] " format "\n", (place).file,  \
        (place).function, (place).line, __VA_ARGS__))

#endif
