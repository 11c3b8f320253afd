#include "OrderlyStop.h"

#include "support/LogCapture.h"

#include <gmock/gmock.h>

#include <atomic>
#include <chrono>
#include <condition_variable>
#include <csignal>
#include <future>
#include <memory>
#include <string>
#include <thread>
#include <unistd.h>

using QuorixHost::VOrderlyStop;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

constexpr std::chrono::hours noPatienceNeeded{1};
constexpr std::chrono::seconds generousLimit{60};

/// Restores what the test program did with the signals before.
class OrderlyStop : public testing::Test
{
protected:
    OrderlyStop()
    {
        pthread_sigmask(SIG_SETMASK, nullptr, &mask);
        sigaction(SIGINT, nullptr, &interrupt);
        sigaction(SIGTERM, nullptr, &terminate);
    }

    ~OrderlyStop() override
    {
        sigaction(SIGINT, &interrupt, nullptr);
        sigaction(SIGTERM, &terminate, nullptr);
        pthread_sigmask(SIG_SETMASK, &mask, nullptr);
    }

    std::unique_ptr<VOrderlyStop> Make(std::chrono::milliseconds patience)
    {
        return std::make_unique<VOrderlyStop>([this] { requested.set_value(); },
                                              [] { return std::string("Nobody does."); }, patience);
    }

    bool WasRequested() { return future.wait_for(generousLimit) == std::future_status::ready; }

    std::promise<void> requested; // a second call would throw
    std::future<void> future = requested.get_future();

private:
    sigset_t mask;
    struct sigaction interrupt;
    struct sigaction terminate;
};

} // namespace

TEST_F(OrderlyStop, AsksForTheStopOnceForAnyNumberOfRequests)
{
    TestSupport::VLogCapture log;
    {
        const auto stop = Make(noPatienceNeeded);
        stop->Request();
        stop->Request();
        EXPECT_TRUE(WasRequested());
        stop->Request();
    }

    EXPECT_THAT(log.Texts("Host"), ElementsAre("Stopping"));
}

TEST_F(OrderlyStop, AsksForTheStopOnASignal)
{
    for (const int signal : {SIGINT, SIGTERM}) {
        requested = std::promise<void>();
        future = requested.get_future();
        TestSupport::VLogCapture log;
        const auto stop = Make(noPatienceNeeded);

        kill(getpid(), signal);

        EXPECT_TRUE(WasRequested()) << signal;
    }
}

TEST_F(OrderlyStop, ASignalAfterARequestAsksForNothingMore)
{
    TestSupport::VLogCapture log;
    const auto stop = Make(noPatienceNeeded);
    stop->Request();
    EXPECT_TRUE(WasRequested());

    kill(getpid(), SIGTERM); // the process lives
}

TEST_F(OrderlyStop, EndsInSilenceWhereNobodyAsked)
{
    TestSupport::VLogCapture log;

    Make(noPatienceNeeded).reset();

    EXPECT_THAT(log.Messages(), IsEmpty());
}

TEST_F(OrderlyStop, SaysWhatHoldsItUpOncePatienceIsOver)
{
    TestSupport::VLogCapture log;
    std::promise<void> described;
    {
        VOrderlyStop stop([] {},
                          [&] {
                              described.set_value();
                              return std::string("The cat sits on it.");
                          },
                          std::chrono::milliseconds(1));
        stop.Request();
        ASSERT_EQ(std::future_status::ready, described.get_future().wait_for(generousLimit));
    }

    EXPECT_THAT(log.Texts("Host"),
                ElementsAre("Stopping", "The stop is held up. The cat sits on it. A second signal "
                                        "ends the process at once."));
}

TEST_F(OrderlyStop, OnceItIsHeldUpOneSignalEndsTheProcessAlsoAfterARequest)
{
    GTEST_FLAG_SET(death_test_style, "threadsafe");
    const auto hold = [] {
        std::promise<void> described;
        VOrderlyStop stop([] {},
                          [&] {
                              kill(getpid(), SIGTERM); // arrives before this line is logged
                              described.set_value();
                              return std::string();
                          },
                          std::chrono::milliseconds(1));
        stop.Request();
        (void)described.get_future().wait_for(generousLimit);
    };

    EXPECT_EXIT(hold(), testing::ExitedWithCode(VOrderlyStop::forcedExitCode), "");
}

TEST_F(OrderlyStop, SignalsReachNoThreadThatIsMadeLater)
{
    TestSupport::VLogCapture log;
    const auto stop = Make(noPatienceNeeded);

    sigset_t inherited;
    std::thread([&] { pthread_sigmask(SIG_SETMASK, nullptr, &inherited); }).join();

    EXPECT_EQ(1, sigismember(&inherited, SIGINT));
    EXPECT_EQ(1, sigismember(&inherited, SIGTERM));
}
