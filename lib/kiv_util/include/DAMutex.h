#ifndef DAMUTEX_H
#define DAMUTEX_H

/// A lock that is known by its name: every object made with an equal name text, in whatever thread and whether it is a
/// DAMutex or a DAMutexLock, refers to one and the same lock of the process. Not recursive. Other processes are not excluded.
class __attribute__((visibility("default"))) DAMutex
{
public:
    /// @param name  borrowed for the call
    /// Throws std::bad_alloc when a name that is new to the process cannot be recorded.
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
    /// Throws std::bad_alloc when a name that is new to the process cannot be recorded; the lock is not held then.
    explicit DAMutexLock(const char* name);
    DAMutexLock(const DAMutexLock&) = delete;
    DAMutexLock& operator=(const DAMutexLock&) = delete;
    ~DAMutexLock();

private:
    void* lock_;
};

#endif
