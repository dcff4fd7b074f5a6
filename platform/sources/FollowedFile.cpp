#include "FollowedFile.h"

#include "DeviceFile.h"
#include "Locked.h"
#include "State.h"
#include "dlog.h"

#include <exception>
#include <utility>

namespace kiv::platform
{

FollowedFile::FollowedFile(std::string path, std::string text) : path_(std::move(path)), text_(std::move(text)) {}

void FollowedFile::Settle() noexcept
try
{
    std::shared_ptr<LoopThread> old;
    {
        const std::lock_guard lock(mutex_);
        const bool wanted = TheState().notifier.HasAny() && Locked(TheState())->source.get() == this;
        if (wanted == (follower_ != nullptr))
            return;
        old = std::exchange(follower_, nullptr);
        if (wanted)
            follower_ = Follow();
    }
    if (old != nullptr)
        old->End();
}
catch (const std::exception& error)
{
    __dlog_print(LOG_ID_SYSTEM, DLOG_ERROR, "KIV_PLATFORM", "the device file is not followed: %s\n", error.what());
}

std::shared_ptr<LoopThread> FollowedFile::Follow()
{
    using Monitor = std::unique_ptr<GFileMonitor, decltype(&g_object_unref)>;
    const auto monitor = std::make_shared<Monitor>(nullptr, g_object_unref);
    const auto setUp = [source = shared_from_this(), monitor]
    {
        g_autoptr(GFile) file = g_file_new_for_path(source->path_.c_str());
        g_autoptr(GError) error = nullptr;
        monitor->reset(g_file_monitor_file(file, G_FILE_MONITOR_NONE, nullptr, &error));
        if (*monitor != nullptr)
            g_signal_connect(monitor->get(), "changed", G_CALLBACK(OnEvent), source.get());
        else
            __dlog_print(
                LOG_ID_SYSTEM, DLOG_ERROR, "KIV_PLATFORM", "%s: not followed: %s\n", source->path_.c_str(), error->message);
        source->ReadAgain(); // what changed before the monitor was there
    };
    const auto tearDown = [monitor]
    {
        if (*monitor != nullptr)
            g_file_monitor_cancel(monitor->get());
        monitor->reset();
    };
    return LoopThread::Start(setUp, tearDown);
}

void FollowedFile::OnEvent(GFileMonitor* /*monitor*/, GFile* /*file*/, GFile* /*other*/, GFileMonitorEvent event, gpointer source)
{
    // Comes when a writer has closed the file and after one was renamed over it, and not while it is half written.
    if (event == G_FILE_MONITOR_EVENT_CHANGES_DONE_HINT)
        static_cast<FollowedFile*>(source)->ReadAgain();
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
