#include "Naive.h"

#include "CountryTables.h"

#include <cstdio>
#include <cstring>
#include <glib.h>
#include <map>
#include <mutex>
#include <new>
#include <string>

namespace naive
{

namespace
{

std::mutex& Named(const char* name)
{
    static std::mutex guard;
    static std::map<std::string, std::mutex> locks;
    const std::lock_guard<std::mutex> lock(guard);
    return locks[name];
}

Manager* instance = nullptr;

} // namespace

Manager* Manager::GetInstance()
{
    char name[128];
    std::snprintf(name, sizeof name, "%s::%s", "Naive.cpp", "GetInstance");
    const std::lock_guard<std::mutex> lock(Named(name));
    if (instance == nullptr)
        instance = new (std::nothrow) Manager;
    return instance;
}

void Manager::GetCountryNameFromMcc(const char* mcc, char** countryName)
{
    for (const auto& row : kiv::listed::kCountryInfo)
    {
        if (g_strcmp0(row.mcc, mcc) == 0)
        {
            *countryName = strdup(row.countryName);
            return;
        }
    }
    *countryName = nullptr;
}

void GetCountryNameFromMcc(const char* mcc, char** countryName)
{
    if (mcc == nullptr || *mcc == '\0')
        return;
    char* found = nullptr;
    Manager::GetInstance()->GetCountryNameFromMcc(mcc, &found);
    *countryName = found;
}

} // namespace naive
