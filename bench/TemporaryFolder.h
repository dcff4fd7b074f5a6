#ifndef KIV_BENCH_TEMPORARYFOLDER_H
#define KIV_BENCH_TEMPORARYFOLDER_H

#include <gio/gio.h>

#include <filesystem>
#include <stdexcept>
#include <string>

namespace kiv::bench
{

/// A private folder. The destructor removes it with its contents.
class TemporaryFolder
{
public:
    TemporaryFolder()
    {
        g_autoptr(GError) error = nullptr;
        const g_autofree char* made = g_dir_make_tmp("kiv-bench-XXXXXX", &error);
        if (made == nullptr)
            throw std::runtime_error(error->message);
        path_ = made;
    }
    TemporaryFolder(const TemporaryFolder&) = delete;
    TemporaryFolder& operator=(const TemporaryFolder&) = delete;
    ~TemporaryFolder()
    {
        std::error_code ignored;
        std::filesystem::remove_all(path_, ignored);
    }

    std::string File(const std::string& name) const { return path_ + '/' + name; }

private:
    std::string path_;
};

} // namespace kiv::bench

#endif
