#ifndef KIV_TESTS_OPERATIONS_H
#define KIV_TESTS_OPERATIONS_H

#include "sweep/World.h"

#include <DeviceControl.h>

namespace kiv::test
{

using platform::Call;
using Calls = std::vector<Call>;

/// What an operation came to: its result with what it wrote, then each line that it logged, as LogCapture tells it.
using Story = std::vector<std::string>;

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

} // namespace kiv::test

#endif
