#include "DAMutex.h"

#include <array>
#include <atomic>
#include <cstring>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <string_view>

namespace
{

/// Never destroyed, so that it can still be taken while the process ends.
struct NamedLock
{
    const std::string name;
    const std::size_t hash;
    NamedLock* next;
    alignas(64) std::mutex mutex; // on its own cache line, so that searches do not slow down its holder
};

std::array<std::atomic<NamedLock*>, 256> buckets; // lists that grow at the head and never shrink
std::array<std::atomic<NamedLock*>, 64> recent;   // the lock found last for each group of similar names

/// Returns the place of a name in `recent`, from its first bytes only. The name often comes from a buffer that was just filled, and
/// reading all of it would take longer than the rest of the search.
std::size_t PlaceOf(const char* name)
{
    std::size_t sum = 0;
    for (int i = 0; i < 4 && name[i] != '\0'; ++i)
        sum = sum * 5 + static_cast<unsigned char>(name[i]);
    return sum % recent.size();
}

NamedLock* Search(NamedLock* lock, std::string_view name, std::size_t hash)
{
    while (lock != nullptr && (lock->hash != hash || lock->name != name))
        lock = lock->next;
    return lock;
}

NamedLock* FindOrMake(std::string_view name)
{
    const std::size_t hash = std::hash<std::string_view>()(name);
    std::atomic<NamedLock*>& head = buckets[hash % buckets.size()];
    NamedLock* first = head.load(std::memory_order_acquire);
    if (NamedLock* const found = Search(first, name, hash))
        return found;

    std::unique_ptr<NamedLock> made(new NamedLock{std::string(name), hash, first, {}});
    while (!head.compare_exchange_weak(made->next, made.get(), std::memory_order_release, std::memory_order_acquire))
    {
        if (NamedLock* const found = Search(made->next, name, hash)) // another thread was faster
            return found;
    }
    return made.release();
}

std::mutex& Find(const char* name)
{
    const char* const text = name == nullptr ? "" : name;
    std::atomic<NamedLock*>& last = recent[PlaceOf(text)];
    NamedLock* lock = last.load(std::memory_order_acquire);
    if (lock == nullptr || std::strcmp(lock->name.c_str(), text) != 0)
    {
        lock = FindOrMake(text);
        last.store(lock, std::memory_order_release);
    }
    return lock->mutex;
}

} // namespace

DAMutex::DAMutex(const char* name) : lock_(&Find(name)) {}

DAMutex::~DAMutex() {}

void DAMutex::Lock()
{
    static_cast<std::mutex*>(lock_)->lock();
}

void DAMutex::Unlock()
{
    static_cast<std::mutex*>(lock_)->unlock();
}

DAMutexLock::DAMutexLock(const char* name) : lock_(&Find(name))
{
    static_cast<std::mutex*>(lock_)->lock();
}

DAMutexLock::~DAMutexLock()
{
    static_cast<std::mutex*>(lock_)->unlock();
}
