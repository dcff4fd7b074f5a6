#ifndef KIV_BENCH_BUSDAEMON_H
#define KIV_BENCH_BUSDAEMON_H

#include <gio/gio.h>

#include <memory>
#include <mutex>
#include <string>
#include <vector>

namespace kiv::bench
{

struct Unref
{
    void operator()(gpointer object) const { g_object_unref(object); }
};
using Connection = std::unique_ptr<GDBusConnection, Unref>;
using Process = std::unique_ptr<GSubprocess, Unref>;

/// Starts a program that prints when it is ready, and waits until it is. The kernel kills it when the thread that called this ends.
/// Throws std::runtime_error.
Process StartProgram(std::vector<const char*> command);

/// Kills a program, which is gone on return.
void Kill(GSubprocess* program);

/// A dbus-daemon of this process's own behind an abstract socket, so that nothing remains on disk, which the kernel kills when the
/// process ends in whatever way.
class BusDaemon
{
public:
    /// Starts the daemon and makes it the system bus of the process. To be made before the first bus call. Throws
    /// std::runtime_error.
    /// @param configuration  its file; that for private buses without it
    explicit BusDaemon(std::string configuration = {});
    BusDaemon(const BusDaemon&) = delete;
    BusDaemon& operator=(const BusDaemon&) = delete;
    ~BusDaemon();

    /// Starts it again at the same address. The thread that calls this must live as long as the daemon shall.
    void Start();

    /// Kills it; it is gone on return. Any thread.
    void Stop();

    /// A new connection that nobody else uses. Throws std::runtime_error.
    Connection Connect() const;

    /// Null while it is stopped.
    GSubprocess* Daemon() const { return daemon_.get(); }

private:
    std::string address_;
    std::string configuration_;
    std::mutex mutex_; ///< of what follows
    Process daemon_;
};

} // namespace kiv::bench

#endif
