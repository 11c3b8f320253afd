#include "DebugServices/AssertFailHandler.h"

#include "DebugServices/Log.h"
#include "DebugServices/NoCoreFile.h"

#include <gmock/gmock.h>

#include <csignal>
#include <stdexcept>
#include <string>
#include <thread>

namespace {

/// Puts a handler in place for its own lifetime.
class VScopedHandler
{
public:
    explicit VScopedHandler(DebugServices::AssertFailHandler handler)
        : previous(DebugServices::SetAssertFailHandler(std::move(handler)))
    {
    }
    ~VScopedHandler() { DebugServices::SetAssertFailHandler(previous); }

private:
    const DebugServices::AssertFailHandler previous;
};

void FailByException(const char* expression, const char*, int)
{
    throw std::runtime_error(expression);
}

void FailQuietly(const char*, const char*, int) {}

} // namespace

TEST(AssertFailHandlerDeath, LogsAtLevelTwoAndAbortsByDefault)
{
    GTEST_FLAG_SET(death_test_style, "threadsafe");

    EXPECT_EXIT(
        {
            NoCoreFile();
            DebugServices::CallAssertFailHandler("pDataStoreDelta", "src/File.cpp", 12);
        },
        testing::KilledBySignal(SIGABRT),
        "error .Assertion. Assertion failed: pDataStoreDelta .src/File.cpp:12.\n");
}

TEST(AssertFailHandlerDeath, LogsWhateverTheLevelOfItsCategory)
{
    GTEST_FLAG_SET(death_test_style, "threadsafe");

    EXPECT_EXIT(
        {
            NoCoreFile();
            DebugServices::SetLogLevel("Assertion", 1);
            DebugServices::CallAssertFailHandler("x", "y", 1);
        },
        testing::KilledBySignal(SIGABRT), "Assertion failed: x .y:1.");
}

TEST(AssertFailHandlerDeath, TakesNullTextsAsEmpty)
{
    GTEST_FLAG_SET(death_test_style, "threadsafe");

    EXPECT_EXIT(
        {
            NoCoreFile();
            DebugServices::CallAssertFailHandler(nullptr, nullptr, 3);
        },
        testing::KilledBySignal(SIGABRT), "Assertion failed:  .:3.");
}

TEST(AssertFailHandlerDeath, AbortsAgainOnceAnEmptyHandlerIsSet)
{
    GTEST_FLAG_SET(death_test_style, "threadsafe");

    EXPECT_EXIT(
        {
            NoCoreFile();
            DebugServices::SetAssertFailHandler(&FailQuietly);
            DebugServices::CallAssertFailHandler("quiet", "y", 1);
            DebugServices::SetAssertFailHandler(DebugServices::AssertFailHandler());
            DebugServices::CallAssertFailHandler("loud", "y", 2);
        },
        testing::KilledBySignal(SIGABRT),
        testing::AllOf(testing::HasSubstr("loud"), testing::Not(testing::HasSubstr("quiet"))));
}

TEST(AssertFailHandler, MayReturnAndTheCallerGoesOn)
{
    std::string reported;
    const VScopedHandler handler([&](const char* expression, const char* file, int line) {
        reported = std::string(expression) + "|" + file + "|" + std::to_string(line);
    });

    DebugServices::CallAssertFailHandler("a == b", "src/File.cpp", 12);
    EXPECT_EQ("a == b|src/File.cpp|12", reported);

    DebugServices::CallAssertFailHandler(nullptr, nullptr, 0);
    EXPECT_EQ("||0", reported);
}

TEST(AssertFailHandler, MayThrowAndTheExceptionReachesTheCaller)
{
    const VScopedHandler handler(&FailByException);

    EXPECT_THROW(DebugServices::CallAssertFailHandler("x", "y", 1), std::runtime_error);
}

TEST(AssertFailHandler, IsReturnedWhenItIsReplaced)
{
    int first = 0;
    const VScopedHandler handler([&first](const char*, const char*, int) { ++first; });

    const DebugServices::AssertFailHandler previous =
        DebugServices::SetAssertFailHandler(&FailQuietly);
    ASSERT_FALSE(previous.empty());
    previous("x", "y", 1);

    EXPECT_EQ(1, first);
}

TEST(AssertFailHandler, IsEmptyWhenItLogsAndAborts)
{
    const DebugServices::AssertFailHandler previous =
        DebugServices::SetAssertFailHandler(&FailQuietly);
    DebugServices::SetAssertFailHandler(DebugServices::AssertFailHandler());

    EXPECT_TRUE(previous.empty());
}

TEST(AssertFailHandler, MayReplaceItselfWhileItRuns)
{
    int calls = 0;
    const VScopedHandler handler([&calls](const char*, const char*, int) {
        DebugServices::SetAssertFailHandler(&FailQuietly);
        ++calls; // the function that runs must still be there
    });

    DebugServices::CallAssertFailHandler("x", "y", 1);
    DebugServices::CallAssertFailHandler("x", "y", 2);

    EXPECT_EQ(1, calls);
}

TEST(AssertFailHandler, IsReplacedWhileOthersCallIt)
{
    const VScopedHandler handler(&FailQuietly);

    std::thread failing([] {
        for (int i = 0; i < 1000; ++i) {
            DebugServices::CallAssertFailHandler("x", "y", i);
        }
    });
    int calls = 0;
    for (int i = 0; i < 1000; ++i) {
        DebugServices::SetAssertFailHandler(&FailQuietly);
        calls += DebugServices::SetAssertFailHandler(&FailQuietly).empty() ? 0 : 1;
    }
    failing.join();

    EXPECT_EQ(1000, calls);
}
