/// @file
/// Owners for handles and texts of the platform's C interfaces.
#ifndef KIV_HANDLES_H
#define KIV_HANDLES_H

#include <cstdlib>
#include <memory>

namespace kiv
{

/// Calls a C function to release an object.
template <auto Release>
struct ReleasedBy
{
    template <class T>
    void operator()(T* owned) const
    {
        Release(owned);
    }
};

template <class T, auto Release>
using Owned = std::unique_ptr<T, ReleasedBy<Release>>;

/// A text from strdup() or from the platform.
using CString = Owned<char, std::free>;

} // namespace kiv

#endif
