#include "FollowedFile.h"

#include "DeviceFile.h"
#include "Locked.h"
#include "State.h"
#include "dlog.h"

#include <atomic>
#include <exception>
#include <thread>
#include <utility>

namespace kiv::platform
{

namespace
{

using Context = std::unique_ptr<GMainContext, decltype(&g_main_context_unref)>;

} // namespace

// A thread that watches the file until it is told to end.
struct FollowedFile::Follower
{
    const Context context{g_main_context_new(), g_main_context_unref};
    std::atomic<bool> ended{false};
    std::thread thread;
};

FollowedFile::FollowedFile(std::string path, std::string text) : path_(std::move(path)), text_(std::move(text)) {}

void FollowedFile::Settle() noexcept
try
{
    std::shared_ptr<Follower> old;
    {
        const std::lock_guard lock(mutex_);
        const bool wanted = TheState().notifier.HasAny() && Locked(TheState())->source.get() == this;
        if (wanted == (follower_ != nullptr))
            return;
        old = std::exchange(follower_, nullptr);
        if (wanted)
        {
            const auto follower = std::make_shared<Follower>();
            follower->thread = std::thread([source = shared_from_this(), follower] { source->Run(*follower); });
            follower_ = follower;
        }
    }
    if (old == nullptr)
        return;
    old->ended = true;
    g_main_context_wakeup(old->context.get());
    if (Notifier::IsDelivering()) // perhaps on that very thread
        old->thread.detach();
    else
        old->thread.join();
}
catch (const std::exception& error)
{
    __dlog_print(LOG_ID_SYSTEM, DLOG_ERROR, "KIV_PLATFORM", "the device file is not followed: %s\n", error.what());
}

void FollowedFile::OnEvent(GFileMonitor* /*monitor*/, GFile* /*file*/, GFile* /*other*/, GFileMonitorEvent event, gpointer source)
{
    // Comes when a writer has closed the file and after one was renamed over it, and not while it is half written.
    if (event == G_FILE_MONITOR_EVENT_CHANGES_DONE_HINT)
        static_cast<FollowedFile*>(source)->ReadAgain();
}

void FollowedFile::Run(Follower& follower)
{
    g_main_context_push_thread_default(follower.context.get());
    {
        g_autoptr(GFile) file = g_file_new_for_path(path_.c_str());
        g_autoptr(GError) error = nullptr;
        g_autoptr(GFileMonitor) monitor = g_file_monitor_file(file, G_FILE_MONITOR_NONE, nullptr, &error);
        if (monitor != nullptr)
            g_signal_connect(monitor, "changed", G_CALLBACK(OnEvent), this);
        else
            __dlog_print(LOG_ID_SYSTEM, DLOG_ERROR, "KIV_PLATFORM", "%s: not followed: %s\n", path_.c_str(), error->message);

        ReadAgain(); // what changed before the monitor was there
        while (!follower.ended)
            g_main_context_iteration(follower.context.get(), TRUE);
        if (monitor != nullptr)
            g_file_monitor_cancel(monitor);
    }
    g_main_context_pop_thread_default(follower.context.get());
}

void FollowedFile::ReadAgain()
{
    State& state = TheState();
    Changes changes;
    {
        const std::lock_guard reading(reading_);
        try
        {
            std::string text = ReadFile(path_);
            Device next = ReadDevice(text, path_);
            lastReport_.clear();

            const std::lock_guard lock(state.mutex);
            if (state.source.get() != this || text_ == text)
                return;
            for (std::size_t i = 0; i < next.slots.size() && i < state.device.slots.size(); ++i)
                if (next.slots[i].cardStatus == state.device.slots[i].cardStatus)
                    next.slots[i].cardReads = state.device.slots[i].cardReads;
            text_ = std::move(text);
            changes = state.Replace(std::move(next));
        }
        catch (const DeviceFileError& error)
        {
            if (lastReport_ != error.what())
                __dlog_print(LOG_ID_SYSTEM, DLOG_ERROR, "KIV_PLATFORM", "%s\n", error.what());
            lastReport_ = error.what();
        }
    }
    state.notifier.Deliver(changes);
}

} // namespace kiv::platform
