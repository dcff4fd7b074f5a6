/// @file
/// The facade's country lookups with their check of the key. The functions log in the name of the member at `here`.
#ifndef KIV_GUARDEDLOOKUP_H
#define KIV_GUARDEDLOOKUP_H

#include "DASimManager.h"
#include "Forward.h"
#include "Handles.h"
#include "Log.h"

#include <utility>

namespace kiv
{

/// Whether the key is neither null nor empty; logs if not.
inline bool HasKey(const char* key, const char* keyName, const Place& here)
{
    if (key != nullptr && *key != '\0')
        return true;
    KIV_ERROR_AT(here, "%s is empty. %s finish.", keyName, here.function);
    return false;
}

using StringLookup = void (DASimManager::*)(const char*, char**);

/// Calls a string lookup of the manager if there is a key.
inline void GuardedLookup(StringLookup lookup, const char* key, char** out, const char* keyName, const Place& here)
{
    if (!HasKey(key, keyName, here))
        return;
    char* found = nullptr;
    Ask(lookup, key, &found);
    *out = found;
}

/// Returns the MCC of a calling code; null, and logs, when the code is empty or has none.
inline CString MccOfCallingCode(const char* countryCallingCode, const Place& here)
{
    if (!HasKey(countryCallingCode, "countryCallingCode", here))
        return nullptr;
    char* mcc = nullptr;
    Ask(&DASimManager::GetMccFromCountryCallingCode, countryCallingCode, &mcc);
    CString owner(mcc);
    return HasKey(mcc, "mcc", here) ? std::move(owner) : nullptr;
}

} // namespace kiv

#endif
