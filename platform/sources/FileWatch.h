/// @file
/// Reports changes of one file, whether it is written in place or replaced, also through symbolic links.
#ifndef KIV_SOURCES_FILEWATCH_H
#define KIV_SOURCES_FILEWATCH_H

#include <functional>
#include <gio/gio.h>
#include <memory>
#include <string>
#include <vector>

namespace kiv::platform
{

/// Works on the thread that creates it, in the thread-default main context.
class FileWatch
{
public:
    enum class Look
    {
        First,
        Last
    };

    /// @param look  reads the file: once at the start, and after each change. It returns false when the file is wrong. As a
    ///              program may be replacing the file then, it is called once more a moment later, with Look::Last.
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
