// Every operation on every profile, with each allocation of the library's own failing in its turn: alone, and with all that
// follow. The library's are those that it and its support library make, in the code of the standard library too; GLib ends the
// process where it finds no memory, so its own are left alone. To make a named lock counts as one.
#include "sweep/Sweep.h"

#include <DAConnectionManager.h>
#include <DADBusManager.h>
#include <DASimManager.h>
#include <DASystem.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <execinfo.h>
#include <iostream>
#include <link.h>
#include <new>
#include <utility>

namespace
{

/// Where a shared library is mapped.
struct Range
{
    bool Has(const void* address) const { return address >= begin && address < end; }

    const char *begin = nullptr, *end = nullptr;
};

Range RangeOf(const char* name)
{
    std::pair<const char*, Range> search{name, {}};
    const auto look = [](dl_phdr_info* info, std::size_t, void* data)
    {
        auto& [wanted, range] = *static_cast<std::pair<const char*, Range>*>(data);
        for (int i = 0; std::strstr(info->dlpi_name, wanted) != nullptr && i < info->dlpi_phnum; ++i)
        {
            const auto& part = info->dlpi_phdr[i];
            if (part.p_type == PT_LOAD && (part.p_flags & PF_X) != 0)
                range = {reinterpret_cast<char*>(info->dlpi_addr + part.p_vaddr),
                    reinterpret_cast<char*>(info->dlpi_addr + part.p_vaddr + part.p_memsz)};
        }
        return 0;
    };
    dl_iterate_phdr(look, &search);
    return search.second;
}

Range systemCode, utilCode, standardCode;

/// What is done to the allocations of the one thread that runs the operation.
struct Injection
{
    bool isArmed = false;
    unsigned first = 0, last = 0; ///< those that fail
    unsigned seen = 0, failed = 0;
    std::array<void*, 64> live{}; ///< what the library holds, its support library apart, which may keep what it opened
};
thread_local Injection injection;

const void* OwnerOf(const void* caller)
{
    if (!standardCode.Has(caller))
        return caller;
    void* frames[24];
    void** const end = frames + backtrace(frames, std::size(frames));
    void** const owner =
        std::find_if(std::find(frames, end, caller), end, [](const void* frame) { return !standardCode.Has(frame); });
    return owner == end ? nullptr : *owner;
}

bool FailsNext()
{
    ++injection.seen;
    const bool fails = injection.seen >= injection.first && injection.seen <= injection.last;
    injection.failed += fails ? 1 : 0;
    return fails;
}

/// Makes an allocation for whoever calls the allocator, or lets it fail.
template <class Make>
auto Allocate(const void* caller, Make make) -> decltype(make())
{
    if (!injection.isArmed)
        return make();
    injection.isArmed = false; // what this code needs itself
    const void* const owner = OwnerOf(caller);
    const bool isOwn = systemCode.Has(owner);
    const auto made = (isOwn || utilCode.Has(owner)) && FailsNext() ? nullptr : make();
    if (isOwn && made != nullptr)
        *std::find(injection.live.begin(), injection.live.end(), nullptr) = made;
    injection.isArmed = true;
    return made;
}

void Forget(void* memory)
{
    if (memory != nullptr && injection.isArmed)
        std::replace(injection.live.begin(), injection.live.end(), memory, static_cast<void*>(nullptr));
}

} // namespace

// The allocators of the sanitizers can not be replaced, but for these of the language and for strdup().
#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
#define KIV_MALLOC std::malloc
#define KIV_FREE std::free
#else
#define KIV_MALLOC __libc_malloc
#define KIV_FREE __libc_free
extern "C" void* __libc_malloc(std::size_t size) noexcept;
extern "C" void __libc_free(void* memory) noexcept;

extern "C" void* malloc(std::size_t size) noexcept
{
    return Allocate(__builtin_return_address(0), [&] { return KIV_MALLOC(size); });
}

extern "C" void free(void* memory) noexcept
{
    Forget(memory);
    KIV_FREE(memory);
}
#endif

extern "C" char* strdup(const char* text) noexcept
{
    const std::size_t size = std::strlen(text) + 1;
    return Allocate(__builtin_return_address(0),
        [&]
        {
            void* const copy = KIV_MALLOC(size);
            return static_cast<char*>(copy == nullptr ? nullptr : std::memcpy(copy, text, size));
        });
}

void* operator new(std::size_t size)
{
    void* const made = Allocate(__builtin_return_address(0), [&] { return KIV_MALLOC(size); });
    return made == nullptr ? throw std::bad_alloc() : made;
}

void* operator new(std::size_t size, const std::nothrow_t&) noexcept
{
    return Allocate(__builtin_return_address(0), [&] { return KIV_MALLOC(size); });
}

void operator delete(void* memory) noexcept
{
    Forget(memory);
    KIV_FREE(memory);
}

void operator delete(void* memory, std::size_t) noexcept
{
    operator delete(memory);
}

namespace
{

using namespace kiv::test;

void ForgetInstances()
{
    delete std::exchange(DASystem::__pInstance, nullptr);
    delete std::exchange(DASimManager::__pInstance, nullptr);
    delete std::exchange(DADBusManager::__pInstance, nullptr);
    delete std::exchange(DAConnectionManager::__pInstance, nullptr);
}

/// Leaves the instance of the class whose member is called, if it is the first use; else all.
void PrepareInstances(const Operation& operation, bool isFirstUse)
{
    ForgetInstances();
    const auto isNeeded = [&](const std::string& name)
    { return !isFirstUse || (operation.name.find(name + "::") == 0 && operation.name != name + "::GetInstance()"); };
    if (isNeeded("DASystem"))
        DASystem::GetInstance();
    if (isNeeded("DASimManager"))
        DASimManager::GetInstance();
    if (isNeeded("DADBusManager"))
        DADBusManager::GetInstance();
    if (isNeeded("DAConnectionManager"))
        DAConnectionManager::GetInstance();
}

struct MemorySweep : Sweep
{
    MemorySweep()
    {
        systemCode = RangeOf("libkiv_system");
        utilCode = RangeOf("libkiv_util");
        standardCode = RangeOf("libstdc++");
        void* frames[2];
        backtrace(frames, 2); // loads what it needs
        int error = 0;
        connection.reset(DADBusManager::GetInstance()->InitDbusConnection(&error));
    }

    Story TryFailing(const Operation& operation, unsigned first, unsigned last)
    {
        const auto arm = [&]
        {
            PrepareInstances(operation, isFirstUse);
            if (isFirstUse)
                lockNames.clear();
            log.Take();
            isLockRefused = [] { return injection.isArmed && FailsNext(); };
            injection = {true, first, last, 0, 0, {}};
        };
        const auto disarm = [&]
        {
            isLockRefused = nullptr;
            if (isFirstUse)
                ForgetInstances();
            injection.isArmed = false;
        };
        const Story story = Try(operation, arm, disarm);
#if !defined(__SANITIZE_ADDRESS__) && !defined(__SANITIZE_THREAD__) // else LeakSanitizer tells
        EXPECT_THAT(injection.live, testing::Each(nullptr)) << operation.name << " at allocation " << first;
#endif
        return story;
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
        for (const bool isOnce : {true, false})
        {
            for (unsigned number = 1;; ++number)
            {
                const Story story = TryFailing(operation, number, isOnce ? number : ~0U);
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

TEST_F(MemorySweep, GivesFailureResultsAndLosesNothingWhicheverAllocationFails)
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

} // namespace
