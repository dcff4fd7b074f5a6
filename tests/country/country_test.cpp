// Every lookup over every key, against rows that were listed apart from the library's own.
#include "support/LogCapture.h"

#include <DASimManager.h>
#include <DASystem.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <cctype>
#include <cstdlib>
#include <fstream>
#include <functional>
#include <optional>
#include <set>
#include <sstream>
#include <string>
#include <vector>

namespace
{

using kiv::test::LogCapture;
using testing::ElementsAre;

using Lines = std::vector<std::string>;
using Rows = std::vector<std::vector<std::string>>;

Rows Read(const char* file)
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

const Rows kCountry = Read("country.tsv"); // mcc, alpha-2, name
const Rows kService = Read("service.tsv"); // mcc, service country code
const Rows kCodes = Read("codes.tsv");     // mcc, alpha-3, calling code or "-"
const Rows kMo = Read("mo.txt");           // mcc

const Rows kCalling = []
{
    Rows rows = kCodes;
    rows.erase(std::remove_if(rows.begin(), rows.end(), [](const auto& row) { return row[2] == "-"; }), rows.end());
    return rows;
}();

TEST(TheListedRows, AreAsManyAsTheTablesHold)
{
    EXPECT_THAT((std::vector{kCountry.size(), kService.size(), kCodes.size(), kCalling.size(), kMo.size()}),
        ElementsAre(236U, 134U, 237U, 236U, 48U));
}

/// What the first row with that key holds in the result column.
std::optional<std::string> FirstMatch(const Rows& rows, std::size_t keyColumn, const std::string& key, std::size_t resultColumn)
{
    for (const auto& row : rows)
    {
        if (row[keyColumn] == key)
            return row[resultColumn];
    }
    return std::nullopt;
}

/// Every cell of every table, and texts that differ from it by as little as can be.
const std::set<std::string> kManyKeys = []
{
    std::set<std::string> all;
    for (const auto* rows : {&kCountry, &kService, &kCodes})
    {
        for (const auto& row : *rows)
        {
            for (const auto& key : row)
            {
                std::string otherCase = key;
                for (char& ch : otherCase)
                    ch = static_cast<char>(std::isupper(ch) != 0 ? std::tolower(ch) : std::toupper(ch));
                all.insert({key, ' ' + key, key + ' ', '0' + key, '+' + key, key + '0', key.substr(0, key.size() - 1),
                    key.substr(1), otherCase, key + key});
            }
        }
    }
    all.erase("");
    return all;
}();

DASimManager& manager = *DASimManager::GetInstance();
DASystem& facade = *DASystem::GetInstance();
char untouched[] = "(untouched)";

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

/// A lookup of a text, or a test whether a key is in a table, which is told as the lookup of the key itself.
struct Lookup
{
    using Function = std::function<std::string(const char*)>;

