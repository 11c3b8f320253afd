#include "device/ClientSupport.h"
#include "device/FullListener.h"

#include <atomic>
#include <functional>
#include <future>
#include <random>

#include <gmock/gmock.h>

namespace {

using ControlStream::EErrorKind;
using ControlStream::VClient;
using ControlStream::VClientOptions;
using ControlStream::VEvent;
using testing::ElementsAre;
using testing::HasSubstr;
using namespace std::chrono_literals;
using namespace std::string_literals;

void ReadForEver(VPeer& peer)
{
    peer.ReadToEnd();
}

struct VTimeOutCase
{
    const char* Name;
    std::function<void(VClient&)> Ask;
    const char* Reason;
};

class ClientTimeOut : public testing::TestWithParam<VTimeOutCase>
{
};

TEST_P(ClientTimeOut, SaysWhatWasWaitedForAndKeepsTheConnection)
{
    VScriptedHost host(&ReadForEver);
    VClient client(WithLimit(Hasty));
    client.Connect("127.0.0.1", host.Port());
    const auto start = std::chrono::steady_clock::now();

    EXPECT_EQ((VThrown{EErrorKind::TimedOut, GetParam().Reason}),
              ThrownBy([&] { GetParam().Ask(client); }));

    EXPECT_GE(std::chrono::steady_clock::now() - start, Hasty);
    EXPECT_TRUE(client.IsConnected());
}

// clang-format off
const VTimeOutCase timeOutCases[] = {
    {"ServerInformation", [](VClient& client) { client.GetServerInformation(); },
     "timed out after 0.03 s, waiting for the server information"},
    {"Commands", [](VClient& client) { client.GetCommands(); },
     "timed out after 0.03 s, waiting for the list of commands"},
    {"CommandInformation", [](VClient& client) { client.GetCommandInformation("Go"); },
     "timed out after 0.03 s, waiting for the description of the command \"Go\""},
    {"Events", [](VClient& client) { client.GetEvents(); },
     "timed out after 0.03 s, waiting for the list of events"},
    {"EventInformation", [](VClient& client) { client.GetEventInformation("Tick"); },
     "timed out after 0.03 s, waiting for the description of the event \"Tick\""},
    {"ExecuteCommand", [](VClient& client) { client.ExecuteCommand("Go"); },
     "timed out after 0.03 s, waiting for the reply to the command \"Go\""},
    {"Raw", [](VClient& client) { client.ExchangeRaw("<Foo/>"); },
     "timed out after 0.03 s, waiting for a reply to the raw frame; a host answers nothing to what it does not understand"},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, ClientTimeOut, testing::ValuesIn(timeOutCases),
                         [](const auto& test) { return test.param.Name; });

TEST(ClientFailure, TimeOutTellsOfOtherMessagesThatCame)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(ReplyText("99"));
        peer.SendFrame("<Foo/>");
        peer.SendFrame(EventText("Tick"));
        peer.ReadToEnd();
    });
    VClient client(WithLimit(300ms));
    client.Connect("127.0.0.1", host.Port());

    EXPECT_EQ((VThrown{EErrorKind::TimedOut,
                       "timed out after 0.3 s, waiting for the reply to the command \"Go\"; 2 "
                       "other messages came meanwhile"}),
              ThrownBy([&] { client.ExecuteCommand("Go"); }));
}

TEST(ClientFailure, ReplyWithAnotherCorrelationOrOfAnotherKindIsPassedOver)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(ReplyText("2", "Error: another's"));
        peer.SendFrame(ReplyText("", "Error: nobody's"));
        peer.SendFrame("<CommandInformation><Correlation>1</Correlation></CommandInformation>");
        peer.SendFrame(ReplyText("1"));
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());

    EXPECT_EQ("OK", client.ExecuteCommand("Go").Result);
}

