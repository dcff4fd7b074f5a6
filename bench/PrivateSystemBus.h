#ifndef KIV_BENCH_PRIVATESYSTEMBUS_H
#define KIV_BENCH_PRIVATESYSTEMBUS_H

#include "BusDaemon.h"
#include "TemporaryFolder.h"

#include <sched.h>

namespace kiv::bench
{

/// Pins this thread, and the threads and processes that it starts, to one processor. The destructor restores the thread's former
/// choice.
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

/// A private system bus, a client service in a separate process that answers every call, and a folder for the subscriber store. The
/// destructor removes all of it. Program, bus and service share one processor, so that none is idle between a message and its
/// reply.
class PrivateSystemBus
{
public:
    PrivateSystemBus();
    PrivateSystemBus(const PrivateSystemBus&) = delete;
    PrivateSystemBus& operator=(const PrivateSystemBus&) = delete;
    ~PrivateSystemBus();

    /// Returns the processor time that program, bus and service have used so far, in nanoseconds.
    double WorkNs() const;

private:
    OneProcessor processor_;
    TemporaryFolder folder_;
    BusDaemon bus_;
    Process service_;
    Connection shared_; ///< held, so that neither side has to connect again and again
};

constexpr char kServe[] = "--serve";

/// Runs the client service, which answers every call until it is killed.
int Serve();

/// Adds that many subscribers of a kind to the store, with their number as the key.
void Subscribe(const char* kind, int count);

/// Looks up the subscribers of a kind and a key, like the library for each event.
void Find(const char* kind, const char* key);

} // namespace kiv::bench

#endif
