#include "notification/AsioPostalService.h"

#include "notification/DeregisterWeakCallbackException.h"
#include "notification/Support.h"
#include "support/LogCapture.h"

#include <boost/asio/io_service.hpp>
#include <boost/thread/exceptions.hpp>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <pthread.h>

#include <cstddef>
#include <cstdlib>
#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

using NotificationSystem::VAsioPostalService;
using NotificationTest::AtEndOfThisThread;
using NotificationTest::PostAndWait;
using NotificationTest::VLatch;
using testing::AllOf;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

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

} // namespace
