#ifndef KIV_TESTS_LOOKUPS_H
#define KIV_TESTS_LOOKUPS_H

#include "support/Test.h"

#include <DASimManager.h>
#include <DASystem.h>

namespace kiv::test
{

using Rows = std::vector<std::vector<std::string>>;

inline Rows Read(const char* file)
{
    Rows rows;
    std::ifstream in(std::string(KIV_TEST_DATA "/") + file);
    for (std::string line; std::getline(in, line);)
    {
        std::vector<std::string> cells;
        std::istringstream cell(line);
        for (std::string text; std::getline(cell, text, '\t');)
            cells.push_back(text);
        rows.push_back(cells);
    }
    return rows;
}

/// What the first row with that key holds in the result column.
inline std::optional<std::string> FirstMatch(
    const Rows& rows, std::size_t keyColumn, const std::string& key, std::size_t resultColumn)
{
    for (const auto& row : rows)
    {
        if (row[keyColumn] == key)
            return row[resultColumn];
    }
    return std::nullopt;
}

// The rows of the tables, listed apart from the library's own.
inline const Rows kCountry = Read("country.tsv"); // mcc, alpha-2, name
inline const Rows kService = Read("service.tsv"); // mcc, service country code
inline const Rows kCodes = Read("codes.tsv");     // mcc, alpha-3, calling code or "-"
inline const Rows kMo = Read("mo.txt");           // mcc

inline const Rows kCalling = []
{
    Rows rows = kCodes;
    rows.erase(std::remove_if(rows.begin(), rows.end(), [](const auto& row) { return row[2] == "-"; }), rows.end());
    return rows;
}();

/// Calling code, the first name and the last alpha-2 code of its MCC.
inline const Rows kOfCallingCode = []
{
    Rows rows;
    const Rows reversed(kCountry.rbegin(), kCountry.rend());
    for (const auto& row : kCalling)
        rows.push_back({row[2], FirstMatch(kCountry, 0, row[0], 2).value_or(""), FirstMatch(reversed, 0, row[0], 1).value_or("")});
    return rows;
}();

inline DASimManager& manager = *DASimManager::GetInstance();
inline DASystem& facade = *DASystem::GetInstance();
inline char untouched[] = "(untouched)";

/// Asks with an out-parameter that holds something, takes over the copy that comes back.
template <class Class>
std::string Ask(Class& object, void (Class::*lookup)(const char*, char**), const char* key)
{
    char* out = untouched;
    (object.*lookup)(key, &out);
    const std::string text = out == nullptr ? "(null)" : out;
    if (out != untouched)
        std::free(out);
    return text;
}

/// The alpha-2 lookup hands out text of the library's own, which nobody frees.
inline const char* Alpha2(const char* callingCode)
{
    char* out = untouched;
    facade.GetCountryNameAlpha2FromCountryCallingCode(callingCode, &out);
    return out;
}

/// A lookup of a text, or a test whether a key is in a table, which is told as the lookup of the key itself.
struct Lookup
{
    using Function = std::function<std::string(const char*)>;

    const char* name;
    Function manager; ///< null: the facade looks the MCC up, then its country
    Function facade;
    const Rows& rows;
    std::size_t keyColumn;
    std::size_t resultColumn;
    const char* miss;    ///< what the manager logs when nothing is found; null: nothing
    const char* keyName; ///< how the facade calls the key when it is empty
    const char* refused = untouched;
};

#define LOOKUP(name)                                                                                                               \
#name, [](const char* key) { return Ask(manager, &DASimManager::name, key); },                                                 \
        [](const char* key) { return Ask(facade, &DASystem::name, key); }
#define TEST_OF_MCC(name, Key)                                                                                                     \
#name, [](const char* key) { return manager.name(const_cast<char*>(key)) ? key : "(null)"; },                                  \
        [](const char* key) { return facade.name(const_cast<Key>(key)) ? key : "(null)"; }

inline const Lookup kLookups[] = {
    {LOOKUP(GetCountryCodeFromMcc), kCountry, 0, 1, "fail to get countrycode", "mcc"},
    {LOOKUP(GetCountryNameFromMcc), kCountry, 0, 2, "fail to get countryName", "mcc"},
    {LOOKUP(GetMccFromCountryCode), kCountry, 1, 0, "fail to get mcc", "countryCode"},
    {LOOKUP(GetMccFromServiceCountryCode), kService, 1, 0, "fail to get mcc", "serviceCountryCode"},
    {LOOKUP(GetServiceCountryCodeFromMcc), kService, 0, 1, "fail to get serviceCountryCode", "mcc"},
    {LOOKUP(GetCountryCallingCodeFromMcc), kCalling, 0, 2, "fail to get countryCallingCode", "mcc"},
    {LOOKUP(GetAlpha3CountryCodeFromMcc), kCodes, 0, 1, "fail to get alpha3CountryCode", "mcc"},
    {LOOKUP(GetMccFromCountryCallingCode), kCalling, 2, 0, "fail to get mcc", "countryCallingCode"},
    {TEST_OF_MCC(IsValidMcc, const char*), kCountry, 0, 0, "mcc is invalid", "mcc", "(null)"},
    {TEST_OF_MCC(IsMoSupportMcc, const char*), kMo, 0, 0, nullptr, "mcc", "(null)"},
    {"GetCountryNameFromCountryCallingCode", nullptr,
        [](const char* key) { return Ask(facade, &DASystem::GetCountryNameFromCountryCallingCode, key); }, kOfCallingCode, 0, 1,
        "fail to get mcc", "countryCallingCode"},
    {"GetCountryNameAlpha2FromCountryCallingCode", nullptr, Alpha2, kOfCallingCode, 0, 2, "fail to get mcc", "countryCallingCode"},
    {TEST_OF_MCC(IsValidMcc, char*), kCountry, 0, 0, "mcc is invalid", "mcc", "(null)"},
};

#undef LOOKUP
#undef TEST_OF_MCC

/// What the facade gives for a key.
inline std::string Expected(const Lookup& lookup, const std::string& key)
{
    const auto found = FirstMatch(lookup.rows, lookup.keyColumn, key, lookup.resultColumn);
    return found.value_or(key.empty() ? lookup.refused : lookup.manager ? "(null)" : untouched);
}

} // namespace kiv::test

#endif
