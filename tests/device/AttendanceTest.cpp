#include "ControlStreamClient/Attendance.h"

#include <gmock/gmock.h>

#include <utility>

namespace {

using namespace ControlStream;
using namespace std::chrono_literals;
using testing::ElementsAre;
using testing::IsEmpty;

/// An attendance whose clock and whose host the test is.
class Attendance : public testing::Test
{
protected:
    using Finish = std::function<void(VOutcome<VCommandReply>)>;

    void Make()
    {
        attendance.emplace(
            options, Run(), [this] { ++changes; }, [this] { return now; });
    }

    VAttendance::Run Run()
    {
        return [this](const VCall& call, Finish finish) {
            std::string text = call.Name;
            for (const VParameter& parameter : call.Parameters) {
                text += " " + parameter.Name + "=" + parameter.Value;
            }
            sent.push_back(text);
            open.push_back(std::move(finish));
        };
    }

    /// Answers the oldest request that is open.
    void Answer(const VOutcome<VCommandReply>& outcome)
    {
        const Finish finish = std::move(open.front());
        open.erase(open.begin());
        finish(outcome);
    }

    void AnswerStatus(const std::string& status)
    {
        VCommandReply reply;
        reply.Ok = true;
        reply.Result = "OK";
        reply.Parameters = {{"Status", status}};
        Answer(reply);
    }

    void Hear(const std::string& status)
    {
        attendance->OnEvent({"Event.Authorize", {{"Status", status}, {"ServerName", "s"}}});
    }

    std::vector<std::string> ActAfter(std::chrono::milliseconds time)
    {
        now += time;
        sent.clear();
        attendance->Act();
        return sent;
    }

