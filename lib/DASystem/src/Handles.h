/// @file
/// Owners for what the platform's C interfaces hand out.
#ifndef KIV_HANDLES_H
#define KIV_HANDLES_H

#include <cstdlib>
#include <memory>

namespace kiv
{

/// Releases with a plain C function.
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

/// A text of strdup() or of the platform.
using CString = Owned<char, std::free>;

} // namespace kiv

#endif
