#include "device/ClientSupport.h"
#include "device/SocketFacts.h"

#include <atomic>
#include <functional>

#include <netinet/tcp.h>

#include <gmock/gmock.h>

namespace {

using ControlStream::VClient;
using ControlStream::VClientOptions;
using ControlStream::VCommandInformation;
using ControlStream::VCommandReply;
using ControlStream::VEventInformation;
using ControlStream::VServerInformation;
using namespace std::string_literals;

std::string Joined(const std::vector<std::string>& names)
{
    std::string text;
    for (const std::string& name : names) {
        text += name + ";";
    }
    return text;
}

/// A request with what goes over the wire, byte for byte.
struct VExchangeCase
{
    const char* Name;
    std::function<std::string(VClient&)> Ask;
    std::string Request;
    std::string Reply;
    std::string Answer;
};

class ClientExchange : public testing::TestWithParam<VExchangeCase>
{
};

TEST_P(ClientExchange, IsTheseBytes)
{
    const VExchangeCase& exchange = GetParam();
    std::string request;
    VScriptedHost host([&](VPeer& peer) {
        request = peer.ReadBytes(exchange.Request.size());
        peer.Send(exchange.Reply);
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());

    const std::string answer = exchange.Ask(client);
    client.Close();

    EXPECT_EQ("", host.Finish());
    EXPECT_EQ(exchange.Request, request);
    EXPECT_EQ(exchange.Answer, answer);
}

std::string AskInformation(VClient& client)
{
    const VServerInformation information = client.GetServerInformation();
    return std::to_string(information.Major) + "." + std::to_string(information.Minor);
}

std::string AskDescription(VClient& client)
{
    const VCommandInformation information = client.GetCommandInformation("Go");
    return "[" + information.Name + "] " + information.Description;
}

std::string AskEventDescription(VClient& client)
{
    const VEventInformation information = client.GetEventInformation("Event.Authorize");
    return "[" + information.Name + "] " + information.Description;
}

std::string Run(VClient& client)
{
    const VCommandReply reply = client.ExecuteCommand("Go", {{"p", "\xC3\xA9"}});
    return reply.Result + (reply.Ok ? " ok " : " failed ") +
           ControlStream::GetValue(reply.Parameters, "p") +
           ControlStream::GetValue(reply.Parameters, "absent");
}

// clang-format off
const VExchangeCase exchangeCases[] = {
    {"ServerInformation", &AskInformation,
     "\x14\x00\x00\x00" "<ServerInformation/>"s,
     "\x82\x00\x00\x00" "<?xml version=\"1.0\" encoding=\"UTF-16\" standalone=\"no\"?>"
     "<ServerInformation><StreamVersion major=\"1\" minor=\"0\"/></ServerInformation>"s,
     "1.0"},
    {"Commands", [](VClient& client) { return Joined(client.GetCommands()); },
     "\x31\x00\x00\x00" "<Commands><Correlation>1</Correlation></Commands>"s,
     "\x84\x00\x00\x00" "<?xml version=\"1.0\" encoding=\"UTF-16\" standalone=\"no\"?>"
     "<Correlation>1</Correlation><Commands><Command>Host.Echo</Command></Commands>"s,
     "Host.Echo;"},
    {"CommandInformation", &AskDescription,
     "\x54\x00\x00\x00" "<CommandInformation><Correlation>1</Correlation><Name>Go</Name></CommandInformation>"s,
     "\xD4\x00\x00\x00" "<?xml version=\"1.0\" encoding=\"UTF-16\" standalone=\"no\"?>"
     "<CommandInformation><Correlation>1</Correlation><Name/><Description>Command not found.</Description>"
     "<InputParameters/><ReplyParameters/></CommandInformation>"s,
     "[] Command not found."},
    {"Events", [](VClient& client) { return Joined(client.GetEvents()); },
     "\x09\x00\x00\x00" "<Events/>"s,
     "\x66\x00\x00\x00" "<?xml version=\"1.0\" encoding=\"UTF-16\" standalone=\"no\"?>"
     "<Events><Event>Event.Authorize</Event></Events>"s,
     "Event.Authorize;"},
    {"EventInformation", &AskEventDescription,
     "\x34\x00\x00\x00" "<EventInformation>Event.Authorize</EventInformation>"s,
     "\x7E\x00\x00\x00" "<?xml version=\"1.0\" encoding=\"UTF-16\" standalone=\"no\"?>"
     "<EventInformation><Name/><Description/><Parameters/></EventInformation>"s,
     "[] "},
    {"ExecuteCommand", &Run,
     "\x9B\x00\x00\x00" "<ExecuteCommand><Name>Go</Name><Correlation>1</Correlation><Parameters>"
     "<Parameter><Name>p</Name><Value>\xC3\xA9</Value></Parameter></Parameters></ExecuteCommand>"s,
     "\xE1\x00\x00\x00" "<?xml version=\"1.0\" encoding=\"UTF-16\" standalone=\"no\"?>"
     "<CommandReply><Name>Go</Name><Correlation>1</Correlation><Result>OK</Result><Parameters>"
     "<Parameter><Name>p</Name><Value>\xC3\xA9</Value></Parameter></Parameters></CommandReply>"s,
     "OK ok \xC3\xA9"},
    {"ExecuteCommandThatFails", &Run,
     "\x9B\x00\x00\x00" "<ExecuteCommand><Name>Go</Name><Correlation>1</Correlation><Parameters>"
     "<Parameter><Name>p</Name><Value>\xC3\xA9</Value></Parameter></Parameters></ExecuteCommand>"s,
     TestSupport::Frame(ReplyText("1", "Error: Invalid Parameter Value")),
     "Error: Invalid Parameter Value failed "},
    {"Raw", [](VClient& client) { return client.ExchangeRaw("<\xFF"s); },
     "\x02\x00\x00\x00" "<\xFF"s,
     "\x04\x00\x00\x00" "ab\x00\xFE"s,
     "ab\x00\xFE"s},
    {"EmptyRaw", [](VClient& client) { return client.ExchangeRaw(""); },
     "\x00\x00\x00\x00"s,
     "\x00\x00\x00\x00"s,
     ""},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, ClientExchange, testing::ValuesIn(exchangeCases),
                         [](const auto& test) { return test.param.Name; });

TEST(Client, CountsItsCorrelationsThroughAllKindsOfRequests)
{
    std::vector<std::string> requests;
    VScriptedHost host([&](VPeer& peer) {
        requests.push_back(peer.ReadFrame());
        peer.SendFrame("<Correlation>1</Correlation><Commands/>");
        requests.push_back(peer.ReadFrame());
        peer.SendFrame(ReplyText("2"));
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());

    client.GetCommands();
    client.ExecuteCommand("Go");
    client.Close();

    EXPECT_EQ("", host.Finish());
    EXPECT_EQ((std::vector<std::string>{
                  "<Commands><Correlation>1</Correlation></Commands>",
                  "<ExecuteCommand><Name>Go</Name><Correlation>2</Correlation></ExecuteCommand>"}),
              requests);
}

TEST(Client, FindsItsHostByName)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(ServerInformationText());
    });
    VClient client(WithLimit(Patient));
    client.Connect("localhost", host.Port());

