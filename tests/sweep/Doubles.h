#ifndef KIV_TESTS_DOUBLES_H
#define KIV_TESTS_DOUBLES_H

#include <functional>
#include <set>
#include <string>

namespace kiv::test
{

constexpr char kSimAccess[] = "CORE_MUTEX_NAME_SIM_ACCESS";

// What the doubles of the named locks and of sleep() keep; they stand in front of those that the library links. One thread only.
inline const char* heldLock = "";           ///< its name, empty for none; the test fails when a second one is taken
inline std::set<std::string> lockNames;     ///< of the locks made
inline std::function<bool()> isLockRefused; ///< whether a lock of a new name can not be made
inline int pauses = 0;                      ///< the seconds that were to be slept

} // namespace kiv::test

#endif
