// The named locks and sleep() of this program stand in front of those that the library links.
#include "sim/SimTest.h"

#include <DAMutex.h>

#include <cstring>
#include <new>
#include <unistd.h>
#include <utility>

using namespace kiv::test;

namespace
{

char* Make(const char* name)
{
    if (refusedLock > 0 && std::strcmp(name, kSimAccess) == 0 && --refusedLock == 0)
        throw std::bad_alloc();
    return const_cast<char*>(name);
}

} // namespace

DAMutex::DAMutex(const char* name) : lock_(Make(name)) {}
DAMutex::~DAMutex() {}

void DAMutex::Lock()
{
    EXPECT_STREQ("", std::exchange(heldLock, static_cast<char*>(lock_)));
}

void DAMutex::Unlock()
{
    EXPECT_EQ(lock_, std::exchange(heldLock, ""));
}

DAMutexLock::DAMutexLock(const char* name) : lock_(Make(name))
{
    EXPECT_STREQ("", std::exchange(heldLock, name));
}

DAMutexLock::~DAMutexLock()
{
    EXPECT_EQ(lock_, std::exchange(heldLock, ""));
}

extern "C" unsigned sleep(unsigned seconds)
{
    EXPECT_EQ(1U, seconds);
    EXPECT_STREQ("", heldLock) << "in a pause";
    ++pauses;
    return 0;
}
