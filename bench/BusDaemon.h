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

/// Starts a program and waits until it prints that it is ready. The kernel kills it when the calling thread ends. Throws
/// std::runtime_error.
Process StartProgram(std::vector<const char*> command);

/// Kills a program and waits until it is gone.
void Kill(GSubprocess* program);

/// A private dbus-daemon of this process. The kernel kills it when the process ends in any way. Its socket is abstract, so nothing
/// remains on disk.
class BusDaemon
{
public:
    /// Starts the daemon and makes it the system bus of the process. Construct it before the first bus call. Throws
    /// std::runtime_error.
    /// @param configuration  configuration file; if empty, the one for private buses
    explicit BusDaemon(std::string configuration = {});
    BusDaemon(const BusDaemon&) = delete;
    BusDaemon& operator=(const BusDaemon&) = delete;
    ~BusDaemon();

    /// Restarts it at the same address. The calling thread must live as long as the daemon is needed.
    void Start();

    /// Kills it and waits until it is gone. Any thread.
    void Stop();

    /// Returns a new private connection. Throws std::runtime_error.
    Connection Connect() const;

    /// Null while it is stopped.
    GSubprocess* Daemon() const { return daemon_.get(); }

private:
    std::string address_;
    std::string configuration_;
    std::mutex mutex_; ///< guards daemon_
    Process daemon_;
};

} // namespace kiv::bench

#endif
