#include "notification/AsioDeadlineTimer.h"

#include "DebugServices/ThreadName.h"
#include "notification/AsioPostalService.h"
#include "notification/MakeShared.h"
#include "notification/Support.h"
#include "notification/WeakBinding.h"
#include "support/LogCapture.h"

#include <boost/asio/io_service.hpp>
#include <boost/bind/bind.hpp>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <cstdlib>
#include <ctime>
#include <memory>
#include <stdexcept>
#include <string>
#include <type_traits>
#include <utility>

using NotificationSystem::MakeDeadlineTimer;
using NotificationSystem::StartDeadlineTimer;
using NotificationSystem::VAsioDeadlineTimer;
using NotificationSystem::VAsioPostalService;
using NotificationTest::AtEndOfThisThread;
using NotificationTest::VLastWord;
using NotificationTest::VLatch;

namespace {

constexpr std::uint32_t anHour = 60 * 60 * 1000;

class AsioDeadlineTimer : public testing::Test
{
protected:
    std::shared_ptr<VAsioPostalService> service = std::make_shared<VAsioPostalService>("X", 1, 0);
};

TEST_F(AsioDeadlineTimer, IsMadeByItsFactoriesOnly)
{
    EXPECT_TRUE(std::is_abstract<VAsioDeadlineTimer>::value);
    EXPECT_TRUE((std::is_base_of<KVR::VShared, VAsioDeadlineTimer>::value));
}

TEST_F(AsioDeadlineTimer, FiresOnAThreadOfTheService)
{
    std::string thread;
    VLatch fired;

    const auto timer = MakeDeadlineTimer(
        service,
        [&] {
            thread = DebugServices::GetThreadName();
            fired.CountDown();
        },
        1);

    ASSERT_TRUE(fired.Wait());
    EXPECT_EQ("X0", thread);
}

TEST_F(AsioDeadlineTimer, FiresNoEarlierThanAfterItsTime)
{
    std::chrono::system_clock::time_point firedAt;
    VLatch fired;
    const auto madeAt = std::chrono::system_clock::now();

    const auto timer = MakeDeadlineTimer(
        service,
        [&] {
            firedAt = std::chrono::system_clock::now();
            fired.CountDown();
        },
        50);

    ASSERT_TRUE(fired.Wait());
    EXPECT_LE(std::chrono::milliseconds(50), firedAt - madeAt);
}

TEST_F(AsioDeadlineTimer, CountsOnTheSameTimeInEveryZone)
{
    const char* const present = std::getenv("TZ");
    const std::string before = present != nullptr ? present : "";
    setenv("TZ", "East-5", 1); // there it is five hours later
    tzset();
    VLatch fired;

    StartDeadlineTimer(
        service, [&fired] { fired.CountDown(); }, 1);

    EXPECT_TRUE(fired.Wait());
    setenv("TZ", before.c_str(), 1);
    if (present == nullptr) {
        unsetenv("TZ");
    }
    tzset();
}

TEST_F(AsioDeadlineTimer, FiresOnce)
{
    std::atomic<int> calls{0};
    VLatch fired;
    const auto timer = MakeDeadlineTimer(
        service,
        [&] {
            ++calls;
            fired.CountDown();
        },
        0);
    ASSERT_TRUE(fired.Wait());

    service->Stop(); // would wait for another expiry

    EXPECT_EQ(1, calls);
}

TEST_F(AsioDeadlineTimer, EarlierExpiriesComeFirst)
{
    std::string order;
    VLatch fired(2);
    const auto later = MakeDeadlineTimer(
        service,
        [&] {
            order += 'b';
            fired.CountDown();
        },
        60);
    const auto earlier = MakeDeadlineTimer(
        service,
        [&] {
            order += 'a';
            fired.CountDown();
        },
        1);

    ASSERT_TRUE(fired.Wait());
    EXPECT_EQ("ab", order);
}

TEST_F(AsioDeadlineTimer, DroppedBeforeItsExpiryNeverRuns)
{
    const auto held = std::make_shared<int>(1);
    auto timer = MakeDeadlineTimer(
        service, [held] { FAIL() << "fired"; }, anHour);

    timer.reset();
    EXPECT_EQ(1, held.use_count());

    service->Stop(); // returns at once: the wait is over
}

TEST_F(AsioDeadlineTimer, DroppedByAnotherThreadRacesWithItsExpiryWithoutHarm)
{
    std::atomic<int> calls{0};
    for (int i = 0; i < 300; ++i) {
        auto timer = MakeDeadlineTimer(
            service, [&calls] { ++calls; }, i % 2);
        timer.reset();
    }
    service->Stop();

    EXPECT_GE(300, calls);
}

TEST_F(AsioDeadlineTimer, LivesForTheLengthOfItsFunction)
{
    std::shared_ptr<VAsioDeadlineTimer> timer;
    std::weak_ptr<VAsioDeadlineTimer> watched;
    VLatch assigned;
    VLatch fired;
    bool aliveWithin = false;
    timer = MakeDeadlineTimer(
        service,
        [&] {
            assigned.Wait();
            timer.reset(); // as a user does who makes a new one
            aliveWithin = !watched.expired();
            fired.CountDown();
        },
        0);
    watched = timer;
    assigned.CountDown();

    ASSERT_TRUE(fired.Wait());
    service->Stop();
    EXPECT_TRUE(aliveWithin);
    EXPECT_TRUE(watched.expired());
}

TEST_F(AsioDeadlineTimer, StartedTimerFiresAlthoughNobodyHoldsIt)
{
    VLatch fired;

    StartDeadlineTimer(
        service, [&fired] { fired.CountDown(); }, 5);

    EXPECT_TRUE(fired.Wait());
}

TEST_F(AsioDeadlineTimer, StopWaitsForAStartedTimerAndItIsGoneThen)
{
    const auto held = std::make_shared<int>(1);
    std::atomic<bool> fired{false};
    StartDeadlineTimer(
        service, [held, &fired] { fired = true; }, 20);
    EXPECT_EQ(2, held.use_count());

    service->Stop();

    EXPECT_TRUE(fired);
    EXPECT_EQ(1, held.use_count());
}

TEST_F(AsioDeadlineTimer, StartedTimerOfAServiceThatNeverRunsIsFreedWithIt)
{
    const auto held = std::make_shared<int>(1);
    auto idle = std::make_shared<VAsioPostalService>("Idle", 0, 0);
    StartDeadlineTimer(
        idle, [held] { FAIL() << "fired"; }, 0);

    idle.reset();

    EXPECT_EQ(1, held.use_count());
}

TEST_F(AsioDeadlineTimer, MayOutliveItsService)
{
    auto idle = std::make_shared<VAsioPostalService>("Idle", 0, 0);
    auto timer = MakeDeadlineTimer(
        idle, [] { FAIL() << "fired"; }, anHour);
    VLatch fired;
    auto firedTimer = MakeDeadlineTimer(
        service, [&fired] { fired.CountDown(); }, 0);
    ASSERT_TRUE(fired.Wait());

    idle.reset();
    service.reset();
    timer.reset();
    firedTimer.reset();
}

TEST_F(AsioDeadlineTimer, ADeadTargetOfItsFunctionIsNoError)
{
    const TestSupport::VLogCapture log;
    const std::weak_ptr<VLatch> gone = std::make_shared<VLatch>();
    const boost::function<void()> function =
        boost::bind(&VLatch::CountDown, boost::bind(&KVR::LockOrDeregister<VLatch>, gone));
    StartDeadlineTimer(service, function, 0);
    const auto timer = MakeDeadlineTimer(service, function, 0);
    VLatch fired;
    StartDeadlineTimer(
        service, [&fired] { fired.CountDown(); }, 1);

    EXPECT_TRUE(fired.Wait());
    EXPECT_TRUE(log.Messages().empty());
}

TEST_F(AsioDeadlineTimer, AnExceptionEndsTheThreadOfTheService)
{
    const TestSupport::VLogCapture log;
    VLatch ended;
    StartDeadlineTimer(
        service,
        [&ended] {
            AtEndOfThisThread([&ended] { ended.CountDown(); });
            throw std::runtime_error("no timer");
        },
        0);

    ASSERT_TRUE(ended.Wait());
    EXPECT_THAT(log.Texts("Notification"),
                testing::ElementsAre(
                    testing::AllOf(testing::HasSubstr("X0"), testing::HasSubstr("no timer"))));
}

TEST_F(AsioDeadlineTimer, ItsFunctionMayReleaseTheService)
{
    VLatch ended;
    VLatch made;
    std::shared_ptr<VAsioDeadlineTimer> timer;
    timer = MakeDeadlineTimer(
        service,
        [&] {
            AtEndOfThisThread([&ended] { ended.CountDown(); });
            made.Wait();
            timer.reset();
            service.reset();
        },
        0);
    made.CountDown();

    EXPECT_TRUE(ended.Wait());
}

/// A timer whose wait can be started again, which cancels the first.
class VRearmedTimer : public VAsioDeadlineTimer
{
public:
    using VAsioDeadlineTimer::VAsioDeadlineTimer;

