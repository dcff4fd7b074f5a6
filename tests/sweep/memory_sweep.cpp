// Every operation on every profile, with each allocation of the library's own failing in its turn: alone, and with all that
// follow. The library's are those that it and its support library make, in the code of the standard library too; GLib ends the
// process where it finds no memory, so its own are left alone. To make a named lock counts as one. What is lost, LeakSanitizer
// tells.
#include "sweep/Sweep.h"

#include <DAConnectionManager.h>
#include <DADBusManager.h>
#include <DASimManager.h>
#include <DASystem.h>

#include <cstring>
#include <dlfcn.h>
#include <execinfo.h>
#include <iostream>
#include <link.h>
#include <new>

namespace
{

/// What is done to the allocations of the one thread that runs the operation.
struct Injection
{
    bool isArmed = false;
    unsigned first = 0, last = 0; ///< those that fail
    unsigned seen = 0, failed = 0;
    const char* lockOfInstance = ""; ///< held when the last instance was made
};
thread_local Injection injection;

bool IsIn(const char* library, const void* code)
{
    dl_find_object object{};
    return _dl_find_object(const_cast<void*>(code), &object) == 0 && std::strstr(object.dlfo_link_map->l_name, library) != nullptr;
}

/// Whether an allocation is made for the library: by its code, or by the standard library's that its code called.
bool IsOwn(const void* caller)
{
    if (IsIn("libstdc++", caller))
    {
        void* frames[24];
        void** const end = frames + backtrace(frames, std::size(frames));
        void** const owner =
            std::find_if(std::find(frames, end, caller), end, [](const void* frame) { return !IsIn("libstdc++", frame); });
        return owner != end && IsOwn(*owner);
    }
    return IsIn("libkiv_system", caller) || IsIn("libkiv_util", caller);
}

bool FailsNext()
{
    ++injection.seen;
    const bool fails = injection.seen >= injection.first && injection.seen <= injection.last;
    injection.failed += fails ? 1 : 0;
    return fails;
}

bool Fails(const void* caller)
{
    if (!injection.isArmed)
        return false;
    injection.isArmed = false; // what this code needs itself
    const bool fails = IsOwn(caller) && FailsNext();
    injection.isArmed = true;
    return fails;
}

} // namespace

// The library calls these, in the code of the standard library too; the sanitizers let them be replaced.
extern "C" char* strdup(const char* text) noexcept
{
    const std::size_t size = std::strlen(text) + 1;
    void* const copy = Fails(__builtin_return_address(0)) ? nullptr : std::malloc(size);
    return static_cast<char*>(copy == nullptr ? nullptr : std::memcpy(copy, text, size));
}

void* operator new(std::size_t size)
{
    void* const made = Fails(__builtin_return_address(0)) ? nullptr : std::malloc(size);
    return made == nullptr ? throw std::bad_alloc() : made;
}

void* operator new(std::size_t size, const std::nothrow_t&) noexcept
{
    if (injection.isArmed)
        injection.lockOfInstance = kiv::test::heldLock;
    return Fails(__builtin_return_address(0)) ? nullptr : std::malloc(size);
}

void operator delete(void* memory) noexcept
{
    std::free(memory);
}

void operator delete(void* memory, std::size_t) noexcept
{
    std::free(memory);
}

namespace
{

using namespace kiv::test;

/// Leaves the instance of a class if it is the one whose member is called, or if this is not the first use of the library.
template <class S>
void Prepare(const std::string& name, const Operation& operation, bool isFirstUse)
{
    delete std::exchange(S::__pInstance, nullptr);
    if (!isFirstUse || (operation.name.find(name + "::") == 0 && operation.name != name + "::GetInstance()"))
        S::GetInstance();
}

struct MemorySweep : Sweep
{
    MemorySweep()
    {
        void* frames[2];
        backtrace(frames, 2); // loads what it needs
        int error = 0;
        connection.reset(DADBusManager::GetInstance()->InitDbusConnection(&error));
    }

