#include "utils/LogStatement.h"

#include "support/LogCapture.h"
#include "utils/GroupingLocale.h"

#include <gmock/gmock.h>

#include <future>
#include <stdexcept>
#include <thread>
#include <vector>

using testing::ElementsAre;

namespace {

struct VRaising
{
};

std::ostream& operator<<(std::ostream&, const VRaising&)
{
    throw std::runtime_error("not printable");
}

/// Counts how often the log's table of names is asked, and can fail in every way.
class VObservedLog : public KVR::ILogCategorised
{
public:
    KVR::ILogCategory* GetCategory(const std::string& name) override
    {
        ++Fetched;
        if (FetchFails) {
            throw std::bad_alloc();
        }
        return FetchGivesNull ? nullptr : Replaced->GetCategory(name);
    }

    void Log(const std::string&, const KVR::ILogCategory*, int, const char*, int) override
    {
        ++Logged;
        throw std::runtime_error("disk full");
    }

    KVR::ILogCategorised* const Replaced = &KVR::GlobalLog();
    bool FetchFails = false;
    bool FetchGivesNull = false;
    int Fetched = 0;
    int Logged = 0;
};

class LogStatementOnObservedLog : public testing::Test
{
protected:
    LogStatementOnObservedLog() { DebugServices::SetGlobalLog(&log); }
    ~LogStatementOnObservedLog() override { DebugServices::SetGlobalLog(log.Replaced); }

    VObservedLog log; // no other thread is there that could still be in it
};

} // namespace

TEST(LogStatement, LogsTextCategoryLevelFileAndLine)
{
    const TestSupport::VLogCapture capture;
    const int line = __LINE__ + 1;
    KVR_LOG("DataStore", 3, "Took %1%ms to acquire read-lock on change id %2%", 12, 7);

    ASSERT_EQ(1u, capture.Messages().size());
    const TestSupport::VLoggedMessage message = capture.Messages()[0];
    EXPECT_EQ("Took 12ms to acquire read-lock on change id 7", message.Text);
    EXPECT_EQ("DataStore", message.Category);
    EXPECT_EQ(3, message.Level);
    EXPECT_EQ(__FILE__, message.File);
    EXPECT_EQ(line, message.Line);
}

TEST(LogStatement, AdmitsWhatTheLevelOfTheCategoryReaches)
{
    const TestSupport::VLogLevel level("LogStatementTest", 4);
    const TestSupport::VLogCapture capture;

    KVR_LOG("LogStatementTest", 2, "error");
    KVR_LOG("LogStatementTest", 3, "warning");
    KVR_LOG("LogStatementTest", 4, "information");
    KVR_LOG("LogStatementTest", 5, "between");
    KVR_LOG("LogStatementTest", 6, "tracing");

    EXPECT_THAT(capture.Texts("LogStatementTest"), ElementsAre("error", "warning", "information"));
}

TEST(LogStatement, FollowsAChangedLevelAtOnce)
{
    const TestSupport::VLogCapture capture;
    for (const int level : {2, 6, 2, 6}) {
        const TestSupport::VLogLevel scoped("LogStatementTest", level);
        KVR_LOG("LogStatementTest", 6, "at %1%", level);
    }

    EXPECT_THAT(capture.Texts("LogStatementTest"), ElementsAre("at 6", "at 6"));
}

TEST(LogStatement, NeitherEvaluatesNorFormatsWhatIsFiltered)
{
    const TestSupport::VLogLevel level("LogStatementTest", 2);
    const TestSupport::VLogCapture capture;
    int evaluated = 0;
    const auto evaluate = [&evaluated] {
        ++evaluated;
        return VRaising();
    };

    KVR_LOG("LogStatementTest", 6, "%1% %2% %s", evaluate());

    EXPECT_EQ(0, evaluated);
    EXPECT_TRUE(capture.Messages().empty());
}

TEST(LogStatement, LogsAFormatThatDoesNotFitAtLevelTwo)
{
    const TestSupport::VLogLevel level("LogStatementTest", 6);
    const TestSupport::VLogCapture capture;
    const int line = __LINE__ + 1;
    KVR_LOG("LogStatementTest", 6, "only %2%", 1);
    KVR_LOG("LogStatementTest", 4, "raising %1%", VRaising());
    KVR_LOG("LogStatementTest", 4, "mixed %s %1%", 1);

    EXPECT_THAT(capture.Texts("LogStatementTest"),
                ElementsAre("Cannot Format Log Message \"only %2%\"",
                            "Cannot Format Log Message \"raising %1%\"",
                            "Cannot Format Log Message \"mixed %s %1%\""));
    EXPECT_EQ(2, capture.Messages()[0].Level);
    EXPECT_EQ(__FILE__, capture.Messages()[0].File);
    EXPECT_EQ(line, capture.Messages()[0].Line);
}

