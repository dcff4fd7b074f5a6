#ifndef KIV_TESTS_WORLD_H
#define KIV_TESTS_WORLD_H

#include "support/Deliveries.h"
#include "support/Peer.h"

#include <telephony.h>

namespace kiv::test
{

/// The telephony handles that one call of an operation is given, and those that it leaves open. Both are closed at its end.
struct Session
{
    Session();
    Session(const Session&) = delete;
    Session& operator=(const Session&) = delete;
    ~Session();

    telephony_handle_list_s given{}, left{};
};

/// Whether a test takes its long form, for which the environment variable KIV_TEST_LONG asks.
bool IsLong();

/// What the operations need: UTC, the profile "dual" with its clock stopped, and a private bus with whom they call on it. The test
/// fails when GLib has anything to say.
struct World
{
    World();
    World(const World&) = delete;
    World& operator=(const World&) = delete;
    ~World();

    static void Use(const std::string& profile);

    std::string directory; ///< of the subscriber store
    PrivateBus bus;
    Peer board, serviceManager, client;
    Deliveries deliveries;
};

} // namespace kiv::test

#endif
