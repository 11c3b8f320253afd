#include "device/ChildProgram.h"

#include <csignal>
#include <string>

#include <gmock/gmock.h>

// korva-control authorize against a running host, which has no window and lets every device in.

namespace {

using testing::HasSubstr;
using testing::StartsWith;
using TestSupport::VHostProcess;

class ProgramAuthorize : public testing::Test
{
protected:
    void SetUp() override { ASSERT_TRUE(host.WaitReady()) << host.Errors(); }

    /// Waits until the host's state has a text.
    bool StateShows(const std::string& text)
    {
        const auto deadline = std::chrono::steady_clock::now() + TestSupport::hostLimit;
        while (host.Command("state").find(text) == std::string::npos) {
            if (std::chrono::steady_clock::now() > deadline) {
                return false;
            }
        }
        return true;
    }

    VHostProcess host;
};

} // namespace

TEST_F(ProgramAuthorize, WaitsForTheOutcome)
{
    const VOutcome outcome = RunProgram({"authorize", "--id", "a", "--name", "Ann", "--wait"});

    EXPECT_THAT(outcome.Output,
                StartsWith("the operator is being asked\nauthorized by Quorix on "));
    EXPECT_EQ(0, outcome.ExitCode) << outcome.Errors;
    EXPECT_TRUE(StateShows(R"("control":{"a":{"Connected":true,"Name":"Ann"}})"));
}

TEST_F(ProgramAuthorize, WithoutWaitingItEndsWithTheRequest)
{
    const VOutcome outcome =
        RunProgram({"--json", "authorize", "--id", "a", "--name", "<b>Ann</b>"});

    EXPECT_THAT(outcome.Output, StartsWith(R"({"status":"Pending","serverName":"Quorix on )"));
    EXPECT_THAT(outcome.Output, HasSubstr(R"(","serverVersion":"300"})"));
    EXPECT_EQ(0, outcome.ExitCode) << outcome.Errors;
    EXPECT_TRUE(StateShows(R"("Name":"<b>Ann</b>")"));
}

TEST_F(ProgramAuthorize, AnotherDeviceWaitsUntilTheHolderWasSilent)
{
    VChildProgram holder({"authorize", "--id", "a", "--name", "Ann", "--hold"});
    EXPECT_EQ("the operator is being asked", holder.ReadLine());
    EXPECT_THAT(holder.ReadLine().value_or(""), StartsWith("authorized by "));

    const VOutcome early = RunProgram({"authorize", "--id", "b", "--name", "Bob", "--wait"});
    EXPECT_THAT(early.Output, HasSubstr("another device holds the connection"));
    EXPECT_EQ(1, early.ExitCode) << early.Errors;

    holder.Signal(SIGINT);
    EXPECT_EQ(0, holder.Finish().ExitCode);
    EXPECT_EQ("ok", host.Command("clock +3500"));
    const VOutcome late = RunProgram({"authorize", "--id", "b", "--name", "Bob", "--wait"});
    EXPECT_EQ(0, late.ExitCode) << late.Output << late.Errors;
}

TEST_F(ProgramAuthorize, TheHolderHearsThatTheHostGoesAway)
{
    VChildProgram holder({"--json", "authorize", "--id", "a", "--name", "Ann", "--hold"});
    EXPECT_THAT(holder.ReadLine().value_or(""), StartsWith(R"({"status":"Pending")"));
    EXPECT_THAT(holder.ReadLine().value_or(""), StartsWith(R"({"status":"Authorized")"));

    EXPECT_EQ("ok", host.Command("quit"));

    EXPECT_THAT(holder.ReadLine().value_or(""), StartsWith(R"({"status":"Lost")"));
    EXPECT_EQ(3, holder.Finish().ExitCode);
    EXPECT_EQ(0, host.WaitExit().value_or(-1)) << host.Errors();
}

TEST_F(ProgramAuthorize, CancellingIsDoneWhateverTheHostSays)
{
    const VOutcome outcome = RunProgram({"authorize", "--cancel"});

    EXPECT_EQ("the request is taken back\n", outcome.Output);
    EXPECT_EQ(0, outcome.ExitCode) << outcome.Errors;
}

TEST_F(ProgramAuthorize, WrongUsageIsRefused)
{
    for (const std::vector<std::string>& wrong :
         {std::vector<std::string>{"authorize"},
          {"authorize", "--id", "a"},
          {"authorize", "--name", "a"},
          {"authorize", "--cancel", "--wait"},
          {"authorize", "--cancel", "--hold", "--id", "a"},
          {"authorize", "--id", "a", "--name", "b", "more"}}) {
        EXPECT_EQ(2, RunProgram(wrong).ExitCode);
    }
    EXPECT_THAT(host.Command("state"), HasSubstr(R"("control":{})"));
}
