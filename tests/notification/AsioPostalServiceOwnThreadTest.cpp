// A service that is stopped, restarted or released by a function that runs on it.

#include "notification/AsioPostalService.h"

#include "DebugServices/ThreadName.h"
#include "notification/Support.h"
#include "support/LogCapture.h"

#include <boost/asio/deadline_timer.hpp>
#include <boost/asio/io_service.hpp>
#include <gtest/gtest.h>

#include <atomic>
#include <memory>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

using NotificationSystem::VAsioPostalService;
using NotificationTest::AtEndOfThisThread;
using NotificationTest::VLastWord;
using NotificationTest::VLatch;

namespace {

TEST(AsioPostalServiceOwnThread, StopReturnsWithoutJoiningItsOwnThread)
{
    VLatch ended;
    VAsioPostalService service("X", 1, 0);
    bool stopped = false;
    std::string called;
    service.Post(
        [&] {
            AtEndOfThisThread([&ended] { ended.CountDown(); });
            service.Post([&called] { called += 'a'; }, 0);
            stopped = service.Stop();
            service.Post([&called] { called += 'b'; }, 0);
        },
        0);

    ASSERT_TRUE(ended.Wait()); // the thread ends by itself
    EXPECT_TRUE(stopped);
    EXPECT_EQ("ab", called); // once its queue is empty
    EXPECT_FALSE(service.Stop());
}

TEST(AsioPostalServiceOwnThread, StopJoinsTheOtherThreads)
{
    VLatch ended;
    VLatch othersRunning(2);
    VLatch stopping;
    VAsioPostalService service("X", 3, 0);
    std::atomic<int> othersEnded{0};
    int endedAtReturn = 0;
    for (int i = 0; i < 2; ++i) {
        service.Post(
            [&] {
                AtEndOfThisThread([&othersEnded] { ++othersEnded; });
                othersRunning.CountDown();
                stopping.Wait();
            },
            0);
    }
    service.Post(
        [&] {
            AtEndOfThisThread([&ended] { ended.CountDown(); });
            othersRunning.Wait();
            stopping.CountDown();
            service.Stop();
            endedAtReturn = othersEnded;
        },
        0);

    ASSERT_TRUE(ended.Wait());
    EXPECT_EQ(2, endedAtReturn);
}

TEST(AsioPostalServiceOwnThread, AStoppedServiceStillWaitsForItsPendingOperations)
{
    VLatch ended;
    VAsioPostalService service("X", 1, 0);
    boost::asio::deadline_timer timer(service.GetIOService());
    std::string thread;
    service.Post(
        [&] {
            AtEndOfThisThread([&ended] { ended.CountDown(); });
            timer.expires_from_now(boost::posix_time::milliseconds(20));
            timer.async_wait([&thread](const boost::system::error_code&) {
                thread = DebugServices::GetThreadName();
            });
            service.Stop();
        },
        0);

    ASSERT_TRUE(ended.Wait());
    EXPECT_EQ("X0", thread);
}

TEST(AsioPostalServiceOwnThread, AFunctionMayReleaseItsService)
{
    VLatch ended;
    std::string called;
    auto service = std::make_shared<VAsioPostalService>("X", 1, 0);
    const std::weak_ptr<boost::asio::io_service> ioService = service->GetIOServicePtr();
    VLatch released;
    service->Post(
        [&] {
            AtEndOfThisThread([&ended] { ended.CountDown(); });
            released.Wait();
            service->Post([&called] { called += 'q'; }, 0); // runs, as Stop lets the queue empty
            service.reset();
            called += 'r';
        },
        0);
    released.CountDown();

    ASSERT_TRUE(ended.Wait());
    EXPECT_EQ("rq", called);
    EXPECT_TRUE(ioService.expired());
}

TEST(AsioPostalServiceOwnThread, AFunctionMayReleaseItsServiceBeforePostHasReturned)
{
    for (int i = 0; i < 200; ++i) {
        VLatch running;
        VLatch ended;
        auto service = std::make_shared<VAsioPostalService>("X", 2, 0);
        service->Post([&running] { running.CountDown(); }, 0);
        ASSERT_TRUE(running.Wait()); // another one waits to be woken, which ends a post
        service->Post(
            [&] {
                AtEndOfThisThread([&ended] { ended.CountDown(); });
                service.reset();
            },
            0);
        ASSERT_TRUE(ended.Wait());
    }
}

TEST(AsioPostalServiceOwnThread, AFunctionOnOneOfSeveralThreadsMayReleaseItsService)
{
    VLatch ended(2);
    VLatch otherRunning;
    auto service = std::make_shared<VAsioPostalService>("X", 2, 0);
    service->Post(
        [&] {
            AtEndOfThisThread([&ended] { ended.CountDown(); });
            otherRunning.CountDown();
        },
        0);
    service->Post(
        [&] {
            AtEndOfThisThread([&ended] { ended.CountDown(); });
            otherRunning.Wait();
            service.reset();
        },
        0);

    // Both functions may have met on one thread, which ends all the same.
    ASSERT_TRUE(ended.Wait());
    EXPECT_EQ(nullptr, service);
}

TEST(AsioPostalServiceOwnThread, TheLastReferenceMayGoWithThePostedFunctionItself)
{
    VLatch ended;
    auto service = std::make_shared<VAsioPostalService>("X", 1, 0);
    service->Post([&ended, held = service] { AtEndOfThisThread([&ended] { ended.CountDown(); }); },
                  0);

    service.reset(); // either here or there is the last one

    EXPECT_TRUE(ended.Wait());
}

TEST(AsioPostalServiceOwnThread, AnExceptionAfterTheReleaseFreesTheQueueUncalled)
{
    const TestSupport::VLogCapture log;
    VLatch ended;
    VLatch posted;
    const auto held = std::make_shared<int>(1);
    auto service = std::make_shared<VAsioPostalService>("X", 1, 0);
    service->Post(
        [&] {
            AtEndOfThisThread([&ended] { ended.CountDown(); });
            posted.Wait();
            service.reset();
            throw std::runtime_error("out");
        },
        0);
    service->Post([held] { FAIL() << "called"; }, 0);
    posted.CountDown();

    ASSERT_TRUE(ended.Wait());
    EXPECT_EQ(1, held.use_count());
    EXPECT_EQ(1u, log.Texts("Notification").size());
}

TEST(AsioPostalServiceOwnThread, StartsAgainAfterTheQueueHasRunEmpty)
{
    VLatch ended;
    VAsioPostalService service("X", 1, 0);
    service.Post(
        [&] {
            AtEndOfThisThread([&ended] { ended.CountDown(); });
            service.Stop();
        },
        0);
    ASSERT_TRUE(ended.Wait());
    EXPECT_TRUE(service.GetIOService().stopped()); // it has marked itself so
    VLatch called;
    service.Post([&called] { called.CountDown(); }, 0);

    EXPECT_TRUE(service.Start(1));

    EXPECT_FALSE(service.GetIOService().stopped());
    EXPECT_TRUE(called.Wait());
}

TEST(AsioPostalServiceOwnThread, AThreadThatRestartsItsServiceLeavesItToTheNewOne)
{
    VLatch oldEnded;
    VLatch newCalled;
    VAsioPostalService service("X", 1, 0);
    bool stopped = false;
    bool started = false;
    std::thread::id oldThread;
    std::thread::id newThread;
    service.Post(
        [&] {
            AtEndOfThisThread([&oldEnded] { oldEnded.CountDown(); });
            oldThread = std::this_thread::get_id();
            stopped = service.Stop();
            started = service.Start(1);
        },
        0);

    ASSERT_TRUE(oldEnded.Wait()); // while the service goes on
    service.Post(
        [&] {
            newThread = std::this_thread::get_id();
            newCalled.CountDown();
        },
        0);
    ASSERT_TRUE(newCalled.Wait());
    EXPECT_TRUE(stopped);
    EXPECT_TRUE(started);
    EXPECT_NE(std::thread::id(), newThread);
    EXPECT_TRUE(service.Stop());
}

TEST(AsioPostalServiceOwnThread, MayStopItselfAgainAfterItsOwnRestart)
{
    VLatch ended;
    VAsioPostalService service("X", 1, 0);
    std::string results;
    service.Post(
        [&] {
            AtEndOfThisThread([&ended] { ended.CountDown(); });
            results += service.Stop() ? 's' : '-';
            results += service.Start(2) ? 'S' : '-';
            results += service.Stop() ? 's' : '-'; // joins threads that are not this one
            results += service.Stop() ? 's' : '-';
        },
        0);

    ASSERT_TRUE(ended.Wait());
    EXPECT_EQ("sSs-", results);
}

TEST(AsioPostalServiceOwnThread, ARestartFromOutsideDoesNotWaitForTheFunctionThatStopped)
{
    VLatch stopped;
    VLatch release;
    VLatch called;
    VAsioPostalService service("X", 1, 0);
    service.Post(
        [&] {
            service.Stop();
            stopped.CountDown();
            release.Wait();
        },
        0);
    ASSERT_TRUE(stopped.Wait());

    EXPECT_TRUE(service.Start(1));
    service.Post([&called] { called.CountDown(); }, 0);

    EXPECT_TRUE(called.Wait());
    release.CountDown();
}

TEST(AsioPostalServiceOwnThread, NothingIsLostOverManyRestarts)
{
    VAsioPostalService service("X", 1, 0);
    std::atomic<int> calls{0};
    constexpr int rounds = 300;
    for (int round = 0; round < rounds; ++round) {
        VLatch stopped;
        service.Post(
            [&] {
                service.Stop();
                stopped.CountDown();
            },
            0);
        ASSERT_TRUE(stopped.Wait());
        // The thread that is left over goes its way at the same time.
        ASSERT_TRUE(service.Start(1));
        VLatch called;
        service.Post(
            [&] {
                ++calls;
                called.CountDown();
            },
            0);
        ASSERT_TRUE(called.Wait());
    }
    EXPECT_EQ(rounds, calls);
}

} // namespace
