#ifndef KIV_POLICY_H
#define KIV_POLICY_H

#include "Log.h"

namespace kiv
{

/// Whether none of a policy's four texts is null; logs all four otherwise.
inline bool HavePolicyTexts(
    const Place& here, const char* ServiceStatus, const char* PolicyFeature, const char* PolicyVersion, const char* PolicyDocURL)
{
    if (ServiceStatus != nullptr && PolicyFeature != nullptr && PolicyVersion != nullptr && PolicyDocURL != nullptr)
        return true;
    KIV_ERROR_AT(here, "NULL value: ServiceStatus(%p), PolicyFeature(%p), PolicyVersion(%p), PolicyDocURL(%p)",
        static_cast<const void*>(ServiceStatus), static_cast<const void*>(PolicyFeature), static_cast<const void*>(PolicyVersion),
        static_cast<const void*>(PolicyDocURL));
    return false;
}

} // namespace kiv

#endif
