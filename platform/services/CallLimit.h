#ifndef CALLLIMIT_H
#define CALLLIMIT_H

#include <gio/gio.h>

namespace kiv
{

/// Limits the waiting calls of each caller on a connection. Calls that are too many or too large are refused with
/// org.freedesktop.DBus.Error.LimitsExceeded when they arrive, before they are queued.
class CallLimit
{
public:
    static constexpr unsigned kMostWaiting = 100; ///< calls per caller
    static constexpr gsize kMostBytes = 4096;     ///< bytes of a call's arguments

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
