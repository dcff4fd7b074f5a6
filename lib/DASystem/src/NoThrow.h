#ifndef KIV_NOTHROW_H
#define KIV_NOTHROW_H

#include <cxxabi.h>
#include <utility>

namespace kiv
{

/// Runs an operation and returns its result, or `failure` if it throws, for example because a lock or a container gets no memory.
/// Lets the cancellation of a thread through.
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
