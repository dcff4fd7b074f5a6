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

/// Follows the file on a separate thread while it is in use and there is a listener for changes.
class FollowedFile : public Source, public std::enable_shared_from_this<FollowedFile>
{
public:
    /// @param text  the text that the device was read from
    FollowedFile(std::string path, std::string text);

    void Settle() noexcept override;

private:
    std::shared_ptr<LoopThread> Follow();
    bool ReadAgain(FileWatch::Look look);

    const std::string path_;
    std::string text_; ///< the text that the device was last read from; guarded by the lock of the state

    std::mutex reading_;     ///< held while the file is read again, so that an older text never replaces a newer one
    std::string lastReport_; ///< what was wrong when the file was last read again; guarded by `reading_`

    std::mutex mutex_; ///< guards the follower
    std::shared_ptr<LoopThread> follower_;
};

} // namespace kiv::platform

#endif
