// Every lookup with every key, compared with rows written independently of the library's.
#include "country/Lookups.h"
#include "support/LogCapture.h"

#include <DASimManager.h>

namespace
{

using namespace kiv::test;
using Lines = std::vector<std::string>;

TEST(TheListedRows, AreAsManyAsTheTablesHold)
{
    EXPECT_EQ(
        (std::vector<std::size_t>{236, 134, 237, 48}), (std::vector{kCountry.size(), kService.size(), kCodes.size(), kMo.size()}));
}

/// Every key and answer of every lookup, and texts that differ only slightly from them.
std::set<std::string> ManyKeys()
{
    std::set<std::string> keys;
    for (const Lookup& lookup : kLookups)
    {
        for (const auto& [key, answer] : lookup.answers)
        {
            std::string otherCase = key;
            otherCase[0] = static_cast<char>(otherCase[0] ^ 0x20);
            keys.insert({key, answer, ' ' + key, key + '0', key.substr(0, key.size() - 1), otherCase, key + key});
        }
    }
    keys.erase("");
    return keys;
}

std::string Refused(const std::string& function, const std::string& keyName)
{
    return "E DASystem.cpp " + function + " > " + keyName + " is empty. " + function + " finish.";
}

Lines Missed(const Lookup& lookup)
{
    const std::string manager = "E DASimManager.cpp ";
    if (lookup.none == "untouched") // it lacks the MCC that it needs
        return {manager + "GetMccFromCountryCallingCode > fail to get mcc", Refused(lookup.name, "mcc")};
    return lookup.miss == nullptr ? Lines() : Lines{manager + lookup.name + " > " + lookup.miss};
}

TEST(CountryLookups, ReturnTheRowWithExactlyThisKey)
{
    const std::set<std::string> keys = ManyKeys();
    LogCapture log;
    for (const Lookup& lookup : kLookups)
    {
        for (const std::string& key : keys)
        {
            ASSERT_EQ(lookup.Answer(key), lookup.ask(key.c_str())) << lookup.name << " of " << key;
            ASSERT_EQ(lookup.answers.count(key) != 0 ? Lines() : Missed(lookup), log.Take()) << lookup.name << " of " << key;
        }
    }
}

TEST(CountryLookups, RefuseANullOrEmptyKeyOnlyInTheFacade)
{
    LogCapture log;
    for (const char* const key : {static_cast<const char*>(nullptr), ""})
    {
        for (const Lookup& lookup : kLookups)
        {
            EXPECT_EQ(lookup.Answer(""), lookup.ask(key));
            EXPECT_EQ(Lines{Refused(lookup.name, lookup.keyName)}, log.Take());
        }
        for (const auto lookup : {&DASimManager::GetCountryNameFromMcc, &DASimManager::GetMccFromServiceCountryCode})
            EXPECT_EQ("null", Out([&](char** out) { std::invoke(lookup, DASimManager::GetInstance(), key, out); }));
        EXPECT_THAT(log.Take(), testing::ElementsAre("E DASimManager.cpp GetCountryNameFromMcc > fail to get countryName",
                                    "E DASimManager.cpp GetMccFromServiceCountryCode > fail to get mcc"));
    }
}

} // namespace
