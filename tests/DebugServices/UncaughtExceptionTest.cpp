#include "DebugServices/UncaughtException.h"

#include "DebugServices/ThreadName.h"
#include "support/LogCapture.h"

#include <gmock/gmock.h>

#include <functional>
#include <stdexcept>
#include <thread>

using testing::ElementsAre;

namespace {

/// Runs a function on a thread of that name whose entry reports what comes out.
void RunReported(const char* name, const char* category, const std::function<void()>& function)
{
    std::thread([&] {
        DebugServices::SetThreadName(name);
        try {
            function();
        } catch (...) {
            DebugServices::ReportUncaughtException(category);
        }
    }).join();
}

struct VNoStandardException
{
};

/// Fails at every message, as a log without memory would.
class VFailingLog : public KVR::ILogCategorised
{
public:
    KVR::ILogCategory* GetCategory(const std::string&) override
    {
        throw std::runtime_error("no category");
    }
    void Log(const std::string&, const KVR::ILogCategory*, int, const char*, int) override {}
};

} // namespace

TEST(UncaughtException, IsLoggedWithThreadNameAndText)
{
    const TestSupport::VLogCapture capture;

    RunReported("Control Heartbeat Monitor0", "Notification",
                [] { throw std::runtime_error("disk on fire"); });

    ASSERT_EQ(1u, capture.Messages().size());
    const TestSupport::VLoggedMessage message = capture.Messages()[0];
    EXPECT_EQ("Notification", message.Category);
    EXPECT_EQ(2, message.Level);
    EXPECT_EQ("Thread \"Control Heartbeat Monitor0\" ended by an exception: "
              "std::runtime_error: disk on fire",
              message.Text);
}

TEST(UncaughtException, OfAForeignTypeIsLoggedByItsType)
{
    const TestSupport::VLogCapture capture;

    RunReported("a", "Notification", [] { throw 5; });
    RunReported("b", "Notification", [] { throw VNoStandardException(); });

    EXPECT_THAT(capture.Texts("Notification"),
                ElementsAre("Thread \"a\" ended by an exception: int",
                            "Thread \"b\" ended by an exception: "
                            "(anonymous namespace)::VNoStandardException"));
}

TEST(UncaughtException, MayBeReportedWhereThereIsNone)
{
    const TestSupport::VLogCapture capture;
    DebugServices::ReportUncaughtException(nullptr);

    ASSERT_EQ(1u, capture.Messages().size());
    EXPECT_EQ("", capture.Messages()[0].Category);
    EXPECT_THAT(capture.Messages()[0].Text, testing::EndsWith("by an exception: no exception"));
}

TEST(UncaughtException, IsNotLoggedBelowLevelTwo)
{
    const TestSupport::VLogLevel level("UncaughtExceptionTest", 1);
    const TestSupport::VLogCapture capture;

    RunReported("a", "UncaughtExceptionTest", [] { throw 5; });

    EXPECT_TRUE(capture.Messages().empty());
}

TEST(UncaughtException, IsDroppedWhereTheLogFails)
{
    static VFailingLog& failing = *new VFailingLog; // a log is never destroyed
    KVR::ILogCategorised* const previous = DebugServices::SetGlobalLog(&failing);

    RunReported("a", "Notification", [] { throw 5; }); // ends the process if it gets out

    EXPECT_EQ(&failing, DebugServices::SetGlobalLog(previous));
}