TEST(LogStatement, DoesNotAskTheLevelAgainForWhatDoesNotFit)
{
    const TestSupport::VLogLevel level("LogStatementTest", 1);
    const TestSupport::VLogCapture capture;

    KVR_LOG("LogStatementTest", 1, "only %2%", 1);

    EXPECT_THAT(capture.Texts("LogStatementTest"),
                ElementsAre("Cannot Format Log Message \"only %2%\""));
}

TEST(LogStatement, LetsTheExceptionOfAnArgumentsOwnExpressionPass)
{
    const TestSupport::VLogCapture capture;
    const std::vector<int> empty;

    EXPECT_THROW(KVR_LOG("Config", 2, "%1%", empty.at(1)), std::out_of_range);
}

TEST(LogStatement, FollowsNoGlobalLocale)
{
    const VGroupingLocale locale;
    const TestSupport::VLogCapture capture;

    KVR_LOG("Config", 2, "%1% %2%", 1234567, 1.5);

    EXPECT_THAT(capture.Texts("Config"), ElementsAre("1234567 1.5"));
}

TEST(LogStatement, MayStandWhereOneStatementMay)
{
    const TestSupport::VLogCapture capture;

    for (const bool first : {true, false}) {
        // NOLINTBEGIN(readability-braces-around-statements): what is tried
        if (first)
            KVR_LOG("Config", 2, "first");
        else
            KVR_LOG("Config", 2, "second");
        // NOLINTEND(readability-braces-around-statements)
    }

    EXPECT_THAT(capture.Texts("Config"), ElementsAre("first", "second"));
}

TEST_F(LogStatementOnObservedLog, FetchesItsCategoryOnce)
{
    DebugServices::SetLogLevel("LogStatementTest", 4);
    for (int i = 0; i < 5; ++i) {
        KVR_LOG("LogStatementTest", i % 2 == 0 ? 4 : 6, "%1%", i);
    }

    EXPECT_EQ(1, log.Fetched);
    EXPECT_EQ(3, log.Logged);
}

TEST_F(LogStatementOnObservedLog, SwallowsAFailureOfTheLog)
{
    EXPECT_NO_THROW(KVR_LOG("Config", 2, "%1%", 1));

    EXPECT_EQ(1, log.Logged);
}

TEST_F(LogStatementOnObservedLog, TriesAgainToFetchACategoryThatCouldNotBeMade)
{
    KVR::VLogStatement statement("Config");
    log.FetchFails = true;
    EXPECT_FALSE(statement.Admits(2));
    log.FetchFails = false;
    log.FetchGivesNull = true;
    EXPECT_FALSE(statement.Admits(2));
    log.FetchGivesNull = false;

    EXPECT_TRUE(statement.Admits(2));
    EXPECT_EQ(3, log.Fetched);
}

TEST(LogStatement, IsFirstUsedByManyThreadsAtOnce)
{
    constexpr int rounds = 100;
    constexpr int threadCount = 4;
    const TestSupport::VLogCapture capture;

    for (int round = 0; round < rounds; ++round) {
        KVR::VLogStatement statement("LogStatementTest.Race"); // each time at its first use
        std::promise<void> start;
        const std::shared_future<void> started = start.get_future().share();
        std::vector<std::thread> threads;
        threads.reserve(threadCount);
        for (int i = 0; i < threadCount; ++i) {
            threads.emplace_back([&statement, &started] {
                started.wait();
                if (statement.Admits(2)) {
                    statement.Log(2, "", 0, "%1%", "x");
                }
            });
        }
        start.set_value();
        for (std::thread& thread : threads) {
            thread.join();
        }
    }

    EXPECT_EQ(static_cast<std::size_t>(rounds * threadCount), capture.Messages().size());
}

TEST(LogStatement, HearsALevelThatAnotherThreadChanges)
{
    const TestSupport::VLogLevel level("LogStatementTest", 2);
    const TestSupport::VLogCapture capture;
    std::promise<void> raise;
    std::promise<void> raised;

    std::thread raising([&raise, &raised] {
        raise.get_future().wait();
        DebugServices::SetLogLevel("LogStatementTest", 6);
        raised.set_value();
    });
    for (const char* text : {"too early", "in time"}) {
        KVR_LOG("LogStatementTest", 6, "%1%", text);
        if (text[0] == 't') {
            raise.set_value();
            raised.get_future().wait();
        }
    }
    raising.join();

    EXPECT_THAT(capture.Texts("LogStatementTest"), ElementsAre("in time"));
}
