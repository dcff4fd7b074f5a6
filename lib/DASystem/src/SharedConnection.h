/// @file
/// The only code that takes the connection to the system bus. GDBus shares one connection within the process. While a dead one is
/// still referenced, GDBus continues to share it until the main context in which it was made is iterated.
#ifndef KIV_SHAREDCONNECTION_H
#define KIV_SHAREDCONNECTION_H

#include "Handles.h"

#include <gio/gio.h>

namespace kiv
{

/// Takes a live connection: the shared one, or if that is dead, a private one for the caller.
/// @param error  points to null; receives the reason on failure, that of the shared connection if it failed
/// @return a new reference, or null
///
/// - Once taken, a connection no longer ends the process when it closes, whoever made it.
/// - Nothing is kept between calls, and no lock is held.
/// - A child made by fork, in which GDBus has no thread, fails at once if its parent took a connection.
///
/// Blocks while connecting: at most 25 seconds, but without a time limit on a bus that accepts connections and never answers. Any
/// thread. A new connection belongs to the caller's thread-default main context.
GDBusConnection* TakeConnection(GError** error);

/// Starts to take a connection and returns. The callback runs in the caller's thread-default main context and calls
/// FinishConnection(). Until then, no connection that closes ends the process.
void RequestConnection(GAsyncReadyCallback callback, gpointer data);

/// Returns the outcome of a request; call it once per request. Afterwards the callback sees what was written before the request.
/// @param error  receives the reason of the last attempt on failure
/// @return a new reference, or null
GDBusConnection* FinishConnection(GAsyncResult* result, GError** error);

/// Makes a main context the thread's default for one scope. Proxies made in the scope leave nothing behind in the caller's context,
/// which may never be iterated. Take no connection within the scope.
class ProxyScope
{
public:
    ProxyScope() { g_main_context_push_thread_default(context_.get()); }
    ProxyScope(const ProxyScope&) = delete;
    ProxyScope& operator=(const ProxyScope&) = delete;
    ~ProxyScope()
    {
        while (g_main_context_iteration(context_.get(), FALSE))
        {
        }
        g_main_context_pop_thread_default(context_.get());
    }

private:
    Owned<GMainContext, g_main_context_unref> context_{g_main_context_new()};
};

} // namespace kiv

#endif
