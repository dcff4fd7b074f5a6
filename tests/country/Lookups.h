#ifndef KIV_TESTS_LOOKUPS_H
#define KIV_TESTS_LOOKUPS_H

#include "support/Texts.h"

#include <DASystem.h>

namespace kiv::test
{

/// The rows of the tables, written independently of the library's.
inline const Rows kCountry = Read("country.tsv"); // mcc, alpha-2, name
inline const Rows kService = Read("service.tsv"); // mcc, service country code
inline const Rows kCodes = Read("codes.tsv");     // mcc, alpha-3, calling code or "-"
inline const Rows kMo = Read("mo.txt");           // mcc

/// A lookup of the facade. A test whether a key is in a table counts as a lookup of the key itself.
struct Lookup
{
    const char* name;
    std::function<std::string(const char*)> ask;
    Column answers;
    const char* keyName;       ///< name of the key in the log
    const char* miss;          ///< log line of the manager when nothing is found
    std::string none = "null"; ///< the answer when nothing is found

    /// Returns the answer for a key.
    std::string Answer(const std::string& key) const
    {
        const auto found = answers.find(key);
        if (found != answers.end())
            return found->second;
        return key.empty() && none == "null" ? "untouched" : none;
    }
};

constexpr auto kKeep = [](void*) {}; // for constant text of the library

inline auto Text(void (DASystem::*lookup)(const char*, char**), void (*release)(void*) = std::free)
{
    return [=](const char* key)
    { return Out([=](char** out) { std::invoke(lookup, DASystem::GetInstance(), key, out); }, release); };
}

inline auto Test(bool (DASystem::*test)(const char*))
{
    return [=](const char* key) { return std::string(std::invoke(test, DASystem::GetInstance(), key) ? key : "false"); };
}

/// Returns the answer for a calling code by way of its MCC.
inline Column ByCallingCode(const Column& ofMcc)
{
    Column found = Find(kCodes, 2, 0);
    for (auto& [callingCode, answer] : found)
        answer = ofMcc.at(answer);
    return found;
}

/// If two countries share an MCC, the last one is the answer.
inline const Column kLastAlpha2 = Find(Rows(kCountry.rbegin(), kCountry.rend()), 0, 1);

#define TEXT(name) #name, Text(&DASystem::name)

inline const Lookup kLookups[] = {
    {TEXT(GetCountryCodeFromMcc), Find(kCountry, 0, 1), "mcc", "fail to get countrycode"},
    {TEXT(GetCountryNameFromMcc), Find(kCountry, 0, 2), "mcc", "fail to get countryName"},
    {TEXT(GetMccFromCountryCode), Find(kCountry, 1, 0), "countryCode", "fail to get mcc"},
    {TEXT(GetMccFromServiceCountryCode), Find(kService, 1, 0), "serviceCountryCode", "fail to get mcc"},
    {TEXT(GetServiceCountryCodeFromMcc), Find(kService, 0, 1), "mcc", "fail to get serviceCountryCode"},
    {TEXT(GetCountryCallingCodeFromMcc), Find(kCodes, 0, 2), "mcc", "fail to get countryCallingCode"},
    {TEXT(GetAlpha3CountryCodeFromMcc), Find(kCodes, 0, 1), "mcc", "fail to get alpha3CountryCode"},
    {TEXT(GetMccFromCountryCallingCode), Find(kCodes, 2, 0), "countryCallingCode", "fail to get mcc"},
    {"IsValidMcc", Test(&DASystem::IsValidMcc), Find(kCountry, 0, 0), "mcc", "mcc is invalid", "false"},
    {"IsMoSupportMcc", Test(&DASystem::IsMoSupportMcc), Find(kMo, 0, 0), "mcc", nullptr, "false"},
    {TEXT(GetCountryNameFromCountryCallingCode), ByCallingCode(Find(kCountry, 0, 2)), "countryCallingCode", nullptr, "untouched"},
    {"GetCountryNameAlpha2FromCountryCallingCode", Text(&DASystem::GetCountryNameAlpha2FromCountryCallingCode, kKeep),
        ByCallingCode(kLastAlpha2), "countryCallingCode", nullptr, "untouched"},
};

#undef TEXT

} // namespace kiv::test

#endif
