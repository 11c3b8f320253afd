#include "device/ClientSupport.h"

#include <future>
#include <stdexcept>
#include <thread>

#include <gmock/gmock.h>

namespace {

using ControlStream::EErrorKind;
using ControlStream::NoLimit;
using ControlStream::VClient;
using ControlStream::VClientOptions;
using ControlStream::VEvent;
using testing::ElementsAre;
using namespace std::chrono_literals;

/// Takes all kept events and returns their names.
std::vector<std::string> KeptNames(VClient& client)
{
    std::vector<std::string> names;
    while (const std::optional<VEvent> event = client.WaitForEvent(0ms)) {
        names.push_back(event->Name);
    }
    return names;
}

TEST(ClientEvents, ReachADeviceThatHasSentNothing)
{
    VScriptedHost host([](VPeer& peer) {
        // The header stands apart from the text, whose first letter it would take.
        peer.Send(std::string("\x64\x00\x00\x00", 4) +
                  R"(<?xml version="1.0" encoding="UTF-16" standalone="no"?>)"
                  "<Event><Name>Tick</Name><Parameters/></Event>");
        peer.ReadToEnd();
    });
    VClient client;
    client.Connect("127.0.0.1", host.Port());

    const std::optional<VEvent> event = client.WaitForEvent(Patient);

    ASSERT_TRUE(event);
    EXPECT_EQ("Tick", event->Name);
    EXPECT_TRUE(event->Parameters.empty());
}

TEST(ClientEvents, ThatComeWhileARequestIsOpenAreKeptInOrder)
{
    VScriptedHost host([](VPeer& peer) {
        peer.SendFrame(EventText("BeforeTheRequest"));
        peer.ReadFrame();
        // All in one segment.
        peer.Send(TestSupport::Frame(EventText("First")) + TestSupport::Frame(EventText("Second")) +
                  TestSupport::Frame(ReplyText("1")) + TestSupport::Frame(EventText("Behind")));
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());

    EXPECT_TRUE(client.ExecuteCommand("Go").Ok);

    EXPECT_THAT(KeptNames(client), ElementsAre("BeforeTheRequest", "First", "Second", "Behind"));
}

TEST(ClientEvents, ThatComeBeforeARawReplyAreKept)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(EventText("First"));
        peer.SendFrame("<Foo/>");
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());

    EXPECT_EQ("<Foo/>", client.ExchangeRaw("<Bar/>"));
    EXPECT_THAT(KeptNames(client), ElementsAre("First"));
}

TEST(ClientEvents, AreWaitedForWithinTheLimit)
{
    VScriptedHost host([](VPeer& peer) { peer.ReadToEnd(); });
    VClient client;
    client.Connect("127.0.0.1", host.Port());
    const auto start = std::chrono::steady_clock::now();

    EXPECT_FALSE(client.WaitForEvent(Hasty));

    EXPECT_GE(std::chrono::steady_clock::now() - start, Hasty);
    EXPECT_TRUE(client.IsConnected());
}

TEST(ClientEvents, RepliesThatNobodyAwaitsDoNotHoldUpTheWait)
{
    VScriptedHost host([](VPeer& peer) {
        while (peer.SendFrame(ReplyText("99"))) {
        }
    });
    VClient client;
    client.Connect("127.0.0.1", host.Port());

    EXPECT_FALSE(client.WaitForEvent(Hasty));
    client.Close();
}

TEST(ClientEvents, OldestAreDroppedAndCountedWhereNobodyTakesThem)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        for (const char* const name : {"A", "B", "C", "D"}) {
            peer.SendFrame(EventText(name));
        }
        peer.SendFrame(ReplyText("1"));
        peer.ReadToEnd();
    });
    VClientOptions options = WithLimit(Patient);
    options.KeptEventBytes = 2 * EventText("A").size();
    VClient client(options);
    client.Connect("127.0.0.1", host.Port());

    client.ExecuteCommand("Go");

    EXPECT_EQ(2U, client.GetDroppedEventCount());
    EXPECT_THAT(KeptNames(client), ElementsAre("C", "D"));
}

TEST(ClientEvents, AreNotKeptForADeviceThatDoesNotCareButCanBeWaitedFor)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(EventText("A"));
        peer.SendFrame(ReplyText("1"));
        peer.SendFrame(EventText("B"));
        peer.ReadToEnd();
    });
    VClientOptions options = WithLimit(Patient);
    options.KeptEventBytes = 0;
    VClient client(options);
    client.Connect("127.0.0.1", host.Port());

    client.ExecuteCommand("Go");
    const std::optional<VEvent> event = client.WaitForEvent(Patient);

    EXPECT_EQ(1U, client.GetDroppedEventCount());
    ASSERT_TRUE(event);
    EXPECT_EQ("B", event->Name);
}

