// Every operation on every profile. Each allocation of the library fails in turn: only that one, and with all later ones. These are
// the allocations of the library and its support library, also in code of the standard library. GLib ends the process when there is
// no memory, so its allocations succeed. Making a named lock counts as an allocation. LeakSanitizer reports lost memory.
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

/// Controls the allocations of the one thread that runs the operation.
struct Injection
{
    bool isArmed = false;
    unsigned first = 0, last = 0; ///< numbers of those that fail
    unsigned seen = 0, failed = 0;
    const char* lockOfInstance = ""; ///< lock held when the last instance was made
};
thread_local Injection injection;

bool IsIn(const char* library, const void* code)
{
    dl_find_object object{};
    return _dl_find_object(const_cast<void*>(code), &object) == 0 && std::strstr(object.dlfo_link_map->l_name, library) != nullptr;
}

/// Whether an allocation is made by the library's code, or by the standard library for it.
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
    injection.isArmed = false; // this code allocates too
    const bool fails = IsOwn(caller) && FailsNext();
    injection.isArmed = true;
    return fails;
}

} // namespace

// The library calls these, also in code of the standard library. Sanitizers allow replacing them.
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

/// Removes the instance of a class, except the one whose member is called.
template <class S>
void Forget(const std::string& name, const Operation& operation)
{
    delete std::exchange(S::__pInstance, nullptr);
    if (operation.name.find(name + "::") == 0 && operation.name != name + "::GetInstance()")
        S::GetInstance();
}

struct MemorySweep : Sweep
{
    MemorySweep()
    {
        void* frames[2];
        backtrace(frames, 2); // loads its libraries
        int error = 0;
        connection.reset(DADBusManager::GetInstance()->InitDbusConnection(&error));
        isLockRefused = [] { return injection.isArmed && FailsNext(); };
    }
    ~MemorySweep() override { isLockRefused = nullptr; }

    /// Lets allocations fail as in the first use of the library: without instances and named locks.
    Story TryFailing(const Operation& operation, unsigned first, unsigned last)
    {
        const auto arm = [&]
        {
            lockNames.clear();
            Forget<DASystem>("DASystem", operation);
            Forget<DASimManager>("DASimManager", operation);
            Forget<DADBusManager>("DADBusManager", operation);
            Forget<DAConnectionManager>("DAConnectionManager", operation);
            log.Take();
            injection = {true, first, last, 0, 0, ""};
        };
        return Try(operation, arm, [] { injection.isArmed = false; });
    }

    /// Lets every allocation fail in turn. @return how many failed
    unsigned TryAll(const Operation& operation)
    {
        const Story untouched = TryFailing(operation, 0, 0);
        Story allowed = untouched;
        for (const Operation& other : Operations()) // the classes cannot be made
            if (other.failing.size() == 1 && other.failing[0].story[0] == "none")
                allowed.push_back(other.failing[0].story[1]);
        unsigned injections = 0;
        for (unsigned number = 1;; ++number)
        {
            for (const unsigned length : Lengths())
            {
                const Story story = TryFailing(operation, number, number + length - 1);
                injections += injection.failed;
                EXPECT_TRUE(MayBe(operation, story, allowed)) << "allocation " << number;
                EXPECT_TRUE(injection.failed > 0 || story == untouched) << operation.name;
                if (injection.failed < length)
                    break;
            }
            if (injection.failed == 0)
                return injections;
        }
    }

    Connection connection; ///< held, so that not every operation connects
};

TEST_F(MemorySweep, ReturnsFailureResultsWhicheverAllocationFails)
{
    unsigned injections = 0;
    for (const std::string& name : Devices())
    {
        SCOPED_TRACE(name);
        Use(name);
        for (const Operation& operation : Operations())
        {
            const bool isOnBus = operation.kind == Kind::Bus || operation.kind == Kind::Push;
            if ((!operation.needsHandle || !device.slots.empty()) && (!isOnBus || name == "dual"))
                injections += TryAll(operation);
        }
    }
    std::cout << injections << " allocations failed\n";
    EXPECT_GT(injections, 10'000U);
}

TEST_F(MemorySweep, MakesEachInstanceUnderItsLockOrLogsThatItCannot)
{
    for (const std::string name : {"DASystem", "DASimManager", "DADBusManager", "DAConnectionManager"})
    {
        const Operation& operation = Find(name + "::GetInstance()");
        TryFailing(operation, 0, 0);
        EXPECT_EQ(name + ".cpp::GetInstance", injection.lockOfInstance);
        for (const unsigned allocation : {1U, 2U}) // of the lock's name, and of the instance
            EXPECT_EQ(operation.failing.at(0).story, TryFailing(operation, allocation, allocation)) << name << ", " << allocation;
    }
}

} // namespace
