#ifndef KIV_BENCH_PRIVATESYSTEMBUS_H
#define KIV_BENCH_PRIVATESYSTEMBUS_H

#include <gio/gio.h>

#include <string>

namespace kiv::bench
{

/// A bus of the benchmark's own as the system bus, a client service in a process of its own that answers every call, and a place
/// for the subscriber store. All of it is gone at the end.
class PrivateSystemBus
{
public:
    /// @param self  the benchmark's own program, which serves with kServe as its argument
    explicit PrivateSystemBus(const char* self);
    PrivateSystemBus(const PrivateSystemBus&) = delete;
    PrivateSystemBus& operator=(const PrivateSystemBus&) = delete;
    ~PrivateSystemBus();

private:
    GTestDBus* bus_;
    GSubprocess* service_ = nullptr;
    std::string storeFolder_;
};

constexpr char kServe[] = "--serve";

/// The client service: answers every call until it is killed.
int Serve();

/// Where the client service is; it answers on every path.
constexpr char kServiceName[] = "org.example.Bench";

/// The path of one of several subscribers, all of the one service.
std::string SubscriberPath(int number);

/// Records that many subscribers of a kind, under that number as the key, unless they are there.
void Subscribe(const char* kind, int count);

} // namespace kiv::bench

#endif
