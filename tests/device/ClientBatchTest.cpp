#include "device/ClientSupport.h"

#include <gmock/gmock.h>

#include <sys/ioctl.h>

namespace {

using namespace ControlStream;
using namespace std::chrono_literals;
using testing::StartsWith;

/// Returns the correlation of a request.
std::string CorrelationOf(const std::string& request)
{
    const std::string open = "<Correlation>";
    const std::size_t begin = request.find(open) + open.size();
    return request.substr(begin, request.find('<', begin) - begin);
}

std::string ErrorOf(const VOutcome<VCommandReply>& outcome)
{
    return outcome.Error() != nullptr ? outcome.Error()->what() : "a reply";
}

TEST(ClientBatch, ReturnsTheRepliesInTheOrderOfTheCalls)
{
    VScriptedHost host([](VPeer& peer) {
        std::vector<std::string> correlations;
        for (int i = 0; i < 3; ++i) {
            correlations.push_back(CorrelationOf(peer.ReadFrame()));
        }
        peer.SendFrame(ReplyText(correlations[2], "third"));
        peer.SendFrame(EventText("Meanwhile"));
        peer.SendFrame(ReplyText(correlations[0], "first"));
        peer.SendFrame(ReplyText(correlations[1]));
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());

    const auto outcomes = client.ExecuteBatch({{"A", {}}, {"B", {}}, {"C", {}}});

    ASSERT_EQ(3U, outcomes.size());
    EXPECT_EQ("first", outcomes[0].Get().Result);
    EXPECT_TRUE(outcomes[1].Get().Ok);
    EXPECT_EQ("third", outcomes[2].Get().Result);
    EXPECT_EQ("Meanwhile", client.WaitForEvent(0ms)->Name);
    client.Close();
    EXPECT_EQ("", host.Finish());
}

TEST(ClientBatch, OfNothingSendsNothing)
{
    VScriptedHost host([](VPeer& peer) { EXPECT_EQ("", peer.ReadToEnd()); });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());

    EXPECT_TRUE(client.ExecuteBatch({}).empty());

    client.Close();
    EXPECT_EQ("", host.Finish());
}

TEST(ClientBatch, SendsNothingWhereOneCallCannotBeSent)
{
    VScriptedHost host([](VPeer& peer) { EXPECT_EQ("", peer.ReadToEnd()); });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());

    const VThrown thrown = ThrownBy([&] { client.ExecuteBatch({{"Good", {}}, {"", {}}}); });

    EXPECT_EQ(
        (VThrown{EErrorKind::Usage, "in call 2 of the batch, the name of the command is empty, "
                                    "and the host answers nothing to that"}),
        thrown);
    client.Close();
    EXPECT_EQ("", host.Finish());
}

TEST(ClientBatch, NeedsAConnection)
{
    VClient client;

    EXPECT_EQ(EErrorKind::NoConnection, ThrownBy([&] { client.ExecuteBatch({{"Go", {}}}); }).Kind);
}

