/// @file
/// The one place that takes the connection to the system bus. GDBus shares a connection within the process, and goes on sharing one
/// that died until the main context in which it was made has been iterated, as long as anybody holds it.
#ifndef KIV_SHAREDCONNECTION_H
#define KIV_SHAREDCONNECTION_H

#include "Handles.h"

#include <gio/gio.h>

namespace kiv
{

/// Takes a connection that is alive: the shared one, or where that is dead, one for the caller alone.
/// @param error  null before; receives why there is none, from the shared connection if that failed
/// @return a new reference, or null
///
/// - Once taken, no connection ends the process when it ends, whoever made it.
/// - Nothing is kept between calls, and no lock is held.
/// - A child made by fork, in which GDBus has no thread, fails at once if its parent took a connection.
///
/// Blocks while connecting: 25 seconds at most, but without a time limit on a bus that accepts connections and says nothing. Any
/// thread. What is connected belongs to the caller's thread-default main context.
GDBusConnection* TakeConnection(GError** error);

/// Starts the same and returns. The callback runs in the caller's thread-default main context and gets the outcome from
/// FinishConnection(). Until then, no connection in the process ends the process when it ends.
void RequestConnection(GAsyncReadyCallback callback, gpointer data);

/// The outcome of a request, once each; after it, the callback sees what was written before the request.
/// @param error  receives why there is none, from the last try
/// @return a new reference, or null
GDBusConnection* FinishConnection(GAsyncResult* result, GError** error);

/// A main context for the proxies of one scope, in which it is the thread's default: what they leave behind ends with it, and the
/// caller's context, which may never be iterated, sees nothing of it. No connection is to be taken within it.
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
