#pragma once

#include "utils/ThreadSafety.h"

#include <mutex>

namespace KVR {

/// A mutex whose use Clang checks: not every standard library annotates its own.
///
/// Threads: every operation [any]; not recursive.
class KVR_CAPABILITY("mutex") VMutex
{
public:
    VMutex() = default;
    VMutex(const VMutex&) = delete;
    VMutex& operator=(const VMutex&) = delete;

    void Lock() KVR_ACQUIRE() { inner.lock(); }
    void Unlock() KVR_RELEASE() { inner.unlock(); }
    bool TryLock() KVR_TRY_ACQUIRE(true) { return inner.try_lock(); }

    /// Returns the mutex within, which only a lock object needs.
    std::mutex& Inner() KVR_RETURN_CAPABILITY(this) { return inner; }

private:
    std::mutex inner;
};

/// Holds a `VMutex` for its own lifetime, with pauses where the holder must call somebody else.
///
/// Threads: one thread, the one that made it.
class KVR_SCOPED_CAPABILITY VMutexLock
{
public:
    explicit VMutexLock(VMutex& mutex) KVR_ACQUIRE(mutex) : inner(mutex.Inner()) {}
    ~VMutexLock() KVR_RELEASE() = default;

    VMutexLock(const VMutexLock&) = delete;
    VMutexLock& operator=(const VMutexLock&) = delete;

    /// Lets the mutex go before the end of the scope.
    void Unlock() KVR_RELEASE() { inner.unlock(); }

    /// Takes the mutex again after `Unlock`.
    void Lock() KVR_ACQUIRE() { inner.lock(); }

    /// Returns what a `std::condition_variable` waits with. Wait in a loop that reads the guarded
    /// fields itself: the checks do not see that a predicate runs under the mutex.
    std::unique_lock<std::mutex>& Inner() { return inner; }

private:
    std::unique_lock<std::mutex> inner;
};

/// A mutex that its owner may take again, for operations that call back into their own object.
///
/// Threads: every operation [any].
class KVR_CAPABILITY("mutex") VRecursiveMutex
{
public:
    VRecursiveMutex() = default;
    VRecursiveMutex(const VRecursiveMutex&) = delete;
    VRecursiveMutex& operator=(const VRecursiveMutex&) = delete;

    void Lock() KVR_ACQUIRE() { inner.lock(); }
    void Unlock() KVR_RELEASE() { inner.unlock(); }
    bool TryLock() KVR_TRY_ACQUIRE(true) { return inner.try_lock(); }

private:
    std::recursive_mutex inner;
};

/// Holds a `VRecursiveMutex` for its own lifetime.
///
/// Threads: one thread, the one that made it.
class KVR_SCOPED_CAPABILITY VRecursiveMutexLock
{
public:
    explicit VRecursiveMutexLock(VRecursiveMutex& taken) KVR_ACQUIRE(taken) : mutex(taken)
    {
        mutex.Lock();
    }
    ~VRecursiveMutexLock() KVR_RELEASE() { mutex.Unlock(); }

    VRecursiveMutexLock(const VRecursiveMutexLock&) = delete;
    VRecursiveMutexLock& operator=(const VRecursiveMutexLock&) = delete;

private:
    VRecursiveMutex& mutex;
};

} // namespace KVR