    Story TryFailing(const Operation& operation, unsigned first, unsigned last)
    {
        const auto arm = [&]
        {
            if (isFirstUse)
                lockNames.clear();
            Prepare<DASystem>("DASystem", operation, isFirstUse);
            Prepare<DASimManager>("DASimManager", operation, isFirstUse);
            Prepare<DADBusManager>("DADBusManager", operation, isFirstUse);
            Prepare<DAConnectionManager>("DAConnectionManager", operation, isFirstUse);
            log.Take();
            isLockRefused = [] { return injection.isArmed && FailsNext(); };
            injection = {true, first, last, 0, 0, ""};
        };
        const auto disarm = [&]
        {
            isLockRefused = nullptr;
            injection.isArmed = false;
        };
        return Try(operation, arm, disarm);
    }

    /// Lets every allocation fail in its turn until there is none left. @return how many failed
    unsigned TryAll(const Operation& operation)
    {
        const Story untouched = TryFailing(operation, 0, 0);
        Story allowed = untouched;
        for (const Operation& other : Operations()) // the classes may not come into being
            if (other.failing.size() == 1 && other.failing[0].story[0] == "none")
                allowed.push_back(other.failing[0].story[1]);
        unsigned injections = 0;
        for (const unsigned length : Lengths())
        {
            for (unsigned number = 1;; ++number)
            {
                const Story story = TryFailing(operation, number, number + length - 1);
                injections += injection.failed;
                if (injection.failed == 0)
                {
                    EXPECT_EQ(untouched, story) << operation.name;
                    break;
                }
                EXPECT_TRUE(MayBe(operation, story, allowed)) << "allocation " << number;
            }
        }
        return injections;
    }

    bool isFirstUse = true; ///< of the library: no class has an instance, no lock was named
    Connection connection;  ///< held, so that not every operation has to connect
};

TEST_F(MemorySweep, GivesFailureResultsWhicheverAllocationFails)
{
    unsigned injections = 0;
    for (const std::string& name : Devices())
    {
        SCOPED_TRACE(name);
        Use(name);
        for (const Operation& operation : Operations())
        {
            const bool isOnBus = operation.kind == Kind::kBus || operation.kind == Kind::kPush;
            if ((operation.needsHandle && device.slots.empty()) || (isOnBus && name != "dual"))
                continue;
            for (const bool isFirst : {true, false})
            {
                isFirstUse = isFirst;
                injections += TryAll(operation);
            }
        }
    }
    std::cout << injections << " allocations failed\n";
    EXPECT_GT(injections, 10'000U);
}

TEST_F(MemorySweep, MakesEachInstanceUnderItsNamedLockOnFirstUseAndNotBefore)
{
    const std::pair<std::string, std::string> expected[] = {{"DASystem::GetInstance()", "DASystem.cpp::GetInstance"},
        {"DASimManager::GetInstance()", "DASimManager.cpp::GetInstance"},
        {"DADBusManager::GetInstance()", "DADBusManager.cpp::GetInstance"},
        {"DAConnectionManager::GetInstance()", "DAConnectionManager.cpp::GetInstance"}, {"DASystem::IsFlightMode()", ""},
        {"DASystem::IsValidMcc(char*)", "DASimManager.cpp::GetInstance"},
        {"DASystem::GetBTNetworkState()", "DAConnectionManager.cpp::GetInstance"},
        {"DASystem::GetDeviceUniqueID(char const**)", "DADBusManager.cpp::GetInstance"}};
    for (const auto& [name, lock] : expected)
    {
        const Operation& operation = Find(name);
        isFirstUse = true;
        EXPECT_EQ(operation.good, TryFailing(operation, 0, 0));
        EXPECT_EQ(lock, injection.lockOfInstance) << name;
        EXPECT_EQ(lock.empty() ? 0U : 1U, lockNames.count(lock));
        isFirstUse = false;
        TryFailing(operation, 0, 0);
        EXPECT_STREQ("", injection.lockOfInstance) << name << " made another";
    }
}

} // namespace
