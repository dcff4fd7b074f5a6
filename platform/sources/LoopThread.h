/// @file
/// A thread with a main context of its own, for sources that wait for events.
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
    /// Starts a thread that runs `setUp`, then iterates its context, which is its thread-default one, until End(), then runs
    /// `tearDown`. What the functions hold lives until the thread is gone.
    static std::shared_ptr<LoopThread> Start(std::function<void()> setUp, std::function<void()> tearDown);

    /// Ends the thread and waits until it is gone; within a callback of the device it does not wait. The last call.
    void End();

    /// Has the thread run the function, soon. Any thread.
    void Invoke(std::function<void()> work);

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
