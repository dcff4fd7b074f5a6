#include "RunService.h"
#include "SubscriptionService.h"

#include <unistd.h>

int main(int argc, char** argv)
{
    double idleSeconds = kiv::SubscriptionService::kIdleSeconds;
    const GOptionEntry options[] = {
        {"idle", 'i', 0, G_OPTION_ARG_DOUBLE, &idleSeconds, "End after this time without a call (default: 60)", "SECONDS"}, {}};
    return kiv::RunService(argc, argv, "Let client services subscribe to the agent's events over the system bus.", options,
        [&idleSeconds] {
            return std::make_unique<kiv::SubscriptionService>(idleSeconds, std::set<guint32>{0, geteuid()});
        });
}
