#include "ControlStreamClient/AsyncClient.h"
#include "device/ClientSupport.h"

#include <atomic>
#include <mutex>

#include <gmock/gmock.h>

namespace {

using namespace ControlStream;
using namespace std::chrono_literals;
using testing::AllOf;
using testing::HasSubstr;

std::string Between(const std::string& text, const std::string& open)
{
    const std::size_t begin = text.find(open) + open.size();
    return text.substr(begin, text.find('<', begin) - begin);
}

/// Answers a request as a host does that knows every command.
void Answer(VPeer& peer, const std::string& request, const std::string& status = "Authorized")
{
    if (request == "<ServerInformation/>") {
        peer.SendFrame(ServerInformationText());
    } else {
        peer.SendFrame("<CommandReply><Name>" + Between(request, "<Name>") +
                       "</Name><Correlation>" + Between(request, "<Correlation>") +
                       "</Correlation><Result>OK</Result><Parameters><Parameter><Name>Status</Name>"
                       "<Value>" +
                       status + "</Value></Parameter></Parameters></CommandReply>");
    }
}

/// Answers until the device has gone.
void AnswerAll(VPeer& peer)
{
    while (const auto request = peer.ReadFrameOrEnd()) {
        Answer(peer, *request);
    }
}

VAsyncOptions OptionsFor(const VScriptedHost& host, std::chrono::milliseconds limit = Patient)
{
    VAsyncOptions options;
    options.Port = host.Port();
    options.TimeLimit = limit;
    options.ConnectLimit = Patient;
    options.BackOff = VBackOffOptions{1ms, 10ms, 0.0};
    return options;
}

template <typename TResult>
VThrown ErrorOf(std::future<TResult> future)
{
    return ThrownBy([&] { future.get(); });
}

TEST(AsyncClient, CarriesManyRequestsAtOnceAndMatchesTheirReplies)
{
    VScriptedHost host([](VPeer& peer) {
        Answer(peer, peer.ReadFrame());
        const std::string first = peer.ReadFrame();
        const std::string second = peer.ReadFrame();
        peer.SendFrame(ReplyText(Between(second, "<Correlation>"), "second"));
        peer.SendFrame(ReplyText(Between(first, "<Correlation>"), "first"));
        AnswerAll(peer);
    });
    VAsyncClient client(OptionsFor(host));

    auto first = client.ExecuteCommand("A");
    auto second = client.ExecuteCommand("B");

    EXPECT_EQ("first", first.get().Result);
    EXPECT_EQ("second", second.get().Result);
    EXPECT_EQ(1, client.GetServerInformation().get().Major);
    client.Stop();
    EXPECT_EQ("", host.Finish());
}

TEST(AsyncClient, AsksForAllThatAHostDescribes)
{
    VScriptedHost host([](VPeer& peer) {
        Answer(peer, peer.ReadFrame());
        const std::string correlation = Between(peer.ReadFrame(), "<Correlation>");
        peer.SendFrame("<Correlation>" + correlation +
                       "</Correlation><Commands><Command>C</Command></Commands>");
        EXPECT_EQ("<Events/>", peer.ReadFrame());
        peer.SendFrame("<Events><Event>E</Event></Events>");
        peer.SendFrame("<CommandInformation><Correlation>" +
                       Between(peer.ReadFrame(), "<Correlation>") +
                       "</Correlation><Name>C</Name></CommandInformation>");
        EXPECT_EQ("<EventInformation>E</EventInformation>", peer.ReadFrame());
        peer.SendFrame("<EventInformation><Name>E</Name></EventInformation>");
        AnswerAll(peer);
    });
    VAsyncClient client(OptionsFor(host));

    auto commands = client.GetCommands();
    auto events = client.GetEvents();
    auto command = client.GetCommandInformation("C");
    auto event = client.GetEventInformation("E");

    EXPECT_EQ(std::vector<std::string>{"C"}, commands.get());
    EXPECT_EQ(std::vector<std::string>{"E"}, events.get());
    EXPECT_EQ("C", command.get().Name);
    EXPECT_EQ("E", event.get().Name);
    client.Stop();
    EXPECT_EQ("", host.Finish());
}

TEST(AsyncClient, RefusesAtOnceWhatTheHostWouldDrop)
{
    VScriptedHost host(&AnswerAll);
    VAsyncClient client(OptionsFor(host));

    EXPECT_EQ(EErrorKind::Usage, ThrownBy([&] { client.ExecuteCommand("", {}); }).Kind);
    EXPECT_EQ(EErrorKind::Usage, ThrownBy([&] { client.GetEventInformation("<"); }).Kind);
    VAsyncOptions options = OptionsFor(host);
    options.Device = VDeviceIdentity{"id", "\x01"};
    EXPECT_EQ(EErrorKind::Usage, ThrownBy([&] { VAsyncClient refused(options); }).Kind);
    options = VAsyncOptions();
    options.Host.clear();
    EXPECT_EQ(EErrorKind::Usage, ThrownBy([&] { VAsyncClient refused(options); }).Kind);
}

TEST(AsyncClient, CallsTheHandlersOfAnEvent)
{
    std::promise<void> listening;
    VScriptedHost host([&](VPeer& peer) {
        Answer(peer, peer.ReadFrame());
        listening.get_future().wait();
        peer.SendFrame(EventText("B", "no"));
        peer.SendFrame(EventText("A", "yes"));
        AnswerAll(peer);
    });
    VAsyncClient client(OptionsFor(host));
    std::promise<std::string> heard;
    client.AddEventHandler(
        "A", [&](const VEvent& event) { heard.set_value(GetValue(event.Parameters, "p")); });
    listening.set_value();

    EXPECT_EQ("yes", heard.get_future().get());
}

TEST(AsyncClient, ConnectsAgainAndFailsOnlyWhatWasOnItsWay)
{
    std::atomic<int> connections{0};
    VScriptedHost host([&](VPeer& peer) {
        Answer(peer, peer.ReadFrame());
        if (++connections == 1) {
            peer.ReadFrame(); // and goes
        } else {
            AnswerAll(peer);
        }
    });
    std::mutex mutex;
    std::vector<std::string> reasons;
    VAsyncOptions options = OptionsFor(host);
    options.OnStatus = [&](const VAsyncStatus& status) {
        const std::lock_guard<std::mutex> lock(mutex);
        if (status.State == EConnectionState::Waiting) {
            reasons.push_back(status.Reason);
        }
    };
    VAsyncClient client(options);

    EXPECT_EQ((VThrown{EErrorKind::Closed, "the host closed the connection"}),
              ErrorOf(client.ExecuteCommand("Lost")));
    EXPECT_EQ("OK", client.ExecuteCommand("Again").get().Result);
    EXPECT_EQ(EConnectionState::Connected, client.GetStatus().State);
    client.Stop();
    EXPECT_EQ("", host.Finish());
    EXPECT_EQ(2, connections);
    EXPECT_THAT(reasons, testing::ElementsAre("the host closed the connection"));
}

TEST(AsyncClient, SaysWhatItWaitedForWithoutAHost)
{
    VAsyncOptions options;
    options.Port = 1; // nobody listens there
    options.TimeLimit = Hasty;
    options.BackOff = VBackOffOptions{1ms, 2ms, 0.0};
    VAsyncClient client(options);

    EXPECT_EQ((VThrown{EErrorKind::TimedOut,
                       "timed out after 0.03 s, waiting for a connection to the host; nothing was "
                       "sent for the reply to the command \"Go\""}),
              ErrorOf(client.ExecuteCommand("Go")));
    EXPECT_FALSE(client.WaitUntilConnected(Hasty));
    ASSERT_TRUE(
        client.WaitFor([](const VAsyncStatus& status) { return !status.Reason.empty(); }, Patient));
    EXPECT_THAT(client.GetStatus().Reason, HasSubstr("no connection to 127.0.0.1:1"));
}

TEST(AsyncClient, LeavesAHostThatStopsAnswering)
{
    std::atomic<int> connections{0};
    VScriptedHost host([&](VPeer& peer) {
        if (++connections > 1) {
            return AnswerAll(peer);
        }
        Answer(peer, peer.ReadFrame());
        peer.ReadToEnd(); // answers neither the command nor the question behind it
    });
    VAsyncOptions options = OptionsFor(host, Hasty);
    VAsyncClient client(options);

    ASSERT_TRUE(client.WaitUntilConnected(Patient)); // or the request would wait for that alone
    EXPECT_EQ((VThrown{EErrorKind::TimedOut,
                       "timed out after 0.03 s, waiting for the reply to the command \"Go\""}),
              ErrorOf(client.ExecuteCommand("Go")));

    ASSERT_TRUE(client.WaitFor(
        [&](const VAsyncStatus& status) {
            return connections == 2 && status.State == EConnectionState::Connected;
        },
        Patient));
}

TEST(AsyncClient, LeavesAHostThatSendsWhatIsNoControlStream)
{
    std::atomic<int> connections{0};
    VScriptedHost host([&](VPeer& peer) {
        Answer(peer, peer.ReadFrame());
        if (++connections == 1) {
            peer.ReadFrame();
            peer.SendFrame("<broken");
            peer.ReadToEnd();
        } else {
            AnswerAll(peer);
        }
    });
    VAsyncClient client(OptionsFor(host));

    EXPECT_EQ((VThrown{EErrorKind::Protocol, "the host sent a frame that cannot be read as XML"}),
              ErrorOf(client.ExecuteCommand("Go")));
    EXPECT_EQ("OK", client.ExecuteCommand("Go").get().Result);
}

TEST(AsyncClient, AuthorizesOnEachConnectionAndBeats)
{
    std::atomic<int> connections{0};
    std::promise<void> beaten;
    VScriptedHost host([&](VPeer& peer) {
        const bool first = ++connections == 1;
        Answer(peer, peer.ReadFrame());
        const std::string asked = peer.ReadFrame();
        EXPECT_THAT(asked,
                    AllOf(HasSubstr("<Name>System.Authorize</Name>"),
                          HasSubstr("<Value>d-1</Value>"), HasSubstr("<Value>Remote</Value>")));
        peer.SendFrame("<CommandReply><Name>System.Authorize</Name><Correlation>" +
                       Between(asked, "<Correlation>") +
                       "</Correlation><Result>OK</Result><Parameters><Parameter><Name>Status</Name>"
                       "<Value>Pending</Value></Parameter></Parameters></CommandReply>");
        peer.SendFrame("<Event><Name>Event.Authorize</Name><Parameters><Parameter><Name>Status"
                       "</Name><Value>Authorized</Value></Parameter></Parameters></Event>");
        for (const char* const beat : {"1", "2"}) {
            const std::string request = peer.ReadFrame();
            EXPECT_THAT(request, HasSubstr("<Name>System.Heartbeat</Name>"));
            if (first) {
                EXPECT_EQ(beat, Between(request, "<Value>"));
            }
            Answer(peer, request);
        }
        if (!first) {
            beaten.set_value();
            AnswerAll(peer);
        }
    });
    VAsyncOptions options = OptionsFor(host);
    options.Device = VDeviceIdentity{"d-1", "Remote"};
    options.BeatInterval = 1ms;
    VAsyncClient client(options);

    beaten.get_future().wait();

    EXPECT_EQ(EPermission::Authorized, client.GetStatus().Permission);
    client.Stop();
    EXPECT_EQ("", host.Finish());
}

TEST(AsyncClient, TakesBackItsRequestWhenItStops)
{
    std::string last;
    VScriptedHost host([&](VPeer& peer) {
        Answer(peer, peer.ReadFrame());
        Answer(peer, peer.ReadFrame(), "Pending");
        while (const auto request = peer.ReadFrameOrEnd()) {
            last = *request;
        }
    });
    VAsyncOptions options = OptionsFor(host);
    options.Device = VDeviceIdentity{"d-1", "Remote"};
    VAsyncClient client(options);
    ASSERT_TRUE(client.WaitFor(
        [](const VAsyncStatus& status) { return status.Permission == EPermission::Pending; },
        Patient));

    client.Stop();

    EXPECT_EQ("", host.Finish());
    EXPECT_THAT(last, HasSubstr("<Name>System.Authorize.Cancel</Name>"));
}

TEST(AsyncClient, FailsWhatIsOpenWhenItStopsAndAllThatComesLater)
{
    std::promise<void> received;
    VScriptedHost host([&](VPeer& peer) {
        Answer(peer, peer.ReadFrame());
        peer.ReadFrame();
        received.set_value();
        peer.ReadToEnd();
    });
    VAsyncClient client(OptionsFor(host));
    auto open = client.ExecuteCommand("Go");
    received.get_future().wait();

    client.Stop();

    const VThrown stopped{EErrorKind::NoConnection, "the client was stopped"};
    EXPECT_EQ(stopped, ErrorOf(std::move(open)));
    EXPECT_EQ(stopped, ErrorOf(client.ExecuteCommand("Go")));
    EXPECT_EQ(EConnectionState::Stopped, client.GetStatus().State);
    EXPECT_FALSE(client.WaitUntilConnected(NoLimit));
    client.Stop();
}

TEST(AsyncClient, StopsAtOnceWhileItConnects)
{
    VScriptedHost host([](VPeer& peer) { peer.ReadToEnd(); }); // never says a word
    VAsyncOptions options = OptionsFor(host);
    {
        VAsyncClient client(options);
    }
    options.ConnectLimit = NoLimit;
    options.Host = "192.0.2.1"; // reserved: no way leads there, or no answer comes
    VAsyncClient unreachable(options);

    unreachable.Stop();

    EXPECT_EQ(EConnectionState::Stopped, unreachable.GetStatus().State);
}

TEST(AsyncClient, GoesOnAfterAFunctionThatThrows)
{
    VScriptedHost host(&AnswerAll);
    std::promise<std::string> failed;
    VAsyncOptions options = OptionsFor(host);
    options.OnFunctionFailed = [&](const std::string& text) { failed.set_value(text); };
    VAsyncClient client(options);

    client.ExecuteCommand("Go", {}, [](const VOutcome<VCommandReply>&) {
        throw std::runtime_error("the user's mistake");
    });

    EXPECT_EQ("the user's mistake", failed.get_future().get());
    EXPECT_EQ("OK", client.ExecuteCommand("Go").get().Result);
}

TEST(AsyncClient, MayBeDestroyedByAFunctionOfItsOwn)
{
    std::promise<void> gone;
    VScriptedHost host([&](VPeer& peer) {
        AnswerAll(peer);
        gone.set_value();
    });
    auto client = std::make_unique<VAsyncClient>(OptionsFor(host));
    VAsyncClient& used = *client;

    used.ExecuteCommand("Go", {},
                        [owned = std::make_shared<std::unique_ptr<VAsyncClient>>(std::move(
                             client))](const VOutcome<VCommandReply>&) { owned->reset(); });

    gone.get_future().wait();
}

TEST(AsyncClient, MayBeUsedByAFunctionOfItsOwn)
{
    VScriptedHost host(&AnswerAll);
    VAsyncClient client(OptionsFor(host));
    std::promise<std::string> done;

    client.ExecuteCommand("First", {}, [&](const VOutcome<VCommandReply>&) {
        client.ExecuteCommand("Second", {}, [&](const VOutcome<VCommandReply>& outcome) {
            done.set_value(outcome.Get().Result);
        });
    });

    EXPECT_EQ("OK", done.get_future().get());
}

} // namespace
