#ifndef KIV_TESTS_PRIVATEBUS_H
#define KIV_TESTS_PRIVATEBUS_H

#include "support/Test.h"

namespace kiv::test
{

struct Unref
{
    void operator()(gpointer object) const { g_object_unref(object); }
};

using Connection = std::unique_ptr<GDBusConnection, Unref>;
using Message = std::unique_ptr<GDBusMessage, Unref>;

/// The system bus of this process: a dbus-daemon of its own behind an abstract socket, so that nothing remains on disk, and which
/// the kernel kills when the process ends in whatever way. From the making of the object on, GLib has nothing to say: a warning
/// of its fails the test.
class PrivateBus
{
public:
    /// Starts the daemon and makes it the system bus of the process. To be made before the first bus call.
    PrivateBus();
    PrivateBus(const PrivateBus&) = delete;
    PrivateBus& operator=(const PrivateBus&) = delete;
    ~PrivateBus();

    /// Starts it again at the same address. The thread that calls this must live as long as the daemon shall.
    void Start();

    /// Kills it; it is gone on return. Any thread.
    void Stop();

    /// Lets GLib say this after all.
    static void Tolerate(const char* message);

    /// A new connection that nobody else uses.
    Connection Connect() const;

private:
    std::string address_;
    std::mutex mutex_; ///< of what follows
    std::unique_ptr<GSubprocess, Unref> daemon_;
};

} // namespace kiv::test

#endif
