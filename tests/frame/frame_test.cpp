// How the four classes come into being. The named locks and the allocation that does not throw are this program's own, so that it
// sees which lock is held when, and lets an allocation fail or take long.
#include "support/LogCapture.h"

#include <DAConnectionManager.h>
#include <DADBusManager.h>
#include <DAMutex.h>
#include <DASimManager.h>
#include <DASystem.h>

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <condition_variable>
#include <functional>
#include <mutex>
#include <new>
#include <set>
#include <thread>
#include <type_traits>
#include <utility>

namespace
{

/// Every named lock of the process, and what happens inside it.
struct
{
    std::mutex mutex;
    std::condition_variable changed;
    std::set<std::string> held;
    std::vector<std::string> taken;
    int waiting = 0;
} locks;

/// What an allocation without exceptions does first; false lets it fail. Empty: nothing.
std::function<bool()> allocating;

std::set<std::string> HeldLocks()
{
    const std::lock_guard guard(locks.mutex);
    return locks.held;
}

} // namespace

DAMutexLock::DAMutexLock(const char* name)
{
    std::unique_lock guard(locks.mutex);
    ++locks.waiting;
    locks.changed.notify_all();
    locks.changed.wait(guard, [&] { return locks.held.count(name) == 0; });
    --locks.waiting;
    locks.taken.emplace_back(name);
    lock_ = const_cast<std::string*>(&*locks.held.insert(name).first);
}

DAMutexLock::~DAMutexLock()
{
    const std::lock_guard guard(locks.mutex);
    locks.held.erase(locks.held.find(*static_cast<std::string*>(lock_)));
    locks.changed.notify_all();
}

void* operator new(std::size_t size, const std::nothrow_t&) noexcept
{
    return allocating && !allocating() ? nullptr : ::operator new(size);
}

namespace
{

using testing::ElementsAre;
using testing::IsEmpty;

struct Class
{
    std::string lockName;
    void* (*getInstance)();
    void* (*instance)();
    void (*forget)();
};

template <class Any>
Class Of(const std::string& file)
{
    static_assert(sizeof(Any) == sizeof(void*) && std::has_virtual_destructor_v<Any>);
    return {file + "::GetInstance", [] { return static_cast<void*>(Any::GetInstance()); },
        [] { return static_cast<void*>(Any::__pInstance); }, [] { delete std::exchange(Any::__pInstance, nullptr); }};
}

const Class kClasses[] = {
    Of<DASystem>("DASystem.cpp"),
    Of<DASimManager>("DASimManager.cpp"),
    Of<DADBusManager>("DADBusManager.cpp"),
    Of<DAConnectionManager>("DAConnectionManager.cpp"),
};

/// Each test starts with no instance and no lock taken.
struct Facade : testing::Test
{
    Facade()
    {
        for (const auto& any : kClasses)
            any.forget();
        locks.taken.clear();
    }
    ~Facade() override { allocating = nullptr; }

    kiv::test::LogCapture log;
};

struct Frame : Facade, testing::WithParamInterface<Class>
{
};

INSTANTIATE_TEST_SUITE_P(, Frame, testing::ValuesIn(kClasses),
    [](const auto& row) { return row.param.lockName.substr(0, row.param.lockName.find('.')); });

TEST_P(Frame, IsMadeOnceUnderItsNamedLockWhichIsTakenOnEveryCall)
{
    int made = 0;
    allocating = [&]
    {
        EXPECT_THAT(HeldLocks(), ElementsAre(GetParam().lockName));
        return ++made > 0;
    };
    void* const instance = GetParam().getInstance();
    EXPECT_NE(nullptr, instance);
    EXPECT_EQ(instance, GetParam().instance());
    EXPECT_EQ(instance, GetParam().getInstance());
    EXPECT_EQ(1, made);
    EXPECT_THAT(locks.taken, ElementsAre(GetParam().lockName, GetParam().lockName));
    EXPECT_THAT(HeldLocks(), IsEmpty());
    EXPECT_THAT(log.Take(), IsEmpty());
}

TEST_P(Frame, GivesTwoThreadsThatComeAtTheSameMomentTheSameObject)
{
    int made = 0;
    allocating = [&]
    {
        std::unique_lock guard(locks.mutex);
        EXPECT_TRUE(locks.changed.wait_for(guard, std::chrono::seconds(10), [] { return locks.waiting == 1; })) << "nobody waits";
        return ++made > 0;
    };
    void* instances[2] = {};
    std::thread other([&] { instances[1] = GetParam().getInstance(); });
    instances[0] = GetParam().getInstance();
    other.join();
    EXPECT_NE(nullptr, instances[0]);
    EXPECT_EQ(instances[0], instances[1]);
    EXPECT_EQ(1, made);
}

TEST_F(Facade, MakesEachManagerOnTheFirstForwardAndNotBefore)
{
    EXPECT_TRUE(DASystem::GetInstance()->IsValidMcc("412"));
    EXPECT_NE(nullptr, DASimManager::__pInstance);
    EXPECT_EQ(nullptr, DADBusManager::__pInstance);
    EXPECT_EQ(nullptr, DAConnectionManager::__pInstance);
    EXPECT_THAT(locks.taken, ElementsAre("DASystem.cpp::GetInstance", "DASimManager.cpp::GetInstance"));
}

} // namespace
