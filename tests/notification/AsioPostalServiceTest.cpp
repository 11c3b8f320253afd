#include "notification/AsioPostalService.h"

#include "DebugServices/ThreadName.h"
#include "notification/DeregisterWeakCallbackException.h"
#include "notification/Support.h"
#include "support/LogCapture.h"

#include <boost/asio/deadline_timer.hpp>
#include <boost/asio/io_service.hpp>
#include <boost/asio/ip/tcp.hpp>
#include <boost/thread/thread.hpp>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <pthread.h>
#include <sys/resource.h>

#include <algorithm>
#include <atomic>
#include <cstdlib>
#include <memory>
#include <mutex>
#include <set>
#include <stdexcept>
#include <string>
#include <thread>
#include <type_traits>
#include <utility>
#include <vector>

using NotificationSystem::VAsioPostalService;
using NotificationTest::AtEndOfThisThread;
using NotificationTest::SlotOf;
using NotificationTest::VLastWord;
using NotificationTest::VLatch;
using testing::AllOf;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

/// Waits until a service has done everything that was posted to it before. With several threads the
/// other ones may still be busy.
void PostAndWait(KVR::IPostalService& service)
{
    VLatch reached;
    service.Post([&reached] { reached.CountDown(); }, 0);
    ASSERT_TRUE(reached.Wait());
}

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

TEST(AsioPostalService, DropsAFunctionWhoseTargetIsGoneAndGoesOn)
{
    const TestSupport::VLogCapture log;
    VAsioPostalService service("X", 1, 0);

    service.Post([] { throw KVR::VDeregisterWeakCallbackException(); }, 0);
    PostAndWait(service);

    EXPECT_THAT(log.Messages(), IsEmpty());
}

/// Posts a function that throws, and waits until its thread has ended.
template <typename Exception>
void PostExceptionAndWait(KVR::IPostalService& service, const Exception& exception)
{
    VLatch ended;
    service.Post(
        [&ended, exception] {
            AtEndOfThisThread([&ended] { ended.CountDown(); });
            throw exception;
        },
        0);
    ASSERT_TRUE(ended.Wait());
}

TEST(AsioPostalService, AnExceptionIsReportedWithTheThreadsName)
{
    const TestSupport::VLogCapture log;
    VAsioPostalService service("Control Heartbeat Monitor", 1, 0);

    PostExceptionAndWait(service, std::runtime_error("not today"));

    const std::vector<TestSupport::VLoggedMessage> messages = log.Messages();
    ASSERT_EQ(1u, messages.size());
    EXPECT_EQ("Notification", messages[0].Category);
    EXPECT_EQ(2, messages[0].Level);
    EXPECT_THAT(messages[0].Text,
                AllOf(HasSubstr("Control Heartbeat Monitor0"), HasSubstr("not today")));
}

TEST(AsioPostalService, AnExceptionEndsNothingButItsThread)
{
    const TestSupport::VLogCapture log;
    VAsioPostalService otherService("Y", 1, 0);
    VAsioPostalService service("X", 2, 0);

    PostExceptionAndWait(service, 7); // no std::exception

    PostAndWait(otherService);
    PostAndWait(service); // its other thread
    EXPECT_EQ(1u, log.Messages().size());
    EXPECT_TRUE(service.Stop());
}

TEST(AsioPostalService, AnEmptyFunctionEndsItsThread)
{
    const TestSupport::VLogCapture log;
    VAsioPostalService service("X", 1, 0);
    VLatch ended;
    service.Post([&ended] { AtEndOfThisThread([&ended] { ended.CountDown(); }); }, 0);

    service.Post(boost::function<void()>(), 0);

    ASSERT_TRUE(ended.Wait());
    EXPECT_THAT(log.Texts("Notification"), ElementsAre(HasSubstr("call to empty boost::function")));
}

TEST(AsioPostalService, ARestartGoesOnWithTheQueueThatAnExceptionLeft)
{
    const TestSupport::VLogCapture log;
    VAsioPostalService service("X", 1, 0);
    PostExceptionAndWait(service, std::runtime_error("out"));
    std::string called;
    service.Post([&called] { called += 'a'; }, 0);

    EXPECT_FALSE(service.Start(1)); // it still counts as started
    EXPECT_TRUE(service.Stop());    // and does not wait for a queue that nobody empties
    EXPECT_EQ("", called);
    EXPECT_TRUE(service.Start(1));
    PostAndWait(service);

    EXPECT_EQ("a", called);
}

TEST(AsioPostalService, QueuedFunctionsAreFreedUncalledAfterAnExceptionEndedTheOnlyThread)
{
    const TestSupport::VLogCapture log;
    const auto held = std::make_shared<int>(1);
    {
        VAsioPostalService service("X", 1, 0);
        PostExceptionAndWait(service, std::runtime_error("out"));
        service.Post([held] { FAIL() << "called"; }, 0);
    }
    EXPECT_EQ(1, held.use_count());
}

TEST(AsioPostalService, GoesOnAlthoughItsIOServiceWasMarkedAsStopped)
{
    VAsioPostalService service("X", 1, 0);
    PostAndWait(service);

    service.GetIOService().stop(); // as it does by itself when it runs out of work

    PostAndWait(service);
    EXPECT_TRUE(service.Stop());
}

TEST(AsioPostalServiceDeathTest, ACrashOfAThreadIsReportedWithItsName)
{
    GTEST_FLAG_SET(death_test_style, "threadsafe");

    EXPECT_DEATH(
        {
            VAsioPostalService service("Crashing", 1, 0);
            service.Post([] { std::abort(); }, 0);
            service.Stop();
        },
        "Crashing0");
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

/// While it lives, no further thread can be started: its stack would not fit any address space.
class VNoFurtherThreads
{
public:
    VNoFurtherThreads()
    {
        pthread_getattr_default_np(&usual);
        pthread_attr_t huge;
        pthread_attr_init(&huge);
        pthread_attr_setstacksize(&huge, std::size_t{1} << 47);
        pthread_setattr_default_np(&huge);
        pthread_attr_destroy(&huge);
    }
    ~VNoFurtherThreads()
    {
        pthread_setattr_default_np(&usual);
        pthread_attr_destroy(&usual);
    }

    VNoFurtherThreads(const VNoFurtherThreads&) = delete;
    VNoFurtherThreads& operator=(const VNoFurtherThreads&) = delete;

private:
    pthread_attr_t usual;
};

TEST(AsioPostalService, ThrowsFromItsConstructorWhereNoThreadCanBeMade)
{
    const VNoFurtherThreads limit;

    EXPECT_THROW(VAsioPostalService("X", 1, 0), boost::thread_resource_error);
}

TEST(AsioPostalService, IsStoppedAfterAStartThatThrew)
{
    VAsioPostalService service("X", 0, 0);
    {
        const VNoFurtherThreads limit;
        EXPECT_THROW(service.Start(1), boost::thread_resource_error);
    }

    EXPECT_FALSE(service.Stop());
    EXPECT_TRUE(service.Start(1));
    PostAndWait(service);
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
