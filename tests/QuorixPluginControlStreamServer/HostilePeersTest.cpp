#include "Arrivals.h"
#include "TooMuch.h"
#include "WireText.h"

#include <gtest/gtest.h>

#include <atomic>
#include <random>
#include <string>
#include <thread>
#include <vector>

// What a device may do to a server, by design of the attacker or by fault: the server lives, and
// answers the next good frame.

namespace {

using namespace std::string_literals;
using TestSupport::VRawClient;

const char* const InformationReply =
    DECLARATION "<ServerInformation><StreamVersion major=\"1\" minor=\"0\"/></ServerInformation>";

std::string Repeat(const std::string& text, std::size_t count)
{
    std::string result;
    for (std::size_t i = 0; i < count; ++i) {
        result += text;
    }
    return result;
}

class HostilePeers : public testing::Test
{
protected:
    /// Sends a text that nobody takes, and a good one after it on the same connection.
    void ExpectSilenceAndLife(const std::string& text)
    {
        VRawClient client(running.Socket->Port());
        client.SendFrame(text);
        EXPECT_EQ(InformationReply, client.Request(Information));
    }

    VRunningServer running;
};

TEST_F(HostilePeers, NestedElementsAreRefusedWithoutOverflow)
{
    ExpectSilenceAndLife(Repeat("<a>", 300000));
    ExpectSilenceAndLife(Repeat("<a>", 300000) + Repeat("</a>", 300000));
    ExpectSilenceAndLife("<ServerInformation>" + Repeat("<a>", 1000) + Repeat("</a>", 1000) +
                         "</ServerInformation>");
    ExpectSilenceAndLife(Repeat("<a\">", 300000));
    ExpectSilenceAndLife("<!--" + Repeat("<a>", 10) + "-->" + Repeat("<a>", 300000));
}

TEST_F(HostilePeers, NestingUpToTheLimitIsRead)
{
    VRawClient client(running.Socket->Port());

    EXPECT_EQ(InformationReply, client.Request("<ServerInformation>" + Repeat("<a>", 999) +
                                               Repeat("</a>", 999) + "</ServerInformation>"));
}

TEST_F(HostilePeers, ManySiblingsAreRead)
{
    VRawClient client(running.Socket->Port());

    EXPECT_EQ(InformationReply, client.Request("<ServerInformation>" + Repeat("<a/>", 100000) +
                                               "</ServerInformation>"));
    ExpectSilenceAndLife(Repeat("<a/>", 100000));
}

TEST_F(HostilePeers, LongNamesAndValuesAreRead)
{
    running.Dispatcher->Commands[L"Echo"] = &TestSupport::VFakeControlSystem::Echo;
    VRawClient client(running.Socket->Port());
    const std::string longText(1000000, 'x');

    EXPECT_EQ(DECLARATION "<CommandReply><Name>Echo</Name><Correlation>" + longText +
                  "</Correlation><Result>OK</Result><Parameters><Parameter><Name>" + longText +
                  "</Name><Value>" + longText + "</Value></Parameter></Parameters></CommandReply>",
              client.Request("<ExecuteCommand><Name>Echo</Name><Correlation>" + longText +
                             "</Correlation><Parameters><Parameter><Name>" + longText +
                             "</Name><Value>" + longText +
                             "</Value></Parameter></Parameters></ExecuteCommand>"));
}

TEST_F(HostilePeers, ManyEntitiesAreDecodedInReasonableTime)
{
    running.Dispatcher->Commands[L"Echo"] = &TestSupport::VFakeControlSystem::Echo;
    VRawClient client(running.Socket->Port());
    const std::string value = Repeat("&lt;&gt;&amp;&quot;&apos;", 50000);

    EXPECT_EQ(DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation>"
                          "<Result>OK</Result><Parameters><Parameter><Name>n</Name><Value>" +
                  value + "</Value></Parameter></Parameters></CommandReply>",
              client.Request("<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation>"
                             "<Parameters><Parameter><Name>n</Name><Value>" +
                             value + "</Value></Parameter></Parameters></ExecuteCommand>"));
}

TEST_F(HostilePeers, ClaimsOfFourGigabytesDisturbNobody)
{
    std::vector<VRawClient> claiming;
    for (int i = 0; i < 50; ++i) {
        claiming.emplace_back(running.Socket->Port());
        claiming.back().Send("\xFF\xFF\xFF\xFF"s);
    }
    VRawClient client(running.Socket->Port());

    EXPECT_EQ(InformationReply, client.Request(Information));
}

TEST_F(HostilePeers, IdleAndHalfwayConnectionsTakeNothingFromOthers)
{
    std::vector<VRawClient> idle;
    for (int i = 0; i < 200; ++i) {
        idle.emplace_back(running.Socket->Port());
        idle.back().Send("\x10\x00\x00\x00<Serv"s.substr(0, i % 10));
    }
    VRawClient client(running.Socket->Port());

    EXPECT_EQ(InformationReply, client.Request(Information));
    for (std::size_t i = 0; i < idle.size(); i += 2) {
        idle[i].Reset();
    }
    EXPECT_EQ(InformationReply, client.Request(Information));
}

TEST_F(HostilePeers, ResetAtEveryByteOfAFrameDisturbsNobody)
{
    const std::string frame = "\x14\x00\x00\x00<ServerInformation/>"s;
    VRawClient client = running.Connect();

    for (std::size_t cut = 0; cut <= frame.size(); ++cut) {
        VRawClient hostile(running.Socket->Port());
        hostile.Send(frame.substr(0, cut));
        hostile.Reset();
        ASSERT_EQ(InformationReply, client.Request(Information)) << "cut at " << cut;
    }
}

TEST_F(HostilePeers, CommandOfADeviceThatIsGoneHasRunAllTheSame)
{
    VLatch entered;
    VLatch proceed;
    running.Dispatcher->Commands[L"Wait"] = [&](const auto& input, const auto& success,
                                                const auto&) {
        entered.Open();
        proceed.Wait();
        success(input);
        success(input); // the first write only hears that the device is gone
    };
    VRawClient device(running.Socket->Port());
    device.SendFrame(
        "<ExecuteCommand><Name>Wait</Name><Correlation>1</Correlation></ExecuteCommand>");
    entered.Wait();

    device.Reset();
    proceed.Open();

    VRawClient other(running.Socket->Port());
    EXPECT_EQ(InformationReply, other.Request(Information));
    EXPECT_EQ(1U, running.Dispatcher->Executed().size());
}

/// Two threads publish while every device asks: each device hears every event, all in one order,
/// and nothing comes out cut.
TEST_F(HostilePeers, EventsOfSeveralThreadsReachAllInOneOrderAmongReplies)
{
    constexpr int events = 150;
    constexpr int requests = 50;
    std::vector<VRawClient> devices;
    for (int i = 0; i < 6; ++i) {
        devices.push_back(running.Connect());
    }
    const auto fireAll = [&](const std::wstring& name) {
        for (int i = 0; i < events; ++i) {
            running.Fire(name + std::to_wstring(i));
        }
    };
    std::thread first(fireAll, L"a");
    std::thread second(fireAll, L"b");
    std::vector<std::vector<std::string>> heard(devices.size());
    std::vector<std::thread> asking;
    std::atomic<int> replies{0};

    for (std::size_t i = 0; i < devices.size(); ++i) {
        asking.emplace_back([&, i] {
            int replied = 0;
            devices[i].SendFrame(Information);
            while (replied < requests || heard[i].size() < 2 * events) {
                const std::string text = devices[i].ReadFrame();
                if (text == InformationReply) {
                    ++replies;
                    if (++replied < requests) {
                        devices[i].SendFrame(Information);
                    }
                } else {
                    heard[i].push_back(text);
                }
            }
        });
    }
    first.join();
    second.join();
    for (std::thread& thread : asking) {
        thread.join();
    }

    EXPECT_EQ(static_cast<int>(devices.size()) * requests, replies);
    EXPECT_EQ(2U * events, heard[0].size());
    EXPECT_NE(std::string::npos, heard[0][0].find("0</Name>"));
    for (const std::vector<std::string>& ofOne : heard) {
        EXPECT_EQ(heard[0], ofOne);
    }
}

TEST_F(HostilePeers, RandomFramesGetNothingButProperReplies)
{
    std::mt19937 random(20240229); // the same every time
    const std::string pieces[] = {"<",
                                  ">",
                                  "/",
                                  "</",
                                  "/>",
                                  "\"",
                                  "'",
                                  "=",
                                  "<!--",
                                  "-->",
                                  "<?",
                                  "?>",
                                  "&lt;",
                                  "&#x",
                                  ";",
                                  " ",
                                  "a",
                                  "<![CDATA[",
                                  "]]>",
                                  "<!DOCTYPE ",
                                  "[",
                                  "]",
                                  "\xC4\xBC",
                                  "\xFF",
                                  "\0"s,
                                  "\xF0\x9F\x98\x80",
                                  "<Events>",
                                  "</Events>",
                                  "<ExecuteCommand>",
                                  "<Name>x</Name>",
                                  "<Correlation>1</Correlation>",
                                  "<Commands>",
                                  "<Parameters>",
                                  "<Parameter>",
                                  "<Value>",
                                  "<EventInformation>",
                                  "<ServerInformation/>"};
    VRawClient client(running.Socket->Port());

    for (int i = 0; i < 3000; ++i) {
        std::string text;
        const std::size_t count = random() % 12;
        for (std::size_t piece = 0; piece < count; ++piece) {
            text += pieces[random() % std::size(pieces)];
        }
        client.SendFrame(text);
        if (i % 100 == 99) {
            // Whatever was answered before, the marker's reply comes out in the end.
            client.SendFrame("<Commands><Correlation>marker</Correlation></Commands>");
            std::string reply;
            do {
                reply = client.ReadFrame();
                ASSERT_EQ(0U, reply.find(DECLARATION "<"));
            } while (reply != DECLARATION "<Correlation>marker</Correlation><Commands/>");
        }
    }
}

// A device that does not read. More than the buffers of both ends can hold is owed to it.

const std::string LargeEvent = DECLARATION "<Event><Name>Large</Name><Parameters><Parameter>"
                                           "<Name>P</Name><Value>" +
                               std::string(TooMuch, 'x') +
                               "</Value></Parameter></Parameters></Event>";

class StalledPeer : public testing::Test
{
protected:
    /// Leaves an event on its way that cannot get to its end.
    void Stall()
    {
        firing = std::thread([this] {
            running.Fire(L"Large", std::wstring(TooMuch, L'x'));
            fired = true;
        });
        ASSERT_TRUE(BecomesTrue([this] { return stalled.IsReadable(); }));
        ASSERT_FALSE(fired);
    }

