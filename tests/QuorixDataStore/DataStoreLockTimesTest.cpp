#include "LockWaiting.h"
#include "QuorixDataStore/TimedLock.h"
#include "StoreFixture.h"
#include "WorkerThread.h"
#include "support/LogCapture.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <future>

// What the log says of a lock that was long in coming.

namespace {

using namespace StoreTest;

/// A clock that moves when it is told to, and that holds up whoever asks it while it is held.
struct VLockClock
{
    static std::atomic<double> step;
    static std::atomic<int> calls;
    static std::promise<void>* asked;         // told at the first call
    static std::shared_future<void>* mayGoOn; // awaited by the first call

    static double Milliseconds()
    {
        const int call = calls++;
        if (call == 0 && asked != nullptr) {
            asked->set_value();
            mayGoOn->wait();
        }
        return call * step;
    }
};

std::atomic<double> VLockClock::step{0};
std::atomic<int> VLockClock::calls{0};
std::promise<void>* VLockClock::asked = nullptr;
std::shared_future<void>* VLockClock::mayGoOn = nullptr;

class DataStoreLockTimes : public DataStoreFixture
{
protected:
    DataStoreLockTimes()
    {
        VLockClock::calls = 0;
        VLockClock::asked = nullptr;
        SetLockClock(&VLockClock::Milliseconds);
    }
    ~DataStoreLockTimes() override { SetLockClock(nullptr); }

    /// Makes a writer wait for another one, by a clock that gives `milliseconds` for it.
    void WaitForWriter(double milliseconds)
    {
        VLockClock::step = milliseconds;
        VWorkerThread second;
        {
            VDataWriter writer(store);
            second.Start([this] { VDataWriter(static_cast<IDataStore&>(store)); });
            ASSERT_TRUE(WaitForWaiting(store, 1));
        }
        ASSERT_TRUE(second.Finish());
    }
};

TEST_F(DataStoreLockTimes, WriteLockOfTenMillisecondsIsLogged)
{
    const TestSupport::VLogCapture log;

    WaitForWriter(10.0);

    ASSERT_EQ(1u, log.Messages().size());
    EXPECT_EQ("Took 10ms to acquire write-lock on change id 1", log.Messages()[0].Text);
    EXPECT_EQ("DataStore", log.Messages()[0].Category);
    EXPECT_EQ(3, log.Messages()[0].Level);
}

TEST_F(DataStoreLockTimes, WriteLockOfLessIsSilent)
{
    const TestSupport::VLogCapture log;

    WaitForWriter(9.75);

    EXPECT_TRUE(log.Messages().empty());
}

TEST_F(DataStoreLockTimes, FractionsAreLoggedWithTheDefaultDigits)
{
    const TestSupport::VLogCapture log;

    WaitForWriter(1234.5678901);

    EXPECT_EQ((Texts{"Took 1234.57ms to acquire write-lock on change id 1"}),
              log.Texts("DataStore"));
}

TEST_F(DataStoreLockTimes, ReadLockOfTenMillisecondsIsLogged)
{
    std::promise<void> asked;
    std::promise<void> release;
    std::shared_future<void> mayGoOn = release.get_future().share();
    VLockClock::asked = &asked;
    VLockClock::mayGoOn = &mayGoOn;
    VLockClock::step = 12.5;
    const TestSupport::VLogCapture log;
    VWorkerThread second;
    VWorkerThread reader;
    {
        VDataWriter writer(store);
        // The queued writer notes its time with the state mutex held, and is kept there.
        second.Start([this] { VDataWriter(static_cast<IDataStore&>(store)); });
        asked.get_future().wait();
        reader.Start([this] { const VDataReader view(store); });
        ASSERT_TRUE(Eventually([] { return VLockClock::calls > 1; }));
        release.set_value();
        ASSERT_TRUE(reader.Finish());
    }
    ASSERT_TRUE(second.Finish());

    const Texts lines = log.Texts("DataStore");
    EXPECT_EQ(1, std::count(lines.begin(), lines.end(),
                            "Took 12.5ms to acquire read-lock on change id 0"));
}

TEST_F(DataStoreLockTimes, FreeLockDoesNotAskTheClock)
{
    {
        const VDataReader reader(store);
    }
    VDataWriter(static_cast<IDataStore&>(store));

    EXPECT_EQ(0, VLockClock::calls);
}

} // namespace
