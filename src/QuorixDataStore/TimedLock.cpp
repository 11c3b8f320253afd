#include "QuorixDataStore/TimedLock.h"

#include <atomic>
#include <chrono>

namespace {

constexpr int attemptsBeforeSleep = 100;

/// Lets the other thread of a processor, or the memory bus, have the next cycles.
void Pause()
{
#if defined(__x86_64__) || defined(__i386__)
    __builtin_ia32_pause();
#else
    std::atomic_signal_fence(std::memory_order_seq_cst);
#endif
}

double SteadyMilliseconds()
{
    const auto now = std::chrono::steady_clock::now().time_since_epoch();
    return std::chrono::duration<double, std::milli>(now).count();
}

std::atomic<double (*)()> lockClock{&SteadyMilliseconds};

} // namespace

void SetLockClock(double (*milliseconds)())
{
    lockClock = milliseconds != nullptr ? milliseconds : &SteadyMilliseconds;
}

VTimedLock::VTimedLock(KVR::VMutex& mutex) : inner(mutex.Inner(), std::try_to_lock)
{
    // What the mutex guards mostly takes less than putting a thread to sleep and waking it.
    for (int attempt = 0; attempt < attemptsBeforeSleep && !inner.owns_lock(); ++attempt) {
        Pause();
        static_cast<void>(inner.try_lock());
    }
    if (!inner.owns_lock()) {
        NoteTime();
        inner.lock();
    }
}

void VTimedLock::Wait(std::condition_variable& signal)
{
    NoteTime();
    signal.wait(inner);
}

double VTimedLock::Waited() const
{
    return waited ? lockClock.load()() - begin : 0;
}

void VTimedLock::NoteTime()
{
    if (!waited) {
        waited = true;
        begin = lockClock.load()();
    }
}