    /// Everything goes on: the event gets to the other device, a waiting one is served, and so are
    /// requests and further events.
    void ExpectThatAllGoesOn()
    {
        EXPECT_EQ(LargeEvent, other.ReadFrame());
        firing.join();
        EXPECT_TRUE(fired);
        VRawClient late(running.Socket->Port());
        EXPECT_EQ(InformationReply, late.Request(Information));
        EXPECT_EQ(InformationReply, other.Request(Information));
        running.Fire(L"E");
        EXPECT_EQ(DECLARATION "<Event><Name>E</Name><Parameters><Parameter><Name>P</Name>"
                              "<Value>1</Value></Parameter></Parameters></Event>",
                  other.ReadFrame());
    }

    ~StalledPeer() override
    {
        stalled.Close();
        other.Close();
        if (firing.joinable()) {
            firing.join(); // after a failure
        }
    }

    VRunningServer running;
    VRawClient stalled{running.Socket->Port(), SmallBuffer}; // first in the list of clients
    VRawClient other = (VRunningServer::Fence(stalled), running.Connect());
    std::atomic<bool> fired{false};
    std::thread firing;
};

TEST_F(StalledPeer, DisturbsNobodyWhileTheBuffersHoldWhatItIsOwed)
{
    for (int i = 0; i < 100; ++i) {
        running.Fire(L"E");
    }

    for (int i = 0; i < 100; ++i) {
        EXPECT_NE(std::string::npos, other.ReadFrame().find("<Name>E</Name>"));
    }
}

TEST_F(StalledPeer, LetsRequestsThroughAndAReplyOvertakeTheEvent)
{
    Stall();

    EXPECT_EQ(InformationReply, other.Request(Information));

    stalled.Close();
    ExpectThatAllGoesOn();
}

TEST_F(StalledPeer, IsOverWhenItReads)
{
    Stall();

    EXPECT_EQ(LargeEvent, stalled.ReadFrame());

    ExpectThatAllGoesOn();
}

TEST_F(StalledPeer, IsOverWhenItCloses)
{
    Stall();

    stalled.Close();

    ExpectThatAllGoesOn();
}

TEST_F(StalledPeer, IsOverWhenItIsKilled)
{
    Stall();

    stalled.Reset();

    ExpectThatAllGoesOn();
}

/// A connection that comes in during the stall waits for it on the socket's thread, and with it the
/// requests of all.
TEST_F(StalledPeer, HoldsUpNewConnectionsAndEverybodyIsServedAfterwards)
{
    Stall();
    VRawClient waiting(running.Socket->Port());
    waiting.SendFrame(Information);

    stalled.Close();

    ExpectThatAllGoesOn();
    EXPECT_EQ(InformationReply, waiting.ReadFrame());
}

} // namespace
