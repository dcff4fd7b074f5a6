#include "Locked.h"
#include "State.h"
#include "dlog.h"

#include <atomic>
#include <gio/gio.h>
#include <memory>
#include <mutex>
#include <string>
#include <thread>
#include <utility>

namespace kiv::platform
{

namespace
{

using Context = std::unique_ptr<GMainContext, decltype(&g_main_context_unref)>;

// A thread that watches one file until it is told to end.
struct Follower
{
    explicit Follower(std::string file) : path(std::move(file)), context(g_main_context_new(), g_main_context_unref) {}

    const std::string path;
    const Context context;
    std::atomic<bool> ended{false};
    std::thread thread;
};

void OnEvent(GFileMonitor* /*monitor*/, GFile* /*file*/, GFile* /*other*/, GFileMonitorEvent event, gpointer follower)
{
    // Comes when a writer has closed the file and after one was renamed over it, and not while it is half written.
    if (event == G_FILE_MONITOR_EVENT_CHANGES_DONE_HINT)
        ReadAgain(static_cast<Follower*>(follower)->path);
}

void Run(Follower& follower)
{
    g_main_context_push_thread_default(follower.context.get());
    {
        g_autoptr(GFile) file = g_file_new_for_path(follower.path.c_str());
        g_autoptr(GError) error = nullptr;
        g_autoptr(GFileMonitor) monitor = g_file_monitor_file(file, G_FILE_MONITOR_NONE, nullptr, &error);
        if (monitor)
            g_signal_connect(monitor, "changed", G_CALLBACK(OnEvent), &follower);
        else
            __dlog_print(
                LOG_ID_SYSTEM, DLOG_ERROR, "KIV_PLATFORM", "%s: not followed: %s\n", follower.path.c_str(), error->message);

        ReadAgain(follower.path); // what changed before the monitor was there
        while (!follower.ended)
            g_main_context_iteration(follower.context.get(), TRUE);
        if (monitor)
            g_file_monitor_cancel(monitor);
    }
    g_main_context_pop_thread_default(follower.context.get());
}

std::shared_ptr<Follower> StartFollower(const std::string& path)
{
    auto follower = std::make_shared<Follower>(path);
    follower->thread = std::thread([follower] { Run(*follower); });
    return follower;
}

void End(Follower& follower)
{
    follower.ended = true;
    g_main_context_wakeup(follower.context.get());
    if (Notifier::IsDelivering()) // perhaps on that very thread
        follower.thread.detach();
    else
        follower.thread.join();
}

} // namespace

void FollowFile() noexcept
try
{
    static std::mutex mutex;
    static std::shared_ptr<Follower>& current = *new std::shared_ptr<Follower>;

    std::shared_ptr<Follower> old;
    {
        const std::lock_guard lock(mutex);
        const std::string path = TheState().notifier.HasAny() ? Locked(TheState())->path : "";
        if (path == (current ? current->path : ""))
            return;
        old = std::exchange(current, nullptr);
        if (!path.empty())
            current = StartFollower(path);
    }
    if (old)
        End(*old);
}
catch (const std::exception& error)
{
    __dlog_print(LOG_ID_SYSTEM, DLOG_ERROR, "KIV_PLATFORM", "the device file is not followed: %s\n", error.what());
}

} // namespace kiv::platform