TEST(ClientFailure, LateReplyIsNotTakenForThatToTheNextRequest)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        peer.ReadFrame();
        peer.SendFrame(ReplyText("1", "Error: late"));
        peer.SendFrame(ReplyText("2"));
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Hasty));
    client.Connect("127.0.0.1", host.Port());
    EXPECT_EQ(EErrorKind::TimedOut, ThrownBy([&] { client.ExecuteCommand("Go"); }).Kind);

    client.SetTimeLimit(Patient);

    EXPECT_EQ("OK", client.ExecuteCommand("Go").Result);
}

std::string EventInformationText(const std::string& description)
{
    return "<EventInformation><Name/><Description>" + description +
           "</Description><Parameters/></EventInformation>";
}

TEST(ClientFailure, LateReplyWithoutCorrelationIsPassedOverByTheHelpOfOneThatHasIt)
{
    std::vector<std::string> requests;
    VScriptedHost host([&](VPeer& peer) {
        requests.push_back(peer.ReadFrame());
        requests.push_back(peer.ReadFrame());
        peer.SendFrame(EventInformationText("late"));
        peer.SendFrame("<Correlation>1</Correlation><Commands/>");
        requests.push_back(peer.ReadFrame());
        peer.SendFrame(EventInformationText("right"));
        requests.push_back(peer.ReadFrame());
        peer.SendFrame(EventInformationText("next"));
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Hasty));
    client.Connect("127.0.0.1", host.Port());
    EXPECT_EQ(EErrorKind::TimedOut, ThrownBy([&] { client.GetEventInformation("a"); }).Kind);

    client.SetTimeLimit(Patient);

    EXPECT_EQ("right", client.GetEventInformation("b").Description);
    EXPECT_EQ("next", client.GetEventInformation("c").Description);
    client.Close();
    EXPECT_EQ("", host.Finish());
    EXPECT_THAT(requests, ElementsAre("<EventInformation>a</EventInformation>",
                                      "<Commands><Correlation>1</Correlation></Commands>",
                                      "<EventInformation>b</EventInformation>",
                                      "<EventInformation>c</EventInformation>"));
}

TEST(ClientFailure, FloodOfEventsDoesNotHoldUpATimeOut)
{
    VScriptedHost host([](VPeer& peer) {
        while (peer.SendFrame(EventText("Flood"))) {
        }
    });
    VClient client(WithLimit(Hasty));
    client.Connect("127.0.0.1", host.Port());

    EXPECT_EQ(EErrorKind::TimedOut, ThrownBy([&] { client.ExecuteCommand("Go"); }).Kind);
    EXPECT_EQ(EErrorKind::TimedOut, ThrownBy([&] { client.ExchangeRaw("<Foo/>"); }).Kind);
    client.Close();
}

TEST(ClientFailure, FrameThatKeepsGrowingDoesNotHoldUpATimeOut)
{
    VScriptedHost host([](VPeer& peer) {
        peer.Send("\x00\x00\x00\x10"s); // more than can arrive in time
        const std::string piece(1U << 20U, 'x');
        while (peer.Send(piece)) {
        }
    });
    VClientOptions options = WithLimit(Hasty);
    options.FrameLimit = 1U << 28U;
    VClient client(options);
    client.Connect("127.0.0.1", host.Port());

    EXPECT_EQ(EErrorKind::TimedOut, ThrownBy([&] { client.ExecuteCommand("Go"); }).Kind);
    client.Close();
}

TEST(ClientFailure, HostThatReadsNothingMakesABigFrameTimeOutAndEndsTheConnection)
{
    std::promise<void> done;
    VScriptedHost host([&](VPeer&) { done.get_future().wait(); });
    VClient client(WithLimit(200ms));
    client.Connect("127.0.0.1", host.Port());

    const VThrown thrown = ThrownBy([&] { client.SendRaw(std::string(64U << 20U, 'x')); });
    done.set_value();

    EXPECT_EQ((VThrown{EErrorKind::TimedOut, "timed out after 0.2 s, sending the raw frame"}),
              thrown);
    EXPECT_FALSE(client.IsConnected()) << "half a frame can never be followed by another";
}

