#include "sweep/Sweep.h"

#include <DAMutex.h>

#include <new>
#include <unistd.h>

using namespace kiv::test;

namespace
{

void* Make(const char* name)
{
    if (lockNames.count(name) == 0 && isLockRefused && isLockRefused())
        throw std::bad_alloc();
    return const_cast<char*>(lockNames.insert(name).first->c_str());
}

void Hold(void* lock)
{
    EXPECT_STREQ("", std::exchange(heldLock, static_cast<char*>(lock)));
}

void Release(void* lock)
{
    EXPECT_EQ(lock, std::exchange(heldLock, ""));
}

} // namespace

DAMutex::DAMutex(const char* name) : lock_(Make(name)) {}
DAMutex::~DAMutex() {}

void DAMutex::Lock()
{
    Hold(lock_);
}

void DAMutex::Unlock()
{
    Release(lock_);
}

DAMutexLock::DAMutexLock(const char* name) : lock_(Make(name))
{
    Hold(lock_);
}

DAMutexLock::~DAMutexLock()
{
    Release(lock_);
}

extern "C" unsigned sleep(unsigned seconds)
{
    EXPECT_EQ(1U, seconds);
    EXPECT_STREQ("", heldLock) << "in a pause";
    ++pauses;
    return 0;
}
