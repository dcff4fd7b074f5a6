#ifndef KIV_NOTHROW_H
#define KIV_NOTHROW_H

#include <cxxabi.h>
#include <utility>

namespace kiv
{

/// Runs an operation whose means may throw (a lock that can not be recorded, a container that can not grow): nothing but its
/// result leaves the library, and what it owned is released on the way out. A thread that is cancelled inside is not held up.
template <class Result, class Body>
Result NoThrow(Result failure, Body&& body)
{
    try
    {
        return std::forward<Body>(body)();
    }
    catch (const abi::__forced_unwind&)
    {
        throw;
    }
    catch (...)
    {
        return failure;
    }
}

} // namespace kiv

#endif
