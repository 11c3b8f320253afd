#include "utils/Mutex.h"

#include <gtest/gtest.h>

#include <condition_variable>
#include <thread>
#include <vector>

namespace {

/// Tells whether another thread could take the mutex.
template <typename TMutex>
bool IsFree(TMutex& mutex)
{
    bool taken = false;
    std::thread([&] {
        if (mutex.TryLock()) {
            taken = true;
            mutex.Unlock();
        }
    }).join();
    return taken;
}

class VCounter
{
public:
    void Add()
    {
        const KVR::VMutexLock lock(mutex);
        ++count;
        changed.notify_all();
    }

    void WaitFor(int wanted)
    {
        KVR::VMutexLock lock(mutex);
        while (count < wanted) {
            changed.wait(lock.Inner());
        }
    }

private:
    KVR::VMutex mutex;
    std::condition_variable changed;
    int count KVR_GUARDED_BY(mutex) = 0;
};

} // namespace

TEST(Mutex, IsHeldForTheLifetimeOfItsLock)
{
    KVR::VMutex mutex;
    {
        const KVR::VMutexLock lock(mutex);
        EXPECT_FALSE(IsFree(mutex));
    }
    EXPECT_TRUE(IsFree(mutex));
}

TEST(Mutex, IsLetGoAndTakenAgainWithinALock)
{
    KVR::VMutex mutex;
    {
        KVR::VMutexLock lock(mutex);
        lock.Unlock();
        EXPECT_TRUE(IsFree(mutex));
        lock.Lock();
        EXPECT_FALSE(IsFree(mutex));
    }
    EXPECT_TRUE(IsFree(mutex));
}

TEST(Mutex, IsNotReleasedTwiceByALockThatLetGo)
{
    KVR::VMutex mutex;
    {
        KVR::VMutexLock lock(mutex);
        lock.Unlock();
        EXPECT_TRUE(IsFree(mutex));
    }
    EXPECT_TRUE(IsFree(mutex));
}

TEST(Mutex, ServesAConditionVariable)
{
    VCounter counter;
    std::thread waiting([&counter] { counter.WaitFor(100); });
    constexpr int threadCount = 4;
    std::vector<std::thread> adding;
    adding.reserve(threadCount);
    for (int i = 0; i < threadCount; ++i) {
        adding.emplace_back([&counter] {
            for (int added = 0; added < 25; ++added) {
                counter.Add();
            }
        });
    }
    for (std::thread& thread : adding) {
        thread.join();
    }
    waiting.join(); // hangs if an addition was lost
}

TEST(RecursiveMutex, IsTakenAgainByItsOwner)
{
    KVR::VRecursiveMutex mutex;
    const auto takeAgain = [&mutex]() KVR_NO_THREAD_SAFETY_ANALYSIS {
        const KVR::VRecursiveMutexLock inner(mutex);
    };
    {
        const KVR::VRecursiveMutexLock outer(mutex);
        takeAgain();
        EXPECT_FALSE(IsFree(mutex));
    }
    EXPECT_TRUE(IsFree(mutex));
}
