#ifndef KIV_TESTS_SWEEP_H
#define KIV_TESTS_SWEEP_H

#include "support/LogCapture.h"
#include "sweep/Operations.h"

namespace kiv::test
{

constexpr char kSimAccess[] = "CORE_MUTEX_NAME_SIM_ACCESS";

// What the doubles of the named locks and of sleep() keep; they stand in front of those that the library links. One thread only.
inline const char* heldLock = "";           ///< its name, empty for none; the test fails when a second one is taken
inline std::set<std::string> lockNames;     ///< of the locks made
inline std::function<bool()> isLockRefused; ///< whether a lock of a new name can not be made
inline int pauses = 0;                      ///< the seconds that were to be slept

/// How many calls or allocations are to fail in a row. Once an operation ends before so many have, more come to the same.
std::vector<unsigned> Lengths();

/// Tries operations one by one in one world, each on a device that nobody used before.
struct Sweep : testing::Test
{
    Sweep();
    ~Sweep() override;

    /// The profiles, and one device with many slots, of whose walks several calls and allocations fail.
    static std::vector<std::string> Devices();
    void Use(const std::string& name);

    /// The operation of that name.
    static const Operation& Find(const std::string& name);

    /// Runs an operation between two actions; nothing may be open and no lock held in the end.
    Story Try(
        const Operation& operation, const std::function<void()>& arm = [] {},
        const std::function<void()>& disarm = platform::ClearFaults);

    /// Whether an operation that goes on after a failure may come to this: to one of its failures, or to an answer made of nothing
    /// but what it says untouched and what the SIMs hold, in lines that are all its own.
    testing::AssertionResult MayBe(const Operation& operation, const Story& story, const Story& untouched) const;

    platform::Device device;
    LogCapture log;
};

} // namespace kiv::test

#endif