TEST(ClientEvents, LastWordsOfAHostThatClosesCanBeTaken)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(EventText("Event.Disconnect"));
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());

    EXPECT_EQ((VThrown{EErrorKind::Closed, "the host closed the connection"}),
              ThrownBy([&] { client.ExecuteCommand("Go"); }));

    EXPECT_EQ("Event.Disconnect", client.WaitForEvent(0ms).value_or(VEvent()).Name);
    EXPECT_EQ((VThrown{EErrorKind::NoConnection, "there is no connection to a host"}),
              ThrownBy([&] { client.WaitForEvent(0ms); }));
}

TEST(ClientEvents, LastWordsCanBeTakenAfterAWriteHasFoundTheHostGone)
{
    std::promise<void> gone;
    VScriptedHost host([&](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(EventText("Event.Disconnect"));
        peer.Close();
        gone.set_value();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());
    client.SendRaw("<Foo/>");
    gone.get_future().wait();

    // The first one reaches a socket that is closed, and is answered by a reset.
    const VThrown thrown = ThrownBy([&] {
        for (;;) {
            client.SendRaw("<Foo/>");
        }
    });

    EXPECT_EQ(EErrorKind::Closed, thrown.Kind) << thrown;
    EXPECT_FALSE(client.IsConnected());
    EXPECT_EQ("Event.Disconnect", client.WaitForEvent(0ms).value_or(VEvent()).Name);
}

TEST(ClientEvents, AreDeliveredToTheHandlerInOrder)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(EventText("First"));
        peer.SendFrame(EventText("Second"));
        peer.SendFrame(ReplyText("1"));
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());
    std::vector<std::string> names;
    client.SetEventHandler([&](const VEvent& event) { names.push_back(event.Name); });

    client.ExecuteCommand("Go");
    EXPECT_THAT(names, ElementsAre()) << "the handler was called inside the request";

    EXPECT_EQ(2U, client.DeliverEvents(Patient));
    EXPECT_THAT(names, ElementsAre("First", "Second"));
    EXPECT_EQ(0U, client.DeliverEvents(0ms));
}

TEST(ClientEvents, HandlerMayMakeRequestsAndWhatComesMeanwhileWaitsForTheNextDelivery)
{
    VScriptedHost host([](VPeer& peer) {
        peer.SendFrame(EventText("First"));
        peer.ReadFrame();
        peer.SendFrame(EventText("Second"));
        peer.SendFrame(ReplyText("1"));
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());
    std::vector<std::string> names;
    client.SetEventHandler([&](const VEvent& event) {
        names.push_back(event.Name);
        if (event.Name == "First") {
            EXPECT_TRUE(client.ExecuteCommand("Go").Ok);
        }
    });

    EXPECT_EQ(1U, client.DeliverEvents(Patient));
    EXPECT_THAT(names, ElementsAre("First"));
    EXPECT_EQ(1U, client.DeliverEvents(0ms));
    EXPECT_THAT(names, ElementsAre("First", "Second"));
}

TEST(ClientEvents, HandlerThatThrowsLosesOnlyItsOwnEvent)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        for (const char* const name : {"A", "B", "C"}) {
            peer.SendFrame(EventText(name));
        }
        peer.SendFrame(ReplyText("1"));
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());
    client.ExecuteCommand("Go");
    client.SetEventHandler([](const VEvent&) { throw std::runtime_error("no"); });

    EXPECT_THROW(client.DeliverEvents(0ms), std::runtime_error);

    EXPECT_THAT(KeptNames(client), ElementsAre("B", "C"));
}

TEST(ClientEvents, HandlerMayReplaceItself)
{
    VScriptedHost host([](VPeer& peer) {
        peer.SendFrame(EventText("A"));
        peer.ReadToEnd();
    });
    VClient client;
    client.Connect("127.0.0.1", host.Port());
    const std::string captured = "still there";
    std::string seen;
    client.SetEventHandler([&client, &seen, captured](const VEvent&) {
        client.SetEventHandler(nullptr);
        seen = captured;
    });

    EXPECT_EQ(1U, client.DeliverEvents(Patient));

    EXPECT_EQ("still there", seen);
}

TEST(ClientEvents, WaitIsEndedByInterruptFromAnotherThread)
{
    VScriptedHost host([](VPeer& peer) { peer.ReadToEnd(); });
    VClient client;
    client.Connect("127.0.0.1", host.Port());

    std::thread other([&client] { client.Interrupt(); });
    const std::optional<VEvent> event = client.WaitForEvent(NoLimit);
    other.join();

    EXPECT_FALSE(event);
    EXPECT_TRUE(client.IsConnected());
}

TEST(ClientEvents, InterruptCountsOnceAndOnlyForAWait)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(EventText("Kept"));
        peer.SendFrame(ReplyText("1"));
        peer.ReadFrame();
        peer.SendFrame(EventText("Later"));
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());
    client.Interrupt();
    client.Interrupt();

    EXPECT_TRUE(client.ExecuteCommand("Go").Ok);
    EXPECT_EQ("Kept", client.WaitForEvent(NoLimit).value_or(VEvent()).Name);
    EXPECT_FALSE(client.WaitForEvent(NoLimit));
    client.SendRaw("<Foo/>");
    EXPECT_EQ("Later", client.WaitForEvent(Patient).value_or(VEvent()).Name);
}

} // namespace