    void Rearm() { OnCreated(); }
};

TEST_F(AsioDeadlineTimer, DeliberatelyRunsItsFunctionForACancelledWaitOfALivingTimer)
{
    for (const bool weak : {true, false}) {
        int calls = 0;
        const auto idle = std::make_shared<VAsioPostalService>("Idle", 0, 0);
        const auto timer = KVR::MakeShared<VRearmedTimer>(
            idle, [&calls] { ++calls; }, anHour, weak);
        idle->GetIOService().poll();
        EXPECT_EQ(0, calls);

        timer->Rearm(); // the error of the first wait says that it was cancelled
        idle->GetIOService().poll();

        EXPECT_EQ(1, calls);
    }
}

TEST_F(AsioDeadlineTimer, AClassMayTakeItsFactoryAndATestFireAtWill)
{
    boost::function<void()> captured;
    std::uint32_t delay = 0;
    const NotificationSystem::VDeadlineTimerFactory replaced =
        [&](const std::shared_ptr<KVR::IAsioPostalService>&, boost::function<void()> function,
            std::uint32_t milliseconds) -> std::shared_ptr<void> {
        captured = std::move(function);
        delay = milliseconds;
        return std::make_shared<int>(0);
    };
    int calls = 0;

    const std::shared_ptr<void> handle = replaced(
        service, [&calls] { ++calls; }, 3000);
    captured();

    EXPECT_EQ(3000u, delay);
    EXPECT_EQ(1, calls);

    const NotificationSystem::VDeadlineTimerFactory real = &MakeDeadlineTimer;
    VLatch fired;
    const std::shared_ptr<void> timer = real(
        service, [&fired] { fired.CountDown(); }, 0);
    EXPECT_TRUE(fired.Wait());
}

} // namespace
