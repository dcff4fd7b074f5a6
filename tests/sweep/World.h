#ifndef KIV_TESTS_WORLD_H
#define KIV_TESTS_WORLD_H

#include "support/Deliveries.h"
#include "support/Peer.h"

#include <telephony.h>

namespace kiv::test
{

/// The telephony handles that one operation receives, and those that it leaves open. The destructor closes both.
struct Session
{
    Session();
    Session(const Session&) = delete;
    Session& operator=(const Session&) = delete;
    ~Session();

    telephony_handle_list_s given{}, left{};
};

/// Whether the environment variable KIV_TEST_LONG requests a test's long form.
bool IsLong();

/// The operations' world: UTC, the profile "dual" with its clock stopped, and a private bus with the services that they call. The
/// test fails when GLib prints anything.
struct World
{
    World();
    World(const World&) = delete;
    World& operator=(const World&) = delete;
    ~World();

    static void Use(const std::string& profile);

    std::string directory; ///< directory of the subscriber store
    PrivateBus bus;
    Peer board, serviceManager, client;
    Deliveries deliveries;
};

} // namespace kiv::test

#endif
