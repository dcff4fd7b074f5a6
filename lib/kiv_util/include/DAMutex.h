#ifndef DAMUTEX_H
#define DAMUTEX_H

/// A lock with a name: all DAMutex and DAMutexLock objects of the process with an equal name use the same lock, in any thread. It
/// is not recursive and does not exclude other processes.
class __attribute__((visibility("default"))) DAMutex
{
public:
    /// @param name  borrowed for the call
    /// Throws std::bad_alloc when there is no memory for a new name.
    explicit DAMutex(const char* name);
    DAMutex(const DAMutex&) = delete;
    DAMutex& operator=(const DAMutex&) = delete;
    ~DAMutex();

    /// Blocks until the caller holds the lock.
    void Lock();

    /// Releases the lock, which the calling thread must hold.
    void Unlock();

private:
    void* lock_;
};

/// Holds the lock of that name from construction to destruction.
class __attribute__((visibility("default"))) DAMutexLock
{
public:
    /// Blocks until the caller holds the lock.
    /// @param name  borrowed for the call
    /// Throws std::bad_alloc when there is no memory for a new name; then the lock is not held.
    explicit DAMutexLock(const char* name);
    DAMutexLock(const DAMutexLock&) = delete;
    DAMutexLock& operator=(const DAMutexLock&) = delete;
    ~DAMutexLock();

private:
    void* lock_;
};

#endif
