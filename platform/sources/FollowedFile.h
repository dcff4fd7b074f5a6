/// @file
/// A device file as the source of the device.
#ifndef KIV_SOURCES_FOLLOWEDFILE_H
#define KIV_SOURCES_FOLLOWEDFILE_H

#include "FileWatch.h"
#include "LoopThread.h"
#include "Source.h"

#include <memory>
#include <mutex>
#include <string>

namespace kiv::platform
{

/// Follows the file on a thread of its own while it is in use and somebody registered for changes.
class FollowedFile : public Source, public std::enable_shared_from_this<FollowedFile>
{
public:
    /// @param text  what the device was read from
    FollowedFile(std::string path, std::string text);

    void Settle() noexcept override;

private:
    std::shared_ptr<LoopThread> Follow();
    bool ReadAgain(FileWatch::Look look);

    const std::string path_;
    std::string text_; ///< what the device was last read from; guarded by the lock of the state

    std::mutex reading_;     ///< held while the file is read again, so that an older text never replaces a newer one
    std::string lastReport_; ///< what was wrong with the file that was read again; guarded by `reading_`

    std::mutex mutex_; ///< guards the follower
    std::shared_ptr<LoopThread> follower_;
};

} // namespace kiv::platform

#endif
