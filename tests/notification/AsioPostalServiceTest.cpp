#include "notification/AsioPostalService.h"

#include "DebugServices/ThreadName.h"
#include "notification/Support.h"

#include <boost/asio/io_service.hpp>
#include <boost/asio/ip/tcp.hpp>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <pthread.h>
#include <sys/resource.h>

#include <algorithm>
#include <atomic>
#include <memory>
#include <mutex>
#include <set>
#include <string>
#include <thread>
#include <type_traits>
#include <utility>
#include <vector>

using NotificationSystem::VAsioPostalService;
using NotificationTest::PostAndWait;
using NotificationTest::SlotOf;
using NotificationTest::VLatch;
using testing::ElementsAre;

namespace {

TEST(AsioPostalService, SlotsAreInOrder)
{
    EXPECT_EQ(0u, SlotOf(&KVR::IPostalService::Post));
    EXPECT_EQ(1u + NotificationTest::destructorSlots,
              SlotOf(&KVR::IAsioPostalService::GetIOService));
    EXPECT_EQ(2u + NotificationTest::destructorSlots,
              SlotOf(&KVR::IAsioPostalService::GetIOServicePtr));
}

TEST(AsioPostalService, IsNotCopyableAndItsDestructorNeverThrows)
{
    EXPECT_FALSE(std::is_copy_constructible<VAsioPostalService>::value);
    EXPECT_FALSE(std::is_copy_assignable<VAsioPostalService>::value);
    EXPECT_TRUE(std::is_nothrow_destructible<VAsioPostalService>::value);
}

TEST(AsioPostalService, RunsWhenItsConstructorReturns)
{
    VAsioPostalService service("X", 1, 0);
    std::thread::id thread;
    VLatch called;

    service.Post(
        [&] {
            thread = std::this_thread::get_id();
            called.CountDown();
        },
        0);

    ASSERT_TRUE(called.Wait());
    EXPECT_NE(std::this_thread::get_id(), thread);
}

TEST(AsioPostalService, HandsOutOneIOServiceForItsWholeLife)
{
    VAsioPostalService service("X", 1, 0);
    const boost::asio::io_service* const first = &service.GetIOService();

    EXPECT_EQ(first, service.GetIOServicePtr().get());
    service.Stop();
    service.Start(1);
    EXPECT_EQ(first, &service.GetIOService());
}

/// Returns the names of a service's threads, by keeping each busy until all have told theirs.
std::set<std::string> ThreadNames(KVR::IPostalService& service, int threadCount)
{
    struct VRollCall
    {
        explicit VRollCall(int threadCount) : Told(threadCount) {}

        std::mutex Mutex;
        std::set<std::string> Names;
        VLatch Told;
    };
    // Shared, since the functions may leave it later than this one.
    const auto rollCall = std::make_shared<VRollCall>(threadCount);
    for (int i = 0; i < threadCount; ++i) {
        service.Post(
            [rollCall] {
                {
                    const std::lock_guard<std::mutex> lock(rollCall->Mutex);
                    rollCall->Names.insert(DebugServices::GetThreadName());
                }
                rollCall->Told.CountDown();
                rollCall->Told.Wait();
            },
            0);
    }
    EXPECT_TRUE(rollCall->Told.Wait());
    return rollCall->Names;
}

TEST(AsioPostalService, NamesItsThreadsByStemAndIndex)
{
    VAsioPostalService service("X", 2, 0);

    EXPECT_THAT(ThreadNames(service, 2), ElementsAre("X0", "X1"));
}

TEST(AsioPostalService, CountsThreadsInDecimal)
{
    VAsioPostalService service("X", 11, 0);

    EXPECT_EQ(1u, ThreadNames(service, 11).count("X10"));
}

TEST(AsioPostalService, KeepsAThreadNameWholeThatIsTooLongForTheKernel)
{
    VAsioPostalService service("Control Heartbeat Monitor", 1, 0);
    std::string name;
    char kernelName[16] = "";
    VLatch called;

    service.Post(
        [&] {
            name = DebugServices::GetThreadName();
            pthread_getname_np(pthread_self(), kernelName, sizeof kernelName);
            called.CountDown();
        },
        0);

    ASSERT_TRUE(called.Wait());
    EXPECT_EQ("Control Heartbeat Monitor0", name);
    EXPECT_STREQ("Control Heartbe", kernelName);
}

TEST(AsioPostalService, RunsItsThreadsAboveNormalWhereItMay)
{
    const int present = getpriority(PRIO_PROCESS, 0);
    const int above = present - 1;
    int permitted = 0;
    std::thread([&] { permitted = setpriority(PRIO_PROCESS, 0, above); }).join();
    VAsioPostalService service("X", 1, 0);
    int priority = 0;
    VLatch called;

    service.Post(
        [&] {
            priority = getpriority(PRIO_PROCESS, 0); // of this thread
            called.CountDown();
        },
        0);

    ASSERT_TRUE(called.Wait());
    EXPECT_EQ(permitted == 0 ? above : present, priority);
}

TEST(AsioPostalService, RunsThreadsThatItsOwnThreadMadeNoHigher)
{
    VAsioPostalService service("X", 1, 0);
    int outer = 0;
    int inner = 0;
    VLatch called;

    service.Post(
        [&] {
            outer = getpriority(PRIO_PROCESS, 0);
            VAsioPostalService made("Y", 1, 0);
            made.Post([&inner] { inner = getpriority(PRIO_PROCESS, 0); }, 0);
            made.Stop();
            called.CountDown();
        },
        0);

    ASSERT_TRUE(called.Wait());
    EXPECT_EQ(outer, inner);
}

TEST(AsioPostalService, StartsAndStopsAnyNumberOfTimesWithAnyNumberOfThreads)
{
    VAsioPostalService service("X", 1, 0);
    for (std::uint32_t threadCount = 1; threadCount < 6; ++threadCount) {
        EXPECT_TRUE(service.Stop());
        EXPECT_TRUE(service.Start(threadCount));
        EXPECT_EQ(threadCount, ThreadNames(service, static_cast<int>(threadCount)).size());
    }
}

TEST(AsioPostalService, OneThreadDeliversInOrderAndOneAtATime)
{
    VAsioPostalService service("X", 1, 0);
    std::vector<int> order; // needs no lock
    for (int i = 0; i < 1000; ++i) {
        service.Post([&order, i] { order.push_back(i); }, 0);
    }
    PostAndWait(service);

    ASSERT_EQ(1000u, order.size());
    EXPECT_TRUE(std::is_sorted(order.begin(), order.end()));
}

TEST(AsioPostalService, TheTokenHasNoEffect)
{
    VAsioPostalService service("X", 1, 0);
    std::string called;
    service.Post([&called] { called += 'a'; }, 99);
    service.Post([&called] { called += 'b'; }, 0);
    PostAndWait(service);

    EXPECT_EQ("ab", called);
}

TEST(AsioPostalService, APostFromItsOwnThreadRunsLaterAndNeverNested)
{
    VAsioPostalService service("X", 1, 0);
    std::string called;
    VLatch finished;
    service.Post(
        [&] {
            called += '(';
            service.Post(
                [&] {
                    called += 'n';
                    finished.CountDown();
                },
                0);
            called += ')';
        },
        0);

    ASSERT_TRUE(finished.Wait());
    EXPECT_EQ("()n", called);
}

TEST(AsioPostalService, PostDoesNotWaitForARunningFunction)
{
    VLatch running;
    VLatch release;
    VAsioPostalService service("X", 1, 0); // goes first, so that the function has left them
    service.Post(
        [&] {
            running.CountDown();
            release.Wait();
        },
        0);
    ASSERT_TRUE(running.Wait());

    service.Post([] {}, 0); // would wait for ever

    release.CountDown();
}

TEST(AsioPostalService, PostsOfEachThreadKeepTheirOrder)
{
    VAsioPostalService service("X", 1, 0);
    std::vector<std::pair<int, int>> delivered;
    std::vector<std::thread> threads;
    threads.reserve(4);
    for (int thread = 0; thread < 4; ++thread) {
        threads.emplace_back([&service, &delivered, thread] {
            for (int i = 0; i < 500; ++i) {
                service.Post([&delivered, thread, i] { delivered.emplace_back(thread, i); }, 0);
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
    service.Stop();

    ASSERT_EQ(2000u, delivered.size());
    int next[4] = {};
    for (const auto& [thread, index] : delivered) {
        ASSERT_EQ(next[thread]++, index);
    }
}

TEST(AsioPostalService, FreesAFunctionOnceItHasRun)
{
    VAsioPostalService service("X", 1, 0);
    auto held = std::make_shared<int>(1);
    const std::weak_ptr<int> watched = held;
    bool heldWithin = false;
    service.Post([&heldWithin, held] { heldWithin = held != nullptr; }, 0);
    held.reset();
    bool expired = false;
    service.Post([&] { expired = watched.expired(); }, 0);
    PostAndWait(service);

    EXPECT_TRUE(heldWithin);
    EXPECT_TRUE(expired);
}

TEST(AsioPostalService, FreesQueuedFunctionsUncalledWhenItIsDestroyed)
{
    const auto held = std::make_shared<int>(1);
    {
        VAsioPostalService service("X", 1, 0);
        service.Stop();
        service.Post([held] { FAIL() << "called"; }, 0);
        EXPECT_EQ(2, held.use_count());
    }
    EXPECT_EQ(1, held.use_count());
}

TEST(AsioPostalService, QueuedFunctionsLiveAsLongAsTheIOService)
{
    const auto held = std::make_shared<int>(1);
    auto service = std::make_unique<VAsioPostalService>("X", 0, 0);
    service->Post([held] { FAIL() << "called"; }, 0);
    std::shared_ptr<boost::asio::io_service> ioService = service->GetIOServicePtr();

    service.reset();
    EXPECT_EQ(2, held.use_count());
    ioService.reset();
    EXPECT_EQ(1, held.use_count());
}

TEST(AsioPostalService, CompletesSocketOperationsOnItsThreads)
{
    VAsioPostalService service("X", 1, 0);
    boost::asio::ip::tcp::acceptor acceptor(
        service.GetIOService(),
        boost::asio::ip::tcp::endpoint(boost::asio::ip::address_v4::loopback(), 0));
    boost::asio::ip::tcp::socket accepted(service.GetIOService());
    std::string thread;
    VLatch completed;
    acceptor.async_accept(accepted, [&](const boost::system::error_code&) {
        thread = DebugServices::GetThreadName();
        completed.CountDown();
    });

    boost::asio::io_service clientService;
    boost::asio::ip::tcp::socket client(clientService);
    client.connect(acceptor.local_endpoint());

    ASSERT_TRUE(completed.Wait());
    EXPECT_EQ("X0", thread);
}

} // namespace
