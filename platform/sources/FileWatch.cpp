#include "FileWatch.h"

#include "Report.h"

#include <filesystem>
#include <system_error>
#include <utility>

namespace kiv::platform
{

namespace
{

namespace fs = std::filesystem;

constexpr guint kPatienceMs = 300; ///< how long a program may take to replace the file
constexpr int kMostLinks = 40;     ///< as many as the kernel follows

/// Each symbolic link on the way to the file, and then the file itself. When one of them is replaced, the file is a different one.
std::vector<std::string> PathsTo(const std::string& path)
{
    std::vector<std::string> paths;
    std::error_code error; // a path that cannot be read is not a link
    fs::path whole = fs::absolute(path, error);
    while (paths.size() < kMostLinks)
    {
        fs::path walked;
        auto part = whole.begin();
        while (part != whole.end() && !fs::is_symlink(walked / *part, error))
            walked /= *part++;
        if (part == whole.end())
            break;
        paths.push_back((walked / *part).string());
        fs::path target = walked / fs::read_symlink(paths.back(), error);
        while (++part != whole.end())
            target /= *part;
        whole = std::move(target);
    }
    paths.push_back(whole.string());
    return paths;
}

} // namespace

void FileWatch::Closer::operator()(GFileMonitor* monitor) const
{
    g_file_monitor_cancel(monitor);
    g_object_unref(monitor);
}

void FileWatch::Closer::operator()(GSource* source) const
{
    g_source_destroy(source);
    g_source_unref(source);
}

FileWatch::FileWatch(std::string path, std::function<bool(Look)> look) : path_(std::move(path)), look_(std::move(look))
{
    Observe();
    Read();
}

FileWatch::~FileWatch() = default;

void FileWatch::Observe()
{
    for (std::vector<std::string> paths = PathsTo(path_); paths != observed_; paths = PathsTo(path_))
    {
        monitors_.clear();
        for (const std::string& path : paths)
        {
            g_autoptr(GFile) file = g_file_new_for_path(path.c_str());
            g_autoptr(GError) error = nullptr;
            monitors_.emplace_back(g_file_monitor_file(file, G_FILE_MONITOR_NONE, nullptr, &error));
            if (monitors_.back() != nullptr)
                g_signal_connect(monitors_.back().get(), "changed", G_CALLBACK(OnEvent), this);
            else
                Report(path + ": changes are not noticed: " + error->message);
        }
        observed_ = std::move(paths);
    }
}

void FileWatch::OnEvent(GFileMonitor* /*monitor*/, GFile* file, GFile* /*other*/, GFileMonitorEvent event, gpointer self)
{
    // A new file is not written yet: a "changes done" event follows when its writer has closed it, or after a rename.
    const bool isNewLink = event == G_FILE_MONITOR_EVENT_CREATED && fs::is_symlink(g_file_peek_path(file));
    if (!isNewLink && event != G_FILE_MONITOR_EVENT_CHANGES_DONE_HINT && event != G_FILE_MONITOR_EVENT_DELETED)
        return;
    static_cast<FileWatch*>(self)->Observe();
    static_cast<FileWatch*>(self)->Read();
}

void FileWatch::Read()
{
    lastLook_.reset();
    if (look_(Look::First))
        return;
    lastLook_.reset(g_timeout_source_new(kPatienceMs));
    g_source_set_callback(lastLook_.get(), ReadLast, this, nullptr);
    g_source_attach(lastLook_.get(), g_main_context_get_thread_default());
}

gboolean FileWatch::ReadLast(gpointer self)
{
    static_cast<FileWatch*>(self)->look_(Look::Last);
    return G_SOURCE_REMOVE;
}

} // namespace kiv::platform