    VAsyncOptions options = [] {
        VAsyncOptions some;
        some.Device = VDeviceIdentity{"d-1", "Remote"};
        return some;
    }();
    VAttendance::Clock::time_point now = VAttendance::Clock::time_point() + 1h;
    std::vector<std::string> sent;
    std::vector<Finish> open;
    int changes = 0;
    std::optional<VAttendance> attendance;
};

TEST_F(Attendance, AsksOnEachConnectionAndBeatsEverySecond)
{
    Make();
    EXPECT_THAT(ActAfter(0ms), IsEmpty()) << "there is no connection";
    attendance->OnConnected();

    EXPECT_THAT(ActAfter(0ms), ElementsAre("System.Authorize DeviceId=d-1 DeviceName=Remote"));
    EXPECT_THAT(ActAfter(0ms), IsEmpty()) << "one request at a time";
    AnswerStatus("Authorized");
    EXPECT_EQ(EPermission::Authorized, attendance->Permission());
    EXPECT_THAT(ActAfter(0ms), ElementsAre("System.Heartbeat BeatId=1"));
    EXPECT_THAT(ActAfter(999ms), IsEmpty());
    AnswerStatus("");
    EXPECT_EQ(now + 1ms, attendance->NextAct());
    EXPECT_THAT(ActAfter(1ms), ElementsAre("System.Heartbeat BeatId=2"));
    EXPECT_THAT(ActAfter(5000ms), IsEmpty()) << "the last one is not answered yet";

    attendance->OnLost();
    open.clear();
    EXPECT_EQ(EPermission::Unasked, attendance->Permission());
    attendance->OnConnected();
    EXPECT_THAT(ActAfter(0ms), ElementsAre("System.Authorize DeviceId=d-1 DeviceName=Remote"));
}

TEST_F(Attendance, WaitsForTheOperatorAndHearsTheOutcome)
{
    Make();
    attendance->OnConnected();
    ActAfter(0ms);
    AnswerStatus("Pending");
    EXPECT_EQ(EPermission::Pending, attendance->Permission());
    EXPECT_THAT(ActAfter(60000ms), IsEmpty()) << "neither asks again nor beats";
    EXPECT_EQ(VAttendance::Clock::time_point::max(), attendance->NextAct());

    Hear("Authorized");

    EXPECT_EQ(EPermission::Authorized, attendance->Permission());
    EXPECT_THAT(ActAfter(0ms), ElementsAre("System.Heartbeat BeatId=1"));
    Hear("Failed");
    EXPECT_EQ(EPermission::Authorized, attendance->Permission()) << "that was another device's";
}

TEST_F(Attendance, TakesAnOutcomeThatOvertakesTheAnswer)
{
    for (const auto& [status, permission] : {std::pair("Authorized", EPermission::Authorized),
                                             std::pair("Failed", EPermission::Refused)}) {
        Make();
        attendance->OnConnected();
        ActAfter(0ms);
        Hear(status);
        EXPECT_EQ(EPermission::Unasked, attendance->Permission()) << "it may be another device's";

        AnswerStatus("Pending");

        EXPECT_EQ(permission, attendance->Permission());
        const bool beats = permission == EPermission::Authorized;
        EXPECT_EQ(beats ? 1U : 0U, ActAfter(0ms).size());
        open.clear();
    }
}

TEST_F(Attendance, LeavesAnOutcomeToTheDeviceWhoseRequestWasOpen)
{
    Make();
    attendance->OnConnected();
    ActAfter(0ms);
    Hear("Authorized");
    AnswerStatus("Connected");
    EXPECT_EQ(EPermission::Taken, attendance->Permission());

    ActAfter(options.AskAgain);
    AnswerStatus("Pending");

    EXPECT_EQ(EPermission::Pending, attendance->Permission()) << "that was before this request";
}

TEST_F(Attendance, DoesNotNagTheOperatorAfterARefusal)
{
    Make();
    attendance->OnConnected();
    ActAfter(0ms);
    AnswerStatus("Pending");
    Hear("Failed");
    EXPECT_EQ(EPermission::Refused, attendance->Permission());

    EXPECT_THAT(ActAfter(60000ms), IsEmpty());
    attendance->OnLost();
    attendance->OnConnected();
    EXPECT_THAT(ActAfter(0ms), IsEmpty());
    EXPECT_EQ(EPermission::Refused, attendance->Permission());

    attendance->Ask();
    EXPECT_THAT(ActAfter(0ms), ElementsAre("System.Authorize DeviceId=d-1 DeviceName=Remote"));
}

TEST_F(Attendance, KnowsABanByTheAnswer)
{
    Make();
    attendance->OnConnected();
    ActAfter(0ms);

    AnswerStatus("Failed");

    EXPECT_EQ(EPermission::Refused, attendance->Permission());
    EXPECT_EQ(1, changes);
}

TEST_F(Attendance, AsksAgainWhileThePlaceIsTaken)
{
    Make();
    attendance->OnConnected();
    ActAfter(0ms);
    AnswerStatus("Connected");
    EXPECT_EQ(EPermission::Taken, attendance->Permission());

    EXPECT_THAT(ActAfter(1999ms), IsEmpty());
    EXPECT_EQ(1U, ActAfter(1ms).size());
    AnswerStatus("Connected");
    Hear("Authorized");
    EXPECT_EQ(1U, ActAfter(0ms).size()) << "a decision is worth another question";
    EXPECT_EQ(EPermission::Taken, attendance->Permission());
}

TEST_F(Attendance, NeverAsksAgainWhereThatIsChosen)
{
    options.AskAgain = 0ms;
    Make();
    attendance->OnConnected();
    ActAfter(0ms);

    AnswerStatus("Connected");

    EXPECT_THAT(ActAfter(600000ms), IsEmpty());
}

TEST_F(Attendance, StopsBeatingWhenTheHostSaysFarewell)
{
    Make();
    attendance->OnConnected();
    ActAfter(0ms);
    AnswerStatus("Authorized");

    attendance->OnEvent({"Event.Disconnect", {}});

    EXPECT_EQ(EPermission::Unasked, attendance->Permission());
    EXPECT_THAT(ActAfter(5000ms), IsEmpty());
}

TEST_F(Attendance, FailsWithABeatThatIsNotAnswered)
{
    options.Device.reset();
    options.BeatsAlways = true;
    Make();
    attendance->OnConnected();
    EXPECT_THAT(ActAfter(0ms), ElementsAre("System.Heartbeat BeatId=1"));

    Answer(VError(EErrorKind::TimedOut, "no beat"));

    ASSERT_TRUE(attendance->Failure());
    EXPECT_STREQ("no beat", attendance->Failure()->what());
    attendance->OnLost();
    attendance->OnConnected();
    EXPECT_FALSE(attendance->Failure());
}

TEST_F(Attendance, TakesBackARequestThatTheOperatorHasNotAnswered)
{
    Make();
    attendance->OnConnected();
    ActAfter(0ms);
    attendance->GiveUp();
    EXPECT_EQ(1U, sent.size()) << "nothing is known to wait";
    AnswerStatus("Pending");

    attendance->GiveUp();

    EXPECT_EQ("System.Authorize.Cancel DeviceId=d-1", sent.back());
}

TEST_F(Attendance, DoesNothingWithoutADevice)
{
    options.Device.reset();
    Make();
    attendance->OnConnected();
    attendance->Ask();

    EXPECT_THAT(ActAfter(10000ms), IsEmpty());
    EXPECT_EQ(VAttendance::Clock::time_point::max(), attendance->NextAct());
}

} // namespace
