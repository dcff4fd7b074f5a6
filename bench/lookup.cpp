#include "Items.h"
#include "Ratios.h"

#include <DASimManager.h>
#include <DASystem.h>
#include <Naive.h>

#include <cstdlib>
#include <iterator>

namespace kiv::bench
{

namespace
{

#define KIV_COUNTRY(mcc, countryCode, countryName) mcc,
#define KIV_COUNTRY_MO KIV_COUNTRY
constexpr const char* kMccs[] = {
#include "../lib/DASystem/src/tables/CountryInfo.inc"
};
constexpr const char* kLastMcc = kMccs[std::size(kMccs) - 1];

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

Body WorstKey(void (*lookup)(const char*))
{
    return [lookup](benchmark::State& state)
    {
        for (auto _ : state)
            lookup(kLastMcc);
    };
}

Body EveryKey(void (*lookup)(const char*))
{
    return [lookup](benchmark::State& state)
    {
        for (auto _ : state)
        {
            for (const char* mcc : kMccs)
                lookup(mcc);
        }
    };
}

template <class Class>
Body Instance()
{
    return [](benchmark::State& state)
    {
        for (auto _ : state)
            benchmark::DoNotOptimize(Class::GetInstance());
    };
}

} // namespace

void AddLookups()
{
    Compare("facade lookup, worst key, against naive", {0.12}, Clock::Cpu, WorstKey(LibraryLookup), WorstKey(NaiveLookup));
    Compare("facade lookup, all keys, against naive", {0.15}, Clock::Cpu, EveryKey(LibraryLookup), EveryKey(NaiveLookup));
    Compare("GetInstance(), one thread, against naive", {0.25}, Clock::Cpu, Instance<DASimManager>(), Instance<naive::Manager>());
    Compare(
        "GetInstance(), two threads, against naive", {0.35}, Clock::Wall, Instance<DASimManager>(), Instance<naive::Manager>(), 2);
}

} // namespace kiv::bench
