#include "notification/AsioPostalService.h"

#include "notification/Support.h"

#include <boost/asio/deadline_timer.hpp>
#include <boost/asio/io_service.hpp>
#include <boost/thread/thread.hpp>
#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <string>
#include <thread>
#include <vector>

using NotificationSystem::VAsioPostalService;
using NotificationTest::PostAndWait;
using NotificationTest::VLatch;

namespace {

TEST(AsioPostalService, StartOnAStartedServiceReturnsFalseAndAddsNoThread)
{
    VAsioPostalService service("X", 1, 0);
    EXPECT_FALSE(service.Start(1));
    EXPECT_FALSE(service.Start(0));

    // With a second thread the second function would run while the first waits.
    std::atomic<int> running{0};
    std::atomic<int> most{0};
    VLatch release;
    for (int i = 0; i < 2; ++i) {
        service.Post(
            [&] {
                most = std::max(most.load(), ++running);
                release.Wait();
                --running;
            },
            0);
    }
    release.CountDown();
    service.Stop();
    EXPECT_EQ(1, most);
}

TEST(AsioPostalService, StopOnAStoppedServiceReturnsFalse)
{
    VAsioPostalService service("X", 1, 0);

    EXPECT_TRUE(service.Stop());
    EXPECT_FALSE(service.Stop());
    EXPECT_FALSE(VAsioPostalService("Y", 0, 0).Stop());
}

TEST(AsioPostalService, WithoutThreadsStaysStoppedAndKeepsWhatIsPosted)
{
    VAsioPostalService service("X", 0, 0);
    std::atomic<int> calls{0};
    service.Post([&calls] { ++calls; }, 0);

    EXPECT_FALSE(service.Start(0));
    EXPECT_EQ(0, calls);
    EXPECT_TRUE(service.Start(1));
    PostAndWait(service);
    EXPECT_EQ(1, calls);
}

TEST(AsioPostalService, StopLetsTheQueueRunEmpty)
{
    VAsioPostalService service("X", 1, 0);
    VLatch release;
    int calls = 0;
    service.Post([&release] { release.Wait(); }, 0);
    for (int i = 0; i < 100; ++i) {
        service.Post([&calls] { ++calls; }, 0);
    }

    release.CountDown();
    EXPECT_TRUE(service.Stop());

    EXPECT_EQ(100, calls);
}

TEST(AsioPostalService, StopLeavesAnIOServiceThatIsNotMarkedAsStopped)
{
    VAsioPostalService service("X", 1, 0);

    service.Stop();

    EXPECT_FALSE(service.GetIOService().stopped());
}

TEST(AsioPostalService, StopWaitsForPendingOperations)
{
    VAsioPostalService service("X", 1, 0);
    bool expired = false;
    boost::asio::deadline_timer timer(service.GetIOService());
    timer.expires_from_now(boost::posix_time::milliseconds(20));
    timer.async_wait([&expired](const boost::system::error_code&) { expired = true; });

    EXPECT_TRUE(service.Stop());

    EXPECT_TRUE(expired);
}

TEST(AsioPostalService, DeliversAfterARestartWhatWasPostedWhileItWasStopped)
{
    VAsioPostalService service("X", 1, 0);
    EXPECT_TRUE(service.Stop());
    std::string called;
    service.Post([&called] { called += 'a'; }, 0);
    service.Post([&called] { called += 'b'; }, 0);
    EXPECT_EQ("", called);

    EXPECT_TRUE(service.Start(1));
    PostAndWait(service);

    EXPECT_EQ("ab", called);
}

TEST(AsioPostalService, MayBeStartedAndStoppedByManyThreads)
{
    VAsioPostalService service("X", 0, 0);
    std::atomic<int> changes{0};
    std::atomic<int> calls{0};
    std::vector<std::thread> threads;
    threads.reserve(4);
    for (int i = 0; i < 3; ++i) {
        threads.emplace_back([&] {
            for (int round = 0; round < 50; ++round) {
                changes += service.Start(1) ? 1 : 0;
                service.Post([&calls] { ++calls; }, 0);
                changes -= service.Stop() ? 1 : 0;
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    EXPECT_EQ(0, changes); // every start had its stop

    service.Start(1);
    service.Stop();
    EXPECT_EQ(150, calls);
}

TEST(AsioPostalService, StopWaitsAlsoOnAThreadThatIsInterrupted)
{
    VAsioPostalService service("X", 1, 0);
    VLatch running;
    VLatch release;
    std::atomic<bool> functionEnded{false};
    service.Post(
        [&] {
            running.CountDown();
            release.Wait();
            functionEnded = true;
        },
        0);
    ASSERT_TRUE(running.Wait());

    VLatch interrupted;
    bool stopped = false;
    bool endedBefore = false;
    boost::thread stopping([&] {
        interrupted.Wait();
        release.CountDown();
        stopped = service.Stop();
        endedBefore = functionEnded;
    });
    stopping.interrupt();
    interrupted.CountDown();
    stopping.join();

    EXPECT_TRUE(stopped);
    EXPECT_TRUE(endedBefore);
}

} // namespace