TEST(ClientFailure, BadRequestsAreRefusedBeforeAnythingIsSent)
{
    std::string received;
    VScriptedHost host([&](VPeer& peer) { received = peer.ReadToEnd(); });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());

    EXPECT_EQ(EErrorKind::Usage, ThrownBy([&] { client.ExecuteCommand(""); }).Kind);
    EXPECT_EQ(EErrorKind::Usage, ThrownBy([&] { client.ExecuteCommand("a", {{"", "b"}}); }).Kind);
    EXPECT_EQ(EErrorKind::Usage, ThrownBy([&] { client.GetCommandInformation("<"); }).Kind);
    EXPECT_EQ(EErrorKind::Usage, ThrownBy([&] { client.GetEventInformation(" "); }).Kind);

    EXPECT_TRUE(client.IsConnected());
    client.Close();
    EXPECT_EQ("", host.Finish());
    EXPECT_EQ("", received);
}

TEST(ClientFailure, NothingWorksWithoutAConnection)
{
    const VThrown noConnection{EErrorKind::NoConnection, "there is no connection to a host"};
    VClient client(WithLimit(Patient));

    EXPECT_FALSE(client.IsConnected());
    EXPECT_EQ(noConnection, ThrownBy([&] { client.GetServerInformation(); }));
    EXPECT_EQ(noConnection, ThrownBy([&] { client.ExecuteCommand("Go"); }));
    EXPECT_EQ(noConnection, ThrownBy([&] { client.SendRaw("x"); }));
    EXPECT_EQ(noConnection, ThrownBy([&] { client.ExchangeRaw("x"); }));
    EXPECT_EQ(noConnection, ThrownBy([&] { client.WaitForEvent(Patient); }));
    EXPECT_EQ(noConnection, ThrownBy([&] { client.DeliverEvents(Patient); }));
}

TEST(ClientFailure, ConnectionNeedsAHostAndAPort)
{
    const VThrown refused{EErrorKind::Usage, "a connection needs the name of a host and a port"};
    VClient client;

    EXPECT_EQ(refused, ThrownBy([&] { client.Connect(""); }));
    EXPECT_EQ(refused, ThrownBy([&] { client.Connect("a\0b"s); }));
    EXPECT_EQ(refused, ThrownBy([&] { client.Connect("127.0.0.1", 0); }));
}

TEST(ClientFailure, RefusedConnectionTellsWhere)
{
    std::uint16_t port = 0;
    {
        VScriptedHost host(&ReadForEver);
        port = host.Port();
    }
    VClient client;

    EXPECT_EQ(
        (VThrown{EErrorKind::NoConnection,
                 "no connection to 127.0.0.1:" + std::to_string(port) + ": Connection refused"}),
        ThrownBy([&] { client.Connect("127.0.0.1", port, Patient); }));
    EXPECT_FALSE(client.IsConnected());
}

TEST(ClientFailure, ConnectionThatIsNotAnsweredTimesOut)
{
    const VFullListener listener(INADDR_LOOPBACK);
    VClient client;

    EXPECT_EQ((VThrown{EErrorKind::TimedOut,
                       "timed out after 0.03 s, waiting for a connection to 127.0.0.1:" +
                           std::to_string(listener.Port())}),
              ThrownBy([&] { client.Connect("127.0.0.1", listener.Port(), Hasty); }));
    EXPECT_FALSE(client.IsConnected());
}

TEST(ClientFailure, ReplyCutAnywhereIsAClosedConnection)
{
    const std::string reply = TestSupport::Frame("<CommandReply><Correlation>1</Correlation>"
                                                 "<Result>OK</Result></CommandReply>");
    std::atomic<std::size_t> cut{0};
    VScriptedHost host([&](VPeer& peer) {
        peer.ReadFrame();
        peer.Send(reply.substr(0, cut));
    });

    for (cut = 0; cut < reply.size(); ++cut) {
        VClient client(WithLimit(Patient));
        client.Connect("127.0.0.1", host.Port());
        const VThrown thrown = ThrownBy([&] { client.ExecuteCommand("Go"); });

        EXPECT_EQ(EErrorKind::Closed, thrown.Kind) << thrown << " after " << cut;
        EXPECT_FALSE(client.IsConnected());
        if (cut == 0) {
            EXPECT_EQ("the host closed the connection", thrown.Text);
        } else if (cut == 3) {
            EXPECT_EQ("the host closed the connection in the middle of a frame, after 3 of the 4 "
                      "bytes of its header",
                      thrown.Text);
        } else if (cut == 9) {
            EXPECT_EQ("the host closed the connection in the middle of a frame, after 5 of its " +
                          std::to_string(reply.size() - 4) + " bytes",
                      thrown.Text);
        }
    }
}

