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
    bool refuses = false;
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
    if (locks.refuses)
        throw std::bad_alloc();
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
    std::string failure; // what is logged when there is no memory
    void* (*getInstance)();
    void* (*instance)();
    void (*forget)();
};

template <class Any>
Class Of(const std::string& file, const char* failure)
{
    static_assert(sizeof(Any) == sizeof(void*) && std::has_virtual_destructor_v<Any>);
    return {file + "::GetInstance", "E " + file + " GetInstance > " + failure,
        [] { return static_cast<void*>(Any::GetInstance()); }, [] { return static_cast<void*>(Any::__pInstance); },
        [] { delete std::exchange(Any::__pInstance, nullptr); }};
}

const Class kClasses[] = {
    Of<DASystem>("DASystem.cpp", "CoreSystem() failed."),
    Of<DASimManager>("DASimManager.cpp", "SimManager() failed."),
    Of<DADBusManager>("DADBusManager.cpp", "DBusManager() failed."),
    Of<DAConnectionManager>("DAConnectionManager.cpp", "ConnectionManager() failed."),
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
    ~Facade() override
    {
        allocating = nullptr;
        locks.refuses = false;
    }

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

TEST_P(Frame, SaysSoWhenThereIsNoMemoryAndTriesAgain)
{
    allocating = [] { return false; };
    for (int i = 0; i < 2; ++i)
    {
        EXPECT_EQ(nullptr, GetParam().getInstance());
        EXPECT_EQ(nullptr, GetParam().instance());
        EXPECT_THAT(log.Take(), ElementsAre(GetParam().failure));
        EXPECT_THAT(HeldLocks(), IsEmpty());
    }
    allocating = nullptr;
    locks.refuses = true;
    EXPECT_EQ(nullptr, GetParam().getInstance()) << "a lock that can not be recorded throws";
    locks.refuses = false;
    EXPECT_NE(nullptr, GetParam().getInstance());
}

TEST_F(Facade, MakesEachManagerOnTheFirstForwardAndNotBefore)
{
    EXPECT_TRUE(DASystem::GetInstance()->IsValidMcc("412"));
    EXPECT_NE(nullptr, DASimManager::__pInstance);
    EXPECT_EQ(nullptr, DADBusManager::__pInstance);
    EXPECT_EQ(nullptr, DAConnectionManager::__pInstance);
    EXPECT_THAT(locks.taken, ElementsAre("DASystem.cpp::GetInstance", "DASimManager.cpp::GetInstance"));
}

TEST_F(Facade, GivesTheFailureResultsWhenItsManagersCanNotBeMade)
{
    DASystem& facade = *DASystem::GetInstance();
    allocating = [] { return false; };
    char text[] = "before";
    char* out = text;
    int ids[] = {7};
    char* statuses[] = {text};
    EXPECT_FALSE(facade.IsValidMcc("412"));
    EXPECT_FALSE(facade.IsMoSupportMcc("505"));
    facade.GetCountryNameFromMcc("412", &out);
    EXPECT_EQ(nullptr, out) << "as after a miss";
    out = text;
    facade.GetCountryNameFromCountryCallingCode("93", &out);
    facade.GetCountryNameAlpha2FromCountryCallingCode("93", &out);
    EXPECT_EQ(text, out) << "as after a calling code that nobody has";
    const char* id = text;
    EXPECT_EQ(4, facade.GetDeviceUniqueID(&id));
    EXPECT_EQ(nullptr, id);
    EXPECT_EQ(4, facade.SendNotiToServiceManager(KIV_NOTI_TYPE_STATUS_ON, "450", 7, nullptr, nullptr, nullptr, nullptr));
    EXPECT_EQ(0, facade.SendMultiOnOffNotiToServiceManager("450", 1, ids, statuses));
    EXPECT_EQ(nullptr, DASimManager::__pInstance);
    EXPECT_EQ(nullptr, DADBusManager::__pInstance);
}

} // namespace
