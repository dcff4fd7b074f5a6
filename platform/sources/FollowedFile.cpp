#include "FollowedFile.h"

#include "DeviceFile.h"
#include "Locked.h"
#include "Report.h"
#include "State.h"

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
    Report(path_ + ": changes are not noticed: " + error.what());
}

std::shared_ptr<LoopThread> FollowedFile::Follow()
{
    const auto watch = std::make_shared<std::unique_ptr<FileWatch>>();
    const auto setUp = [source = shared_from_this(), watch]
    { *watch = std::make_unique<FileWatch>(source->path_, [source](FileWatch::Look look) { return source->ReadAgain(look); }); };
    return LoopThread::Start({setUp, [watch] { watch->reset(); }});
}

bool FollowedFile::ReadAgain(FileWatch::Look look)
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
                return true;
            for (std::size_t i = 0; i < next.slots.size() && i < state.device.slots.size(); ++i)
                if (next.slots[i].cardStatus == state.device.slots[i].cardStatus)
                    next.slots[i].cardReads = state.device.slots[i].cardReads;
            for (BrokenCall& fault : next.faults)
                for (const BrokenCall& old : state.device.faults)
                    if (fault.call == old.call && fault.number == old.number && fault.code == old.code)
                        fault.seen = old.seen;
            text_ = std::move(text);
            changes = state.Replace(std::move(next));
        }
        catch (const DeviceFileError& error)
        {
            if (look == FileWatch::Look::Last && std::exchange(lastReport_, error.what()) != error.what())
                Report(error.what());
            return false;
        }
    }
    state.notifier.Deliver(changes);
    return true;
}

} // namespace kiv::platform