    const char* name;
    Function manager;
    Function facade;
    const Rows& rows;
    std::size_t keyColumn;
    std::size_t resultColumn;
    const char* miss;    // what the manager logs when nothing is found; null: nothing
    const char* keyName; // how the facade calls the key when it is empty
    const char* refused = untouched;
};

#define LOOKUP(name)                                                                                                               \
#name, [](const char* key) { return Ask(manager, &DASimManager::name, key); },                                                 \
        [](const char* key) { return Ask(facade, &DASystem::name, key); }
#define TEST_OF_MCC(name, Key)                                                                                                     \
#name, [](const char* key) { return manager.name(const_cast<char*>(key)) ? key : "(null)"; },                                  \
        [](const char* key) { return facade.name(const_cast<Key>(key)) ? key : "(null)"; }

const Lookup kLookups[] = {
    {LOOKUP(GetCountryCodeFromMcc), kCountry, 0, 1, "fail to get countrycode", "mcc"},
    {LOOKUP(GetCountryNameFromMcc), kCountry, 0, 2, "fail to get countryName", "mcc"},
    {LOOKUP(GetMccFromCountryCode), kCountry, 1, 0, "fail to get mcc", "countryCode"},
    {LOOKUP(GetMccFromServiceCountryCode), kService, 1, 0, "fail to get mcc", "serviceCountryCode"},
    {LOOKUP(GetMccFromCountryCallingCode), kCalling, 2, 0, "fail to get mcc", "countryCallingCode"},
    {LOOKUP(GetServiceCountryCodeFromMcc), kService, 0, 1, "fail to get serviceCountryCode", "mcc"},
    {LOOKUP(GetCountryCallingCodeFromMcc), kCalling, 0, 2, "fail to get countryCallingCode", "mcc"},
    {LOOKUP(GetAlpha3CountryCodeFromMcc), kCodes, 0, 1, "fail to get alpha3CountryCode", "mcc"},
    {TEST_OF_MCC(IsValidMcc, char*), kCountry, 0, 0, "mcc is invalid", "mcc", "(null)"},
    {TEST_OF_MCC(IsValidMcc, const char*), kCountry, 0, 0, "mcc is invalid", "mcc", "(null)"},
    {TEST_OF_MCC(IsMoSupportMcc, const char*), kMo, 0, 0, nullptr, "mcc", "(null)"},
};

std::string ManagerError(const std::string& function, const std::string& message)
{
    return "E DASimManager.cpp " + function + " > " + message;
}

std::string FacadeError(const std::string& function, const std::string& emptyText)
{
    return "E DASystem.cpp " + function + " > " + emptyText + " is empty. " + function + " finish.";
}

TEST(CountryLookups, GiveTheFirstRowOfTheKeyAndNothingForAnyOtherText)
{
    LogCapture log;
    for (const auto& lookup : kLookups)
    {
        for (const auto& key : kManyKeys)
        {
            const auto expected = FirstMatch(lookup.rows, lookup.keyColumn, key, lookup.resultColumn);
            ASSERT_EQ(expected.value_or("(null)"), lookup.manager(key.c_str())) << lookup.name << " of " << key;
            ASSERT_EQ(expected.value_or("(null)"), lookup.facade(key.c_str())) << lookup.name << " of " << key;
            const bool isSilent = expected || lookup.miss == nullptr;
            ASSERT_EQ(Lines(isSilent ? 0 : 2, ManagerError(lookup.name, isSilent ? "" : lookup.miss)), log.Take()) << key;
        }
    }
}

/// The alpha-2 lookup hands out text of the library's own, which nobody frees.
const char* Alpha2(const char* callingCode)
{
    char* out = untouched;
    facade.GetCountryNameAlpha2FromCountryCallingCode(callingCode, &out);
    return out;
}

TEST(CountryLookups, TakeANullOrEmptyKeyForAMissInTheManagerAndRefuseItInTheFacade)
{
    LogCapture log;
    for (const char* key : {static_cast<const char*>(nullptr), ""})
    {
        for (const auto& lookup : kLookups)
        {
            EXPECT_EQ("(null)", lookup.manager(key));
            EXPECT_EQ(lookup.miss == nullptr ? Lines() : Lines{ManagerError(lookup.name, lookup.miss)}, log.Take());
            EXPECT_EQ(lookup.refused, lookup.facade(key));
            EXPECT_THAT(log.Take(), ElementsAre(FacadeError(lookup.name, lookup.keyName)));
        }
        EXPECT_EQ(untouched, Ask(facade, &DASystem::GetCountryNameFromCountryCallingCode, key));
        EXPECT_EQ(untouched, Alpha2(key));
        EXPECT_THAT(log.Take(), ElementsAre(FacadeError("GetCountryNameFromCountryCallingCode", "countryCallingCode"),
                                    FacadeError("GetCountryNameAlpha2FromCountryCallingCode", "countryCallingCode")));
    }
}

TEST(CallingCodes, GiveTheFirstNameAndTheLastAlpha2CodeOfTheirMcc)
{
    LogCapture log;
    const Rows reversed(kCountry.rbegin(), kCountry.rend());
    const std::string missing = ManagerError("GetMccFromCountryCallingCode", "fail to get mcc");
    const Lines errors = {missing, FacadeError("GetCountryNameFromCountryCallingCode", "mcc"), missing,
        FacadeError("GetCountryNameAlpha2FromCountryCallingCode", "mcc")};
    for (const auto& key : kManyKeys)
    {
        const auto mcc = FirstMatch(kCalling, 2, key, 0);
        const std::string name = mcc ? *FirstMatch(kCountry, 0, *mcc, 2) : untouched;
        ASSERT_EQ(name, Ask(facade, &DASystem::GetCountryNameFromCountryCallingCode, key.c_str())) << key;
        const char* const alpha2 = Alpha2(key.c_str());
        ASSERT_EQ(mcc ? *FirstMatch(reversed, 0, *mcc, 1) : untouched, alpha2) << key;
        ASSERT_EQ(mcc ? Lines() : errors, log.Take()) << key;
        ASSERT_EQ(alpha2, Alpha2(key.c_str())) << "another pointer for " << key;
        log.Take();
    }
    EXPECT_STREQ("mq", Alpha2("590"));
    EXPECT_STREQ("mq", Alpha2("596"));
}

} // namespace
