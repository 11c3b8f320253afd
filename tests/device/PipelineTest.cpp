#include "ControlStreamClient/Pipeline.h"

#include <gmock/gmock.h>

namespace {

using namespace ControlStream;
using namespace std::chrono_literals;
using testing::ElementsAre;

/// A pipeline whose clock the test moves, with what became of each request.
class Pipeline : public testing::Test
{
protected:
    /// Adds a request whose outcome is noted under its number.
    void Add(EMessageKind kind, std::uint64_t number, std::size_t size = 10,
             std::chrono::milliseconds limit = 1000ms)
    {
        VPendingRequest request;
        request.Number = number;
        request.Text = std::string(size, 'r');
        request.Kind = kind;
        request.Name = "Go";
        request.TimeLimit = limit;
        request.Finish = [this, number](VOutcome<VMessage> outcome) {
            const VError* const error = outcome.Error();
            ended.push_back(std::to_string(number) + ": " +
                            (error != nullptr ? error->what() : "reply"));
        };
        pipeline.Add(std::move(request), now);
    }

    /// Sends what may be sent. @return how many bytes of texts that is
    std::size_t Send()
    {
        VSendQueue queue;
        pipeline.Send(queue, now);
        return queue.Size();
    }

    bool Accept(EMessageKind kind, const std::string& correlation = "")
    {
        VMessage message;
        message.Kind = kind;
        message.Correlation = correlation;
        return pipeline.Accept(std::move(message), now);
    }

    void Expire(std::chrono::milliseconds later, bool connected = true)
    {
        now += later;
        pipeline.Expire(now, connected);
    }

