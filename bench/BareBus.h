#ifndef KIV_BENCH_BAREBUS_H
#define KIV_BENCH_BAREBUS_H

#include <string>
#include <vector>

/// The library's proxies and calls, made with GDBus alone in straightforward loops.
namespace kiv::bench
{

constexpr char kImsi[] = "450050123456789";
constexpr long long kPushTime = 1'700'000'000;

/// The address of the client service, which answers on every path.
constexpr char kServiceName[] = "org.example.Bench";

/// Returns the object paths of that many subscribers of the service.
std::vector<std::string> SubscriberPaths(int count);

/// Sends a service's status to one subscriber after the other.
void NotifyBare(const std::vector<std::string>& paths, int serviceId);

/// Pushes a message to all subscribers and iterates the default main context until the last one has answered.
void PushBare(const std::vector<std::string>& paths, const char* service);

/// Dispatches ready events in the default main context.
void Drain();

} // namespace kiv::bench

#endif