    EXPECT_EQ(1, client.GetServerInformation().Major);
}

TEST(Client, SendsHeaderAndTextInOneSegment)
{
    std::atomic<int> segments{0};
    VScriptedHost host([&](VPeer& peer) {
        peer.ReadFrame();
        segments = DataSegmentsIn(peer.Descriptor());
        peer.SendFrame(ServerInformationText());
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());

    client.GetServerInformation();

    EXPECT_EQ(1, segments);
}

TEST(Client, SendsWithoutDelay)
{
    VScriptedHost host([](VPeer& peer) { peer.ReadToEnd(); });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());

    int noDelay = 0;
    socklen_t size = sizeof noDelay;
    ASSERT_EQ(0, getsockopt(SocketTo(host.Port()), IPPROTO_TCP, TCP_NODELAY, &noDelay, &size));
    EXPECT_EQ(1, noDelay);
}

TEST(Client, AcknowledgesAtOnceWhereAskedTo)
{
    VScriptedHost host([](VPeer& peer) {
        for (int i = 0; i < 5; ++i) {
            peer.ReadFrame();
            peer.SendFrame(ServerInformationText());
        }
        peer.ReadToEnd();
    });
    VClientOptions options = WithLimit(Patient);
    options.QuickAcknowledgement = true;
    VClient client(options);
    client.Connect("127.0.0.1", host.Port());
    for (int i = 0; i < 5; ++i) {
        client.GetServerInformation(); // by then the kernel would have begun to delay
    }

    int quick = 0;
    socklen_t size = sizeof quick;
    ASSERT_EQ(0, getsockopt(SocketTo(host.Port()), IPPROTO_TCP, TCP_QUICKACK, &quick, &size));
    EXPECT_EQ(1, quick);
}

