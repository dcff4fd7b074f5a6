#ifndef KIV_TESTS_OPERATIONS_H
#define KIV_TESTS_OPERATIONS_H

#include "support/Deliveries.h"
#include "support/Peer.h"

#include <DeviceControl.h>
#include <SourceControl.h>
#include <telephony.h>

namespace kiv::test
{

using platform::Call;
using Calls = std::vector<Call>;

/// What an operation came to: its result with what it wrote, then each line that it logged, as LogCapture tells it.
using Story = std::vector<std::string>;

/// The telephony handles that one call of an operation is given, and those that it leaves open. Both are closed at its end.
struct Session
{
    Session();
    Session(const Session&) = delete;
    Session& operator=(const Session&) = delete;
    ~Session();

    telephony_handle_list_s given{}, left{};
};

/// What an operation comes to when one of these calls fails.
struct Failing
{
    Calls calls;
    Story story; ///< a text that ends with '*': what the platform wrote before it failed goes through
};

enum class Kind
{
    Single,  ///< fails when one of its calls fails, and only then
    Walk,    ///< goes on after a call that fails
    Bus,     ///< calls somebody on the bus
    Push,    ///< the same, and a main loop of the thread's goes on with it
    Listener ///< of the one thread that changes are delivered on
};

enum class SimLock
{
    AroundReads, ///< held around the SIM reads, one by one
    Whole        ///< held at every call
};

/// One operation with typical arguments; one that opens and the one that closes are called together.
struct Operation
{
    std::vector<std::string> symbols; ///< the members that it calls, as the library exports them
    std::string name;                 ///< the first of them
    Kind kind = Kind::Single;
    SimLock lock = SimLock::AroundReads;
    bool needsHandle = false; ///< the first of the session
    std::function<std::string(Session&)> run;
    Story good; ///< on the profile "dual"
    std::vector<Failing> failing;
    std::vector<std::string> noMemory; ///< results of another failure: of memory

    bool IsLockedAt(Call call) const;
};

/// Every public member of the facade and the managers.
const std::vector<Operation>& Operations();

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
