#include "LockWaiting.h"
#include "StoreFixture.h"
#include "StoreHistory.h"
#include "WorkerThread.h"
#include "support/LogCapture.h"

#include <gtest/gtest.h>

#include <atomic>
#include <fstream>
#include <string>

#include <pthread.h>
#include <signal.h>
#include <unistd.h>

// Whom a commit wakes. Threads wait in the order in which they fell asleep last, which a signal, a
// profiler or a debugger changes at will, and not in the order of their change ids.

namespace {

using namespace StoreTest;

using DataStoreWaking = DataStoreFixture;

std::atomic<int> interruptions{0};

void CountInterruption(int /*signal*/)
{
    ++interruptions;
}

/// Has a signal do nothing but disturb a sleeping thread, for its own lifetime.
class VInterruption
{
public:
    VInterruption()
    {
        interruptions = 0;
        struct sigaction action = {};
        action.sa_handler = &CountInterruption;
        sigaction(SIGUSR1, &action, &previous);
    }
    ~VInterruption() { sigaction(SIGUSR1, &previous, nullptr); }

    VInterruption(const VInterruption&) = delete;
    VInterruption& operator=(const VInterruption&) = delete;

private:
    struct sigaction previous = {};
};

/// A writer that says which thread of the system it is, and waits for its turn.
class VWaitingWriter
{
public:
    VWaitingWriter(VDataStore& store, std::size_t place)
    {
        worker.Start([this, &store] {
            handle = pthread_self();
            systemThread = gettid();
            const VDataWriter writer(store);
        });
        EXPECT_TRUE(WaitForWaiting(store, place));
        EXPECT_TRUE(Eventually([this] { return Sleeps(); }));
    }

    /// Wakes the thread without a reason, and returns once it sleeps again, behind all others.
    void Disturb()
    {
        const int before = interruptions;
        pthread_kill(handle, SIGUSR1);
        EXPECT_TRUE(Eventually([&] { return interruptions > before && Sleeps(); }));
    }

    bool Finish() { return worker.Finish(); }

private:
    bool Sleeps() const
    {
        std::ifstream file("/proc/self/task/" + std::to_string(systemThread) + "/stat");
        std::string text;
        std::getline(file, text);
        const std::size_t nameEnd = text.rfind(')');
        return nameEnd != std::string::npos && text.compare(nameEnd, 3, ") S") == 0;
    }

    pthread_t handle{};
    std::atomic<pid_t> systemThread{0};
    VWorkerThread worker; // last: it uses the rest
};

TEST_F(DataStoreWaking, CommitReachesTheNextWriterWhereverItSleeps)
{
    const TestSupport::VLogCapture log; // of how long they waited
    const VWatchdog watchdog(store, "writers that nobody wakes");
    const VInterruption interruption;
    std::uint64_t changeId = 0;
    ASSERT_TRUE(store.AcquireWriteLock(changeId));
    VWaitingWriter first(store, 1);
    VWaitingWriter second(store, 2);
    VWaitingWriter third(store, 3);
    first.Disturb();
    second.Disturb();

    store.ReleaseWriteLock();

    EXPECT_TRUE(first.Finish());
    EXPECT_TRUE(second.Finish());
    EXPECT_TRUE(third.Finish());
    EXPECT_EQ(4u, VDataReader(store).GetCurrentChangeId());
}

} // namespace
