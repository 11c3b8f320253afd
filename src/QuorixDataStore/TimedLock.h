#pragma once

#include "utils/Mutex.h"

#include <condition_variable>
#include <mutex>

/// A clock for waiting times, in milliseconds from any start. Null brings back the system's
/// monotonic one; another is for tests. [any]
void SetLockClock(double (*milliseconds)());

/// Holds a mutex for its own lifetime, and knows how long it took to get what it waited for.
///
/// The clock is only asked where somebody else is in the way: a lock that is free costs no time.
/// Threads: the one that made it.
class KVR_SCOPED_CAPABILITY VTimedLock
{
public:
    explicit VTimedLock(KVR::VMutex& mutex) KVR_ACQUIRE(mutex);
    ~VTimedLock() KVR_RELEASE() = default;

    VTimedLock(const VTimedLock&) = delete;
    VTimedLock& operator=(const VTimedLock&) = delete;

    /// Waits for a signal; the mutex is not held meanwhile.
    void Wait(std::condition_variable& signal);

    void Unlock() KVR_RELEASE() { inner.unlock(); }

    /// Returns the milliseconds since this object first had to wait, 0 if it never had to.
    double Waited() const;

private:
    void NoteTime();

    bool waited = false;
    double begin = 0;
    std::unique_lock<std::mutex> inner;
};
