#ifndef KIV_BENCH_BAREBUS_H
#define KIV_BENCH_BAREBUS_H

#include <string>
#include <vector>

/// The same proxies and calls as the library's, by GDBus alone, in the loops that one would write first.
namespace kiv::bench
{

constexpr char kImsi[] = "450050123456789";
constexpr long long kPushTime = 1'700'000'000;

/// Where the client service is; it answers on every path.
constexpr char kServiceName[] = "org.example.Bench";

/// The paths of that many subscribers, all of the one service.
std::vector<std::string> SubscriberPaths(int count);

/// Tells one subscriber after the other of a service's status.
void NotifyBare(const std::vector<std::string>& paths, int serviceId);

/// Pushes a message to all subscribers and iterates the default main context until the last one answered.
void PushBare(const std::vector<std::string>& paths, const char* service);

/// Dispatches what is ready in the default main context.
void Drain();

} // namespace kiv::bench

#endif
