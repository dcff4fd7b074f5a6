/// @file
/// A thread with a separate main context, for sources that wait for events.
#ifndef KIV_SOURCES_LOOPTHREAD_H
#define KIV_SOURCES_LOOPTHREAD_H

#include <atomic>
#include <functional>
#include <glib.h>
#include <memory>
#include <thread>
#include <unistd.h>

namespace kiv::platform
{

class LoopThread
{
public:
    /// What the thread does before and after iterating its context, which is its thread-default one. The thread owns the functions
    /// until it ends.
    struct Work
    {
        std::function<void()> setUp;
        std::function<void()> tearDown;
    };
    static std::shared_ptr<LoopThread> Start(Work work);

    /// Ends the thread and waits for its end. Within a callback of the device it does not wait. Must be the last call.
    void End();

    /// False in a child of fork(), which has no copy of the thread.
    bool IsHere() const { return getpid() == process_; }

private:
    const std::unique_ptr<GMainContext, decltype(&g_main_context_unref)> context_{g_main_context_new(), g_main_context_unref};
    const pid_t process_ = getpid();
    std::atomic<bool> ended_{false};
    std::thread thread_;
};

} // namespace kiv::platform

#endif
