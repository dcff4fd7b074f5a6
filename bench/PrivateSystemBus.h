#ifndef KIV_BENCH_PRIVATESYSTEMBUS_H
#define KIV_BENCH_PRIVATESYSTEMBUS_H

#include "BusDaemon.h"
#include "TemporaryFolder.h"

#include <sched.h>

namespace kiv::bench
{

/// Keeps this thread, and every thread and process that it starts from now on, on one processor; the thread may go where it
/// could before at the end.
class OneProcessor
{
public:
    OneProcessor();
    OneProcessor(const OneProcessor&) = delete;
    OneProcessor& operator=(const OneProcessor&) = delete;
    ~OneProcessor();

private:
    cpu_set_t before_;
};

/// A bus of the benchmark's own as the system bus, a client service in a process of its own that answers every call, and a place
/// for the subscriber store. All of it is gone at the end. Program, bus and service share one processor, so that no processor is
/// idle between a message and its reply.
class PrivateSystemBus
{
public:
    PrivateSystemBus();
    PrivateSystemBus(const PrivateSystemBus&) = delete;
    PrivateSystemBus& operator=(const PrivateSystemBus&) = delete;
    ~PrivateSystemBus();

    /// The processor time, in nanoseconds, that program, bus and service have used so far.
    double WorkNs() const;

private:
    OneProcessor processor_;
    TemporaryFolder folder_;
    BusDaemon bus_;
    Process service_;
    Connection shared_; ///< held, or the bare loops would connect anew for each proxy, and the library for each notification
};

constexpr char kServe[] = "--serve";

/// The client service: answers every call until it is killed.
int Serve();

/// Records that many subscribers of a kind, under their number as the key.
void Subscribe(const char* kind, int count);

/// Looks up the subscribers of a kind and a key, as the library does for each event.
void Find(const char* kind, const char* key);

} // namespace kiv::bench

#endif