TEST(Client, TakesAReplyByteByByte)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        for (const char byte : TestSupport::Frame(ReplyText("1"))) {
            peer.Send(std::string(1, byte));
        }
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());

    EXPECT_TRUE(client.ExecuteCommand("Go").Ok);
}

TEST(Client, TakesABigReply)
{
    const std::string value(8U << 20U, 'x');
    VScriptedHost host([&](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame("<CommandReply><Name>Go</Name><Correlation>1</Correlation>"
                       "<Result>OK</Result><Parameters><Parameter><Name>p</Name><Value>" +
                       value + "</Value></Parameter></Parameters></CommandReply>");
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());

    const VCommandReply reply = client.ExecuteCommand("Go");

    ASSERT_EQ(1U, reply.Parameters.size());
    EXPECT_TRUE(reply.Parameters[0].Value == value);
}

TEST(Client, ReadsWhileItWritesSinceTheHostMayBeBusyWriting)
{
    // Neither side's buffers hold so much: a client that only wrote would wait for a host that
    // only writes.
    const std::string value(16U << 20U, 'x');
    constexpr int eventCount = 16;
    std::atomic<std::size_t> received{0};
    VScriptedHost host([&](VPeer& peer) {
        const std::string event = EventText("Big", value.substr(0, 1U << 20U));
        for (int i = 0; i < eventCount; ++i) {
            peer.SendFrame(event);
        }
        received = peer.ReadFrame().size();
        peer.SendFrame(ReplyText("1"));
        peer.ReadToEnd();
    });
    VClientOptions options = WithLimit(Patient);
    options.KeptEventBytes = 64U << 20U;
    VClient client(options);
    client.Connect("127.0.0.1", host.Port());

    EXPECT_TRUE(client.ExecuteCommand("Go", {{"p", value}}).Ok);

    EXPECT_GT(received, value.size());
    for (int i = 0; i < eventCount; ++i) {
        EXPECT_TRUE(client.WaitForEvent(std::chrono::milliseconds(0))) << i;
    }
}

TEST(Client, FinishWaitsUntilTheHostHasHandledEverything)
{
    std::atomic<bool> handled{false};
    VScriptedHost host([&](VPeer& peer) {
        peer.SendFrame(EventText("Unread"));
        peer.ReadToEnd();
        handled = true;
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());
    client.SendRaw("<Foo/>");

    EXPECT_TRUE(client.Finish(Patient));

    EXPECT_TRUE(handled);
    EXPECT_FALSE(client.IsConnected());
    EXPECT_TRUE(client.Finish(Patient)) << "there is nothing left to wait for";
}

TEST(Client, FinishGivesUpOnAHostThatDoesNotClose)
{
    VScriptedHost host([&](VPeer& peer) {
        const std::string flood(1U << 20U, 'x');
        while (peer.SendFrame(flood)) {
        }
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());

    EXPECT_FALSE(client.Finish(Hasty));

    EXPECT_FALSE(client.IsConnected());
}

TEST(Client, ConnectsAnewAndForgetsTheEarlierConnection)
{
    int connection = 0;
    VScriptedHost host([&](VPeer& peer) {
        ++connection;
        if (connection == 1) {
            peer.Send(TestSupport::Frame(EventText("Old")) + "\xFF"); // and half a header
        } else {
            peer.ReadFrame();
            peer.SendFrame(ServerInformationText());
        }
        peer.ReadToEnd();
    });
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port());
    ASSERT_TRUE(client.WaitForEvent(Patient)); // both are read in one piece

    client.Connect("127.0.0.1", host.Port());

    EXPECT_EQ(1, client.GetServerInformation().Major);
    EXPECT_FALSE(client.WaitForEvent(std::chrono::milliseconds(0)));
}

} // namespace
