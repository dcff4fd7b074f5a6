/// @file
/// Changes of one file, however it is written and whatever symbolic links lead to it.
#ifndef KIV_SOURCES_FILEWATCH_H
#define KIV_SOURCES_FILEWATCH_H

#include <functional>
#include <gio/gio.h>
#include <memory>
#include <string>
#include <vector>

namespace kiv::platform
{

/// Works on one thread, in the main context that is the thread's default where it is made.
class FileWatch
{
public:
    enum class Look
    {
        First,
        Last
    };

    /// @param look  reads the file: once at the start, and after each change. Where it returns false, the file was wrong, perhaps
    ///              because a program is replacing it: then it runs once more a moment later, as Look::Last.
    FileWatch(std::string path, std::function<bool(Look)> look);
    FileWatch(const FileWatch&) = delete;
    FileWatch& operator=(const FileWatch&) = delete;
    ~FileWatch();

private:
    struct Closer
    {
        void operator()(GFileMonitor* monitor) const;
        void operator()(GSource* source) const;
    };

    void Read();
    void Observe();
    static void OnEvent(GFileMonitor* monitor, GFile* file, GFile* other, GFileMonitorEvent event, gpointer self);
    static gboolean ReadLast(gpointer self);

    const std::string path_;
    const std::function<bool(Look)> look_;
    std::vector<std::string> observed_; ///< the file, and each symbolic link on the way to it
    std::vector<std::unique_ptr<GFileMonitor, Closer>> monitors_;
    std::unique_ptr<GSource, Closer> lastLook_;
};

} // namespace kiv::platform

#endif
