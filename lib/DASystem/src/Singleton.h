#ifndef KIV_SINGLETON_H
#define KIV_SINGLETON_H

#include "Log.h"
#include "NoThrow.h"

#include <DAMutex.h>

#include <cstring>
#include <new>

namespace kiv
{

/// Makes the instance of one of the four classes on first use, under a lock named "FILE::FUNCTION" after the place.
/// @param failure  error line when there is no memory for the instance or the lock's name
/// @return the instance; null without memory, and the next call tries again
template <class Class>
Class* Singleton(Class*& instance, const Place& here, const char* failure)
{
    char name[128];
    stpcpy(stpcpy(stpcpy(name, here.file), "::"), here.function); // "%s::%s" of constants; the compiler does the work

    Class* const made = NoThrow<Class*>(nullptr,
        [&]
        {
            const DAMutexLock lock(name);
            if (instance == nullptr)
                instance = new (std::nothrow) Class;
            return instance;
        });
    if (made == nullptr)
        KIV_ERROR_AT(here, "%s", failure);
    return made;
}

} // namespace kiv

#endif
