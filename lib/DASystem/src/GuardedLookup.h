/// @file
/// The facade's country lookups behind their guard. All of it logs for the member whose place it is given.
#ifndef KIV_GUARDEDLOOKUP_H
#define KIV_GUARDEDLOOKUP_H

#include "DASimManager.h"
#include "Forward.h"
#include "Handles.h"
#include "Log.h"

#include <utility>

namespace kiv
{

/// Whether there is a key to look up; logs that there is none.
inline bool HasKey(const char* key, const char* keyName, const Place& here)
{
    if (key != nullptr && *key != '\0')
        return true;
    KIV_ERROR_AT(here, "%s is empty. %s finish.", keyName, here.function);
    return false;
}

using StringLookup = void (DASimManager::*)(const char*, char**);

/// A string lookup of the manager behind the guard.
inline void GuardedLookup(StringLookup lookup, const char* key, char** out, const char* keyName, const Place& here)
{
    if (!HasKey(key, keyName, here))
        return;
    char* found = nullptr;
    Ask(lookup, key, &found);
    *out = found;
}

/// The MCC of a calling code behind the guard; null, and logged, when there is none.
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
