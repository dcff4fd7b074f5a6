#ifndef KIV_TESTS_SIMTEST_H
#define KIV_TESTS_SIMTEST_H

#include "support/LogCapture.h"

#include <DASimManager.h>
#include <DASystem.h>
#include <SimulatedDevice.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdlib>
#include <functional>
#include <sstream>

namespace kiv::test
{

using sim::Call;
using Calls = std::vector<Call>;
using Slots = telephony_handle_list_s;

constexpr char kSimAccess[] = "CORE_MUTEX_NAME_SIM_ACCESS";

// What the doubles of the named locks and of sleep() keep. One thread only.
inline const char* heldLock = ""; ///< its name, empty for none
inline int pauses = 0;            ///< the seconds that were to be slept
inline int refusedLock = 0;       ///< the lock on SIM access of that number from now on can not be made; 0 for none

constexpr Call kNoCall = Call::connection_create; ///< one that no operation on SIMs makes
const Calls kWhole{kNoCall};                      ///< the lock is held at every call

/// What an operation came to: its result with what it wrote, then each line that it logged.
using Story = std::vector<std::string>;

/// Values in a row, as "true 3".
template <class... Values>
std::string Tell(const Values&... values)
{
    std::ostringstream text;
    text << std::boolalpha;
    ((text << ' ' << values), ...);
    return text.str().substr(1);
}

inline std::string ErrorLine(const std::string& function, const std::string& text)
{
    return "E DASimManager.cpp " + function + " > " + text;
}

inline char before[] = "before"; ///< for a text that is to be written

/// A text that an operation gave, which is freed; "null" without one.
inline std::string Take(const char* text)
{
    std::string told = text == nullptr ? "null" : text;
    if (text != before)
        std::free(const_cast<char*>(text));
    return told;
}

enum class Sim
{
    kAnswers,
    kSilent, ///< usable, without IMSI and number
    kLocked
};
using Sims = std::vector<Sim>;

struct Operation
{
    std::string name;
    Calls locked; ///< the calls that it makes under the SIM-access lock, or kWhole
    std::function<std::string(const Slots& slots, int slot)> run;
    Story good = {};                                    ///< when all goes well
    std::vector<std::pair<Calls, Story>> failures = {}; ///< when one of these calls fails; the failure of any other changes nothing
    Call likeBadSlot = kNoCall;                         ///< a slot that is not there has the story of this call failing
};

/// Every test leaves no handle open and no lock held.
struct SimTest : testing::Test
{
    ~SimTest() override;

    /// One slot a SIM. Slot 0 has MCC 450, the MNC 05, of two digits, and an empty number.
    static void Insert(const Sims& sims);

    Story Hear(const std::function<std::string()>& ask);

    /// Runs an operation on two SIMs that answer, after `arm`; looks at its lock at each call, and at what it leaves.
    Story Try(const Operation& operation, const std::function<void()>& arm = nullptr, int slot = 1);

    LogCapture log;
    Calls made; ///< in the last Try
};

} // namespace kiv::test

#endif
