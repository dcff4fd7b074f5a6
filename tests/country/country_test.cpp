// Every lookup over every key, against rows that were listed apart from the library's own.
#include "country/Lookups.h"
#include "support/LogCapture.h"

#include <cctype>

namespace
{

using namespace kiv::test;
using Lines = std::vector<std::string>;

TEST(TheListedRows, AreAsManyAsTheTablesHold)
{
    EXPECT_THAT((std::vector{kCountry.size(), kService.size(), kCodes.size(), kCalling.size(), kMo.size()}),
        testing::ElementsAre(236U, 134U, 237U, 236U, 48U));
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

std::string FacadeError(const std::string& function, const std::string& emptyText)
{
    return "E DASystem.cpp " + function + " > " + emptyText + " is empty. " + function + " finish.";
}

/// What the manager logs, and the facade when a calling code leads nowhere.
Lines Missed(const Lookup& lookup)
{
    const std::string place = "E DASimManager.cpp " + std::string(lookup.manager ? lookup.name : "GetMccFromCountryCallingCode");
    Lines lines(lookup.miss == nullptr ? 0 : 1, place + " > " + (lookup.miss == nullptr ? "" : lookup.miss));
    if (!lookup.manager)
        lines.push_back(FacadeError(lookup.name, "mcc"));
    return lines;
}

TEST(CountryLookups, GiveTheRowOfTheKeyAndNothingForAnyOtherText)
{
    LogCapture log;
    for (const auto& lookup : kLookups)
    {
        for (const auto& key : kManyKeys)
        {
            const std::string expected = Expected(lookup, key);
            const Lines lines = expected == "(null)" || expected == untouched ? Missed(lookup) : Lines();
            ASSERT_EQ(expected, lookup.facade(key.c_str())) << lookup.name << " of " << key;
            ASSERT_EQ(lines, log.Take()) << lookup.name << " of " << key;
            if (!lookup.manager)
                continue;
            ASSERT_EQ(expected, lookup.manager(key.c_str())) << lookup.name << " of " << key;
            ASSERT_EQ(lines, log.Take()) << lookup.name << " of " << key;
        }
    }
}

TEST(CountryLookups, TakeANullOrEmptyKeyForAMissInTheManagerAndRefuseItInTheFacade)
{
    LogCapture log;
    for (const char* key : {static_cast<const char*>(nullptr), ""})
    {
        for (const auto& lookup : kLookups)
        {
            EXPECT_EQ(lookup.refused, lookup.facade(key));
            EXPECT_EQ(Lines{FacadeError(lookup.name, lookup.keyName)}, log.Take());
            if (!lookup.manager)
                continue;
            EXPECT_EQ("(null)", lookup.manager(key));
            EXPECT_EQ(Missed(lookup), log.Take());
        }
    }
}

TEST(CountryLookups, GiveTheSameAlpha2TextEachTime)
{
    for (const auto& row : kOfCallingCode)
        EXPECT_EQ(Alpha2(row[0].c_str()), Alpha2(row[0].c_str())) << row[0];
    EXPECT_STREQ("mq", Alpha2("590"));
    EXPECT_STREQ("mq", Alpha2("596"));
}

} // namespace
