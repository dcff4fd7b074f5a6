#ifndef CALLLIMIT_H
#define CALLLIMIT_H

#include <gio/gio.h>

namespace kiv
{

/// Bounds what the callers of a connection can make wait there: calls that are one too many, or too large, are refused with
/// org.freedesktop.DBus.Error.LimitsExceeded when they arrive, before they take a place in the queue.
class CallLimit
{
public:
    static constexpr unsigned kMostWaiting = 100; ///< calls of one caller
    static constexpr gsize kMostBytes = 4096;     ///< of a call's arguments

    /// @param connection  borrowed; outlives the limit
    explicit CallLimit(GDBusConnection* connection);
    CallLimit(const CallLimit&) = delete;
    CallLimit& operator=(const CallLimit&) = delete;
    ~CallLimit();

private:
    GDBusConnection* connection_;
    guint filter_;
};

} // namespace kiv

#endif
