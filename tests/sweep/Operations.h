#ifndef KIV_TESTS_OPERATIONS_H
#define KIV_TESTS_OPERATIONS_H

#include "sweep/World.h"

#include <DeviceControl.h>

namespace kiv::test
{

using platform::Call;
using Calls = std::vector<Call>;

/// The outcome of an operation: its result with its out-parameters, then each logged line in LogCapture's form.
using Story = std::vector<std::string>;

/// The outcome of an operation when one of these calls fails.
struct Failing
{
    Calls calls;
    Story story; ///< with '*' at the end of a text, values that the platform wrote before it failed are passed on
};

enum class Kind
{
    Single,  ///< fails exactly when one of its calls fails
    Walk,    ///< continues after a failed call
    Bus,     ///< calls a service on the bus
    Push,    ///< the same, and continues in a main loop of the thread
    Listener ///< runs in the one thread that delivers changes
};

enum class SimLock
{
    AroundReads, ///< held during each SIM read
    Whole        ///< held during every call
};

/// One operation with typical arguments. Members that open and close are called together.
struct Operation
{
    std::vector<std::string> symbols; ///< exported symbols of the members that it calls
    std::string name;                 ///< the first symbol
    Kind kind = Kind::Single;
    SimLock lock = SimLock::AroundReads;
    bool needsHandle = false; ///< uses the first handle of the session
    std::function<std::string(Session&)> run;
    Story good; ///< on the profile "dual"
    std::vector<Failing> failing;
    std::vector<std::string> noMemory; ///< results when there is no memory

    bool IsLockedAt(Call call) const;
};

/// Every public member of the facade and the managers. The first call decides which modem and slot they are asked about.
const std::vector<Operation>& Operations(const char* modem = "modem1", int slot = 1);

} // namespace kiv::test

#endif
