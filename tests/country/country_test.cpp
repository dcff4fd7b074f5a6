// Every lookup with every key, compared with rows written independently of the library's.
#include "support/LogCapture.h"
#include "support/Texts.h"

#include <DASimManager.h>
#include <DASystem.h>

namespace
{

using namespace kiv::test;
using Lines = std::vector<std::string>;

/// The rows of the tables, written independently of the library's.
const Rows kCountry = Read("country.tsv"); // mcc, alpha-2, name
const Rows kService = Read("service.tsv"); // mcc, service country code
const Rows kCodes = Read("codes.tsv");     // mcc, alpha-3, calling code or "-"
const Rows kMo = Read("mo.txt");           // mcc

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

auto Text(void (DASystem::*lookup)(const char*, char**), void (*release)(void*) = std::free)
{
    return [=](const char* key)
    { return Out([=](char** out) { std::invoke(lookup, DASystem::GetInstance(), key, out); }, release); };
}

auto Test(bool (DASystem::*test)(const char*))
{
    return [=](const char* key) { return std::string(std::invoke(test, DASystem::GetInstance(), key) ? key : "false"); };
}

/// Returns the answer for a calling code by way of its MCC.
Column ByCallingCode(const Column& ofMcc)
{
    Column found = Find(kCodes, 2, 0);
    for (auto& [callingCode, answer] : found)
        answer = ofMcc.at(answer);
    return found;
}

/// If two countries share an MCC, the last one is the answer.
const Column kLastAlpha2 = Find(Rows(kCountry.rbegin(), kCountry.rend()), 0, 1);

#define TEXT(name) #name, Text(&DASystem::name)

const Lookup kLookups[] = {
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
    ASSERT_EQ(
        (std::vector<std::size_t>{236, 134, 237, 48}), (std::vector{kCountry.size(), kService.size(), kCodes.size(), kMo.size()}));
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
