#ifndef KIV_TESTS_SWEEP_H
#define KIV_TESTS_SWEEP_H

#include "support/LogCapture.h"
#include "sweep/Operations.h"

namespace kiv::test
{

constexpr char kSimAccess[] = "CORE_MUTEX_NAME_SIM_ACCESS";

// State of the doubles of the named locks and of sleep(), which replace those that the library links. One thread only.
inline const char* heldLock = "";           ///< its name, or empty; taking a second lock fails the test
inline std::set<std::string> lockNames;     ///< names of the locks made
inline std::function<bool()> isLockRefused; ///< whether making a lock with a new name fails
inline int pauses = 0;                      ///< requested seconds of sleep

/// How many calls or allocations fail in a row. Once an operation ends before all have failed, more have the same outcome.
std::vector<unsigned> Lengths();

/// Tries operations one by one in one world, each on a fresh device.
struct Sweep : testing::Test
{
    Sweep();
    ~Sweep() override;

    /// The profiles, and a device with many slots, so that several calls and allocations of one walk fail.
    static std::vector<std::string> Devices();
    void Use(const std::string& name);

    /// Returns the operation with that name.
    static const Operation& Find(const std::string& name);

    /// Runs an operation between two actions. In the end, nothing may be open and no lock held.
    Story Try(
        const Operation& operation, const std::function<void()>& arm = [] {},
        const std::function<void()>& disarm = platform::ClearFaults);

    /// Whether `story` is possible for an operation that continues after a failure. Its result must be one of the operation's
    /// failures, or consist only of words of the untouched result and of the SIMs. Its log lines must be lines of the operation.
    testing::AssertionResult MayBe(const Operation& operation, const Story& story, const Story& untouched) const;

    platform::Device device;
    LogCapture log;
};

} // namespace kiv::test

#endif