    VPipeline::Clock::time_point now = VPipeline::Clock::time_point() + 1h;
    std::vector<std::string> ended;
    VPipeline pipeline;
};

constexpr EMessageKind Reply = EMessageKind::CommandReply;

TEST_F(Pipeline, MatchesRepliesByCorrelationInAnyOrder)
{
    Add(Reply, 1);
    Add(Reply, 2);
    Add(EMessageKind::Commands, 3);
    Send();

    EXPECT_TRUE(Accept(EMessageKind::Commands, "3"));
    EXPECT_TRUE(Accept(Reply, "1"));
    EXPECT_FALSE(Accept(Reply, "1")) << "each request has one reply";
    EXPECT_FALSE(Accept(EMessageKind::Commands, "2")) << "a reply of another kind";
    EXPECT_TRUE(Accept(Reply, "2"));

    EXPECT_THAT(ended, ElementsAre("3: reply", "1: reply", "2: reply"));
    EXPECT_TRUE(pipeline.IsIdle());
}

TEST_F(Pipeline, PassesOverWhatNobodyAskedFor)
{
    Add(Reply, 7);
    Send();

    for (const char* const correlation : {"", "6", "8", "x", "7 ", "18446744073709551616"}) {
        EXPECT_FALSE(Accept(Reply, correlation)) << correlation;
    }
    EXPECT_FALSE(Accept(EMessageKind::Events));
    EXPECT_FALSE(Accept(EMessageKind::Unknown));
    EXPECT_TRUE(ended.empty());
}

TEST_F(Pipeline, TakesRepliesWithoutCorrelationInOrder)
{
    Add(EMessageKind::EventInformation, 1);
    Add(EMessageKind::ServerInformation, 2);
    Add(EMessageKind::EventInformation, 3);
    Send();

    Accept(EMessageKind::EventInformation);
    Accept(EMessageKind::EventInformation);
    Accept(EMessageKind::ServerInformation);

    EXPECT_THAT(ended, ElementsAre("1: reply", "3: reply", "2: reply"));
}

TEST_F(Pipeline, KeepsAtMost64KiBUnanswered)
{
    for (std::uint64_t number = 1; number <= 10; ++number) {
        Add(Reply, number, 10000);
    }

    EXPECT_EQ(6 * 10004U, Send());
    EXPECT_EQ(0U, Send());
    Accept(Reply, "1");
    Accept(Reply, "2");
    EXPECT_EQ(0U, Send()) << "they are to leave in few pieces";
    Accept(Reply, "3");
    EXPECT_EQ(3 * 10004U, Send());
}

TEST_F(Pipeline, SendsALongRequestAlone)
{
    Add(Reply, 1, 10);
    Add(Reply, 2, UnansweredLimit + 1);
    Add(Reply, 3, 10);

    EXPECT_EQ(14U, Send());
    Accept(Reply, "1");
    EXPECT_EQ(UnansweredLimit + 5, Send());
    EXPECT_EQ(0U, Send());
    Accept(Reply, "2");
    EXPECT_EQ(14U, Send());
}

TEST_F(Pipeline, SaysWhatWasWaitedForWhenTimeIsUp)
{
    Add(Reply, 1, 10, 1500ms);
    Add(EMessageKind::Events, 2, 10, 500ms);
    Send();
    EXPECT_EQ(now + 500ms, pipeline.NextExpiry());

    Expire(499ms);
    EXPECT_TRUE(ended.empty());
    Expire(1ms);
    EXPECT_EQ(now + 1000ms, pipeline.NextExpiry());
    Expire(1000ms);

    EXPECT_THAT(ended, ElementsAre("2: timed out after 0.5 s, waiting for the list of events",
                                   "1: timed out after 1.5 s, waiting for the reply to the command "
                                   "\"Go\""));
    EXPECT_EQ(VPipeline::Clock::time_point::max(), pipeline.NextExpiry());
}

TEST_F(Pipeline, FreesTheRoomOfARequestThatTimedOut)
{
    Add(Reply, 1, UnansweredLimit);
    Send();
    Add(Reply, 2, 100, 60000ms);
    EXPECT_EQ(0U, Send());

    Expire(1000ms);

    EXPECT_EQ(104U, Send());
    EXPECT_FALSE(Accept(Reply, "1")) << "late";
    EXPECT_TRUE(Accept(Reply, "2"));
}

TEST_F(Pipeline, DoesNotTakeALateReplyForThatToTheNextRequestOfItsKind)
{
    Add(EMessageKind::Events, 1);
    Send();
    Expire(1000ms);
    Add(EMessageKind::Events, 2);
    Send();

    EXPECT_TRUE(Accept(EMessageKind::Events)) << "the late one";
    EXPECT_EQ(1U, ended.size());
    EXPECT_TRUE(Accept(EMessageKind::Events));
    EXPECT_EQ("2: reply", ended.back());
}

TEST_F(Pipeline, KnowsByALaterReplyThatAnEarlierOneNeverComes)
{
    Add(EMessageKind::Events, 1);
    Send();
    Expire(1000ms);
    Add(Reply, 2);
    Add(EMessageKind::Events, 3);
    Send();

    Accept(Reply, "2");
    EXPECT_TRUE(Accept(EMessageKind::Events));

    EXPECT_EQ("3: reply", ended.back());
}

TEST_F(Pipeline, GivesUpTheRestOfAHostThatAnswersNothing)
{
    Add(Reply, 1, UnansweredLimit);
    Add(Reply, 2);
    Send();

    Expire(1000ms);

    EXPECT_THAT(ended,
                ElementsAre("1: timed out after 1 s, waiting for the reply to the command \"Go\"",
                            "2: timed out after 1 s, waiting for replies to what was sent before; "
                            "nothing was sent for the reply to the command \"Go\""));
    EXPECT_TRUE(pipeline.IsSilent());
    EXPECT_TRUE(pipeline.IsIdle());
}

TEST_F(Pipeline, GoesOnWithAHostThatLeavesOneRequestUnanswered)
{
    Add(Reply, 1, 1000);
    Add(Reply, 2, UnansweredLimit - 1000);
    Add(Reply, 3);
    Send();
    now += 10ms;
    Accept(Reply, "2");
    Expire(990ms);

    EXPECT_EQ(2U, ended.size());
    EXPECT_FALSE(pipeline.IsSilent());
    EXPECT_EQ(14U, Send());
}

TEST_F(Pipeline, WaitsForAConnectionWithinTheTimeLimit)
{
    Add(Reply, 1, 10, 1000ms);
    Expire(999ms, false);
    EXPECT_TRUE(ended.empty());

    Expire(1ms, false);

    EXPECT_THAT(ended, ElementsAre("1: timed out after 1 s, waiting for a connection to the host; "
                                   "nothing was sent for the reply to the command \"Go\""));
}

TEST_F(Pipeline, FailsWhatWasSentAndKeepsTheRestOverALoss)
{
    Add(Reply, 1, UnansweredLimit);
    Add(Reply, 2);
    Send();

    pipeline.FailSent(VError(EErrorKind::Closed, "gone"));

    EXPECT_THAT(ended, ElementsAre("1: gone"));
    EXPECT_EQ(14U, Send());
    pipeline.FailAll(VError(EErrorKind::Closed, "gone again"));
    EXPECT_THAT(ended, ElementsAre("1: gone", "2: gone again"));
    EXPECT_TRUE(pipeline.IsIdle());
}

TEST_F(Pipeline, LetsAFinishingRequestAddAnother)
{
    VPendingRequest request;
    request.Number = 1;
    request.Text = "r";
    request.Kind = Reply;
    request.Finish = [this](const VOutcome<VMessage>&) { Add(Reply, 2); };
    pipeline.Add(std::move(request), now);
    Send();

    Accept(Reply, "1");

    EXPECT_EQ(14U, Send());
    Accept(Reply, "2");
    EXPECT_THAT(ended, ElementsAre("2: reply"));
}

} // namespace