/// A host that reads nothing more while it cannot write its replies, as real ones are.
TEST(ClientBatch, ReadsWhileItWritesAndKeepsLittleUnanswered)
{
    constexpr int count = 500;
    const std::string big(2000, 'x');
    std::size_t mostUnread = 0;
    VScriptedHost host([&](VPeer& peer) {
        for (int i = 0; i < count; ++i) {
            int unread = 0;
            ioctl(peer.Descriptor(), FIONREAD, &unread);
            mostUnread = std::max(mostUnread, static_cast<std::size_t>(unread));
            peer.SendFrame(ReplyText(CorrelationOf(peer.ReadFrame()), big));
        }
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());

    const auto outcomes = client.ExecuteBatch(std::vector<VCall>(count, VCall{"Go", {{"p", big}}}));

    for (const auto& outcome : outcomes) {
        ASSERT_EQ(big, outcome.Get().Result);
    }
    client.Close();
    EXPECT_EQ("", host.Finish());
    EXPECT_LT(mostUnread, 80U << 10U);
}

TEST(ClientBatch, GoesOnBehindACommandThatIsNeverAnswered)
{
    constexpr std::chrono::milliseconds unhurried{1500}; // the other reply has to come within it
    VScriptedHost host([&](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(ReplyText(CorrelationOf(peer.ReadFrame())));
        peer.ReadToEnd();
    });
    VClient client(WithLimit(unhurried));
    client.Connect("127.0.0.1", host.Port());

    const auto outcomes = client.ExecuteBatch({{"Never", {}}, {"Go", {}}});

    EXPECT_EQ("timed out after 1.5 s, waiting for the reply to the command \"Never\"",
              ErrorOf(outcomes[0]));
    EXPECT_EQ("a reply", ErrorOf(outcomes[1]));
    EXPECT_TRUE(client.IsConnected());
    client.Close();
    EXPECT_EQ("", host.Finish());
}

TEST(ClientBatch, GivesUpAHostThatAnswersNothingAfterOneTimeLimit)
{
    VScriptedHost host([&](VPeer& peer) { peer.ReadToEnd(); });
    VClient client(WithLimit(Hasty));
    client.Connect("127.0.0.1", host.Port());

    const auto outcomes =
        client.ExecuteBatch(std::vector<VCall>(20, VCall{"Go", {{"p", std::string(10000, 'x')}}}));

    EXPECT_THAT(ErrorOf(outcomes[0]), StartsWith("timed out after 0.03 s, waiting for the reply"));
    EXPECT_EQ("timed out after 0.03 s, waiting for replies to what was sent before; nothing was "
              "sent for the reply to the command \"Go\"",
              ErrorOf(outcomes[19]));
    client.Close();
    EXPECT_EQ("", host.Finish());
}

TEST(ClientBatch, TellsWhatIsUnansweredWhenTheConnectionEnds)
{
    VScriptedHost host([&](VPeer& peer) {
        peer.SendFrame(ReplyText(CorrelationOf(peer.ReadFrame())));
        peer.ReadFrame();
        peer.ReadFrame();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());

    const auto outcomes = client.ExecuteBatch({{"A", {}}, {"B", {}}, {"C", {}}});

    EXPECT_EQ("a reply", ErrorOf(outcomes[0]));
    EXPECT_EQ(EErrorKind::Closed, outcomes[1].Error()->Kind());
    EXPECT_EQ("the host closed the connection", ErrorOf(outcomes[2]));
    EXPECT_FALSE(client.IsConnected());
    EXPECT_THROW(outcomes[1].Get(), VError);
}

TEST(ClientBatch, LeavesNoLateReplyToLaterRequests)
{
    VScriptedHost host([&](VPeer& peer) {
        const std::string late = CorrelationOf(peer.ReadFrame());
        const std::string next = CorrelationOf(peer.ReadFrame());
        peer.SendFrame(ReplyText(late, "late"));
        peer.SendFrame(ReplyText(next));
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Hasty));
    client.Connect("127.0.0.1", host.Port());
    client.ExecuteBatch({{"Slow", {}}});
    client.SetTimeLimit(Patient);

    EXPECT_EQ("OK", client.ExecuteCommand("Go").Result);

    client.Close();
    EXPECT_EQ("", host.Finish());
}

TEST(ClientEventsByName, ReachTheirHandlerBeforeThatForAll)
{
    VScriptedHost host([](VPeer& peer) {
        peer.SendFrame(EventText("A"));
        peer.SendFrame(EventText("B"));
        peer.SendFrame(EventText("A"));
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());
    std::vector<std::string> calls;
    client.SetEventHandler("A", [&](const VEvent&) {
        calls.emplace_back("a");
        client.SetEventHandler("A", nullptr);
    });
    client.SetEventHandler([&](const VEvent& event) { calls.push_back("all " + event.Name); });

    while (calls.size() < 4) {
        ASSERT_NE(0U, client.DeliverEvents(Patient));
    }

    EXPECT_THAT(calls, testing::ElementsAre("a", "all A", "all B", "all A"));
}

} // namespace
