#include "../lib/DASystem/src/CountryTables.h"
#include "Items.h"
#include "Ratios.h"

#include <DASimManager.h>
#include <DASystem.h>
#include <Naive.h>

#if KIV_HAVE_PHONENUMBER
#include <phonenumbers/phonenumberutil.h>
#endif

#include <cstdlib>
#include <iterator>
#include <thread>

namespace kiv::bench
{

namespace
{

constexpr const auto& kCountries = listed::kCountryInfo;
constexpr const char* kLastMcc = kCountries[std::size(kCountries) - 1].mcc;

void LibraryLookup(const char* mcc)
{
    static DASystem* const facade = DASystem::GetInstance();
    char* name = nullptr;
    facade->GetCountryNameFromMcc(mcc, &name);
    benchmark::DoNotOptimize(name);
    std::free(name);
}

void NaiveLookup(const char* mcc)
{
    char* name = nullptr;
    naive::GetCountryNameFromMcc(mcc, &name);
    benchmark::DoNotOptimize(name);
    std::free(name);
}

Side WorstKey(void (*lookup)(const char*))
{
    return {Times(1000, [lookup] { lookup(kLastMcc); })};
}

Side EveryKey(void (*lookup)(const char*))
{
    return {[lookup]
        {
            for (const auto& country : kCountries)
                lookup(country.mcc);
        }};
}

constexpr int kInstances = 10'000;

template <class Class>
Batch Instances(int count = kInstances)
{
    return Times(count, [] { benchmark::DoNotOptimize(Class::GetInstance()); });
}

/// In two threads at once, long enough to make the start of a thread negligible.
template <class Class>
Side InstancesInTwoThreads()
{
    return {[batch = Instances<Class>(50 * kInstances)]
        {
            std::thread other(batch);
            batch();
            other.join();
        }};
}

constexpr const char* kByMcc = "facade lookup by MCC, all keys, against libphonenumber";
constexpr const char* kByCallingCode = "facade lookup by calling code, all keys, against libphonenumber";

#if KIV_HAVE_PHONENUMBER

/// Returns the calling codes of all countries.
std::vector<std::string> CallingCodes()
{
    std::vector<std::string> codes;
    for (const auto& country : kCountries)
    {
        char* code = nullptr;
        DASystem::GetInstance()->GetCountryCallingCodeFromMcc(country.mcc, &code);
        if (code != nullptr)
            codes.emplace_back(code);
        std::free(code);
    }
    return codes;
}

/// Compares lookups of alpha-2 codes. The other library takes a calling code as a number.
void CompareRegions(Table& table)
{
    DASystem* const facade = DASystem::GetInstance();
    const std::vector<std::string> codes = CallingCodes();
    std::vector<int> numbers;
    for (const std::string& code : codes)
        numbers.push_back(std::stoi(code));

    const auto byMcc = [&]
    {
        for (std::size_t i = 0; i < codes.size(); ++i)
        {
            char* region = nullptr;
            facade->GetCountryCodeFromMcc(kCountries[i].mcc, &region);
            benchmark::DoNotOptimize(region);
            std::free(region);
        }
    };
    const auto byCallingCode = [&]
    {
        for (const std::string& code : codes)
        {
            char* region = nullptr;
            facade->GetCountryNameAlpha2FromCountryCallingCode(code.c_str(), &region);
            benchmark::DoNotOptimize(region);
        }
    };
    const auto other = [&]
    {
        for (const int number : numbers)
        {
            std::string region;
            i18n::phonenumbers::PhoneNumberUtil::GetInstance()->GetRegionCodeForCountryCode(number, &region);
            benchmark::DoNotOptimize(region);
        }
    };
    const auto calls = static_cast<double>(codes.size());
    Compare(table, {kByMcc, {0.85}, CpuNs, calls, {byMcc}, {other}});
    Compare(table, {kByCallingCode, {0.85}, CpuNs, calls, {byCallingCode}, {other}});
}

#else

void CompareRegions(Table& table)
{
    for (const char* const item : {kByMcc, kByCallingCode})
    {
        if (table.Wants(item))
            table.Add({item, "<= 0.85", Outcome::NotMeasured, 0, 0, 0, {}, "libphonenumber-dev is not installed"});
    }
}

#endif

} // namespace

void MeasureLookups(Table& table)
{
    Compare(
        table, {"facade lookup, worst key, against naive", {0.12}, CpuNs, 1000, WorstKey(LibraryLookup), WorstKey(NaiveLookup)});
    Compare(table, {"facade lookup, all keys, against naive", {0.15}, CpuNs, std::size(kCountries), EveryKey(LibraryLookup),
                       EveryKey(NaiveLookup)});
    CompareRegions(table);
    Compare(table, {"GetInstance(), one thread, against naive", {0.25}, CpuNs, kInstances, {Instances<DASimManager>()},
                       {Instances<naive::Manager>()}});
    Compare(table, {"GetInstance(), two threads, against naive", {0.35}, WallNs, 100 * kInstances,
                       InstancesInTwoThreads<DASimManager>(), InstancesInTwoThreads<naive::Manager>()});
}

} // namespace kiv::bench
