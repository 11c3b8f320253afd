#include "AuthorizationBench.h"
#include "DebugServices/ThreadName.h"

#include <gmock/gmock.h>

#include <chrono>
#include <future>

// The record of the connected device, which the check keeps honest.

namespace {

class HeartbeatCheck : public AuthorizationBench::VAuthorizationBench
{
protected:
    HeartbeatCheck() { Make(); }
};

} // namespace

TEST_F(HeartbeatCheck, IsScheduledWhenADeviceConnects)
{
    Ask("id");

    ASSERT_TRUE(timers.Last());
    EXPECT_EQ(3000U, timers.Last()->Milliseconds);
    EXPECT_EQ(1U, timers.CountMade());
}

TEST_F(HeartbeatCheck, RunsOnTheOneThreadOfItsMonitor)
{
    Ask("id");
    const auto service = timers.Last()->Service;
    std::promise<std::string> name;

    service->Post([&name] { name.set_value(DebugServices::GetThreadName()); }, 0);

    EXPECT_EQ("Control Heartbeat Monitor0", name.get_future().get());
}

TEST_F(HeartbeatCheck, ABeatIsFreshUpTo3499Milliseconds)
{
    Ask("id");

    clock.Advance(3499);
    EXPECT_TRUE(timers.Fire());
    EXPECT_TRUE(view.IsConnected("id"));

    clock.Advance(1);
    EXPECT_TRUE(timers.Fire());
    EXPECT_FALSE(view.IsConnected("id"));
}

TEST_F(HeartbeatCheck, CountsFromTheLastBeat)
{
    Ask("id");
    clock.Advance(3000);
    manager->Heartbeat();

    clock.Advance(3499);
    timers.Fire();
    EXPECT_TRUE(view.IsConnected("id"));

    clock.Advance(1);
    timers.Fire();
    EXPECT_FALSE(view.IsConnected("id"));
}

TEST_F(HeartbeatCheck, CountsFromTheConnectionNotFromTheRequest)
{
    manager->Authorize("id", "Name");
    clock.Advance(60000);
    postal->Deliver();

    clock.Advance(3499);
    timers.Fire();
    EXPECT_TRUE(view.IsConnected("id"));
}

TEST_F(HeartbeatCheck, CountsFromTheEndOfTheRecordsWriting)
{
    view.Listeners(VDataPath("Control.id.Connected")).OnVerifiedChanged.Add([this] {
        clock.Advance(1000); // as a listener does that takes its time
    });
    Ask("id");

    clock.Advance(3499);
    timers.Fire();

    EXPECT_TRUE(view.IsConnected("id"));
}

TEST_F(HeartbeatCheck, FollowsARecordThatIsWrittenAtOnce)
{
    std::string nameWhenConnected;
    view.Listeners(VDataPath("Control.id.Connected")).OnVerifiedChanged.Add([&] {
        nameWhenConnected = view.NameOf("id");
    });

    Ask("id", "Name");

    EXPECT_EQ("Name", nameWhenConnected);
}

TEST_F(HeartbeatCheck, HoldsTheLockWhileItWrites)
{
    Ask("id");
    std::future<std::string> current;
    view.Listeners(VDataPath("Control.id.Connected")).OnVerifiedChanged.Add([&] {
        current = std::async(std::launch::async, [this] { return manager->GetCurrentDeviceId(); });
        // Without the lock it would be there at once.
        EXPECT_EQ(std::future_status::timeout, current.wait_for(std::chrono::milliseconds(50)));
    });
    clock.Advance(3500);

    EXPECT_TRUE(timers.Fire());

    ASSERT_TRUE(current.valid());
    EXPECT_EQ("id", current.get());
}

TEST_F(HeartbeatCheck, ATimeThatWasSetBackCountsAsFresh)
{
    Ask("id");

    clock.Advance(-3600000);
    timers.Fire();

    EXPECT_TRUE(view.IsConnected("id"));
}

TEST_F(HeartbeatCheck, NeverStopsAndALaterBeatRevivesTheDevice)
{
    Ask("id");

    for (int i = 0; i < 100; ++i) {
        clock.Advance(3000);
        ASSERT_TRUE(timers.Fire()) << i;
        EXPECT_EQ(3000U, timers.Last()->Milliseconds);
        EXPECT_EQ(1U, timers.CountHeld());
        EXPECT_EQ(i == 0, view.IsConnected("id")) << i;
    }
    manager->Heartbeat();
    EXPECT_FALSE(view.IsConnected("id")); // the beat itself writes nothing
    clock.Advance(3000);
    EXPECT_TRUE(timers.Fire());
    EXPECT_TRUE(view.IsConnected("id"));
}

TEST_F(HeartbeatCheck, ANewDeviceTakesOverTheCheckAndTheFormerKeepsItsRecord)
{
    Ask("first");
    const std::weak_ptr<void> firstTimer = timers.Last();

    Ask("second");

    EXPECT_TRUE(firstTimer.expired());
    EXPECT_EQ(1U, timers.CountHeld());
    clock.Advance(3500);
    EXPECT_TRUE(timers.Fire());
    EXPECT_TRUE(view.IsConnected("first"));
    EXPECT_FALSE(view.IsConnected("second"));
}

TEST_F(HeartbeatCheck, OneThatWasReplacedWhileItWaitedDoesNothing)
{
    Ask("first");
    const boost::function<void()> waiting = timers.Last()->Function;
    Ask("second");
    clock.Advance(3500);

    waiting();

    EXPECT_TRUE(view.IsConnected("first"));
    EXPECT_EQ(2U, timers.CountMade());
    EXPECT_EQ(1U, timers.CountHeld());
    EXPECT_TRUE(timers.Fire()); // the second's goes on
    EXPECT_FALSE(view.IsConnected("second"));
}

TEST_F(HeartbeatCheck, TheSameDeviceAgainHasOneCheck)
{
    Ask("id");
    Ask("id");

    EXPECT_EQ(1U, timers.CountHeld());
}

TEST_F(HeartbeatCheck, ABeatWithoutADeviceWritesNothing)
{
    manager->Heartbeat();

    EXPECT_EQ(0U, timers.CountMade());
    EXPECT_FALSE(view.IsRecorded(""));
}

TEST_F(HeartbeatCheck, AfterTheAuthorizationHasGoneDoesNothing)
{
    Ask("id");
    const boost::function<void()> late = timers.Last()->Function;
    manager.reset();
    clock.Advance(3500);

    EXPECT_FALSE(KVR::GuardedCall(late));

    EXPECT_TRUE(view.IsConnected("id"));
    EXPECT_EQ(0U, timers.CountHeld());
}

TEST_F(HeartbeatCheck, OfTheProcessesClockAndTimersNeedsNobodyToDriveIt)
{
    manager = KVR::MakeShared<VQuorixControlAuthorization>(postal, store);
    Ask("id");
    const VDataPath record("Control.id.Connected");
    VDataWriter(*store).SetValue(VDataToken(record), MakeBoolValue(false));
    NotificationTest::VLatch revived;
    view.Listeners(record).OnVerifiedChanged.Add([&] { revived.CountDown(); });

    manager->Heartbeat();

    EXPECT_TRUE(revived.Wait()); // by the check, 3 seconds after the connection
    EXPECT_TRUE(view.IsConnected("id"));
    manager.reset();
}