TEST(ClientFailure, ResetIsAClosedConnection)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        peer.Reset();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());

    EXPECT_EQ(
        (VThrown{EErrorKind::Closed, "the host closed the connection: Connection reset by peer"}),
        ThrownBy([&] { client.ExecuteCommand("Go"); }));
}

TEST(ClientFailure, FrameAboveTheLimitEndsTheConnection)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        peer.Send("\xFF\xFF\xFF\xFF"s);
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());

    EXPECT_EQ(
        (VThrown{EErrorKind::Protocol,
                 "the host announced a frame of 4294967295 bytes, but the limit is 67108864"}),
        ThrownBy([&] { client.ExecuteCommand("Go"); }));
    EXPECT_FALSE(client.IsConnected());
    EXPECT_EQ(EErrorKind::NoConnection, ThrownBy([&] { client.WaitForEvent(0ms); }).Kind);
}

TEST(ClientFailure, LimitOfAFrameCanBeChosen)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(ReplyText("1"));
        peer.ReadToEnd();
    });
    VClientOptions options = WithLimit(Patient);
    options.FrameLimit = 50;
    VClient client(options);
    client.Connect("127.0.0.1", host.Port());

    EXPECT_THAT(ThrownBy([&] { client.ExecuteCommand("Go"); }).Text,
                HasSubstr("but the limit is 50"));
}

TEST(ClientFailure, UnreadableFrameIsReportedAndTheNextOneIsRead)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame("no XML");
        peer.ReadFrame();
        peer.SendFrame(ReplyText("2"));
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());

    EXPECT_EQ((VThrown{EErrorKind::Protocol, "the host sent a frame that cannot be read as XML"}),
              ThrownBy([&] { client.ExecuteCommand("Go"); }));
    EXPECT_TRUE(client.IsConnected());
    EXPECT_TRUE(client.ExecuteCommand("Go").Ok);
}

/// Frames that look like messages, with bytes replaced, inserted and removed.
std::string Mutilated(std::mt19937& random)
{
    static const std::string originals[] = {EventText("Tick"), ReplyText("1"),
                                            ServerInformationText(), std::string(1, '\0')};
    std::string text = originals[random() % 4];
    for (unsigned changes = random() % 8; changes > 0 && !text.empty(); --changes) {
        const std::size_t position = random() % text.size();
        switch (random() % 3) {
        case 0:
            text[position] = static_cast<char>(random());
            break;
        case 1:
            text.insert(position, 1, "<>&/\"' \0"[random() % 8]);
            break;
        default:
            text.erase(position, 1 + random() % 16);
        }
    }
    return text;
}

TEST(ClientFailure, ThousandsOfMutilatedFramesAreSurvived)
{
    VScriptedHost host([](VPeer& peer) {
        std::mt19937 random(1); // NOLINT: the same frames in every run
        std::string stream;
        for (int i = 0; i < 20000; ++i) {
            stream += TestSupport::Frame(Mutilated(random));
        }
        peer.Send(stream + TestSupport::Frame(EventText("The.End")));
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());

    int unreadable = 0;
    std::string last;
    while (last != "The.End") {
        const VThrown thrown =
            ThrownBy([&] { last = client.WaitForEvent(Patient).value_or(VEvent()).Name; });
        unreadable += thrown.Kind == EErrorKind::Protocol ? 1 : 0;
        ASSERT_TRUE(client.IsConnected()) << thrown;
    }
    EXPECT_GT(unreadable, 1000);
}

} // namespace
