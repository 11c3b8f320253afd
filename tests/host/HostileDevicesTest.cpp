#include "EchoText.h"
#include "RunningHost.h"

#include <gtest/gtest.h>

#include <cstddef>
#include <random>
#include <string>
#include <vector>

// Devices that do their worst against the running host. After each the host lives, answers the next
// good frame, and ends in order, which under a sanitizer includes that nothing leaked.

using namespace std::string_literals;
using TestSupport::Connect;
using TestSupport::ConnectMany;
using TestSupport::declaration;
using TestSupport::Echo;
using TestSupport::EchoReply;
using TestSupport::Event;
using TestSupport::Frame;
using TestSupport::HostHasReadEverything;
using TestSupport::sanitized;
using TestSupport::serverInformation;
using TestSupport::VRawClient;
using TestSupport::VRunningHost;

namespace {

constexpr std::size_t manyDevices = 1000;

/// A host with one device that means well and is connected all the time.
class HostileDevices : public testing::Test
{
protected:
    HostileDevices()
    {
        TestSupport::RaiseDescriptorLimit();
        bystander.Request("<ServerInformation/>");
        descriptors = host.Descriptors();
    }

    ~HostileDevices() override
    {
        EXPECT_EQ(serverInformation, bystander.Request("<ServerInformation/>"));
        TestSupport::ExpectAnswersTheNextGoodFrame();
        // Fewer than at the start where the announcement on the network has ended meanwhile.
        EXPECT_TRUE(TestSupport::ComesTrue([this] { return host.Descriptors() <= descriptors; }));
        TestSupport::ExpectOrderlyEnd(host);
    }

    /// Waits until the host, which has one thread for all devices, has read what others sent
    /// before.
    void WaitUntilRead()
    {
        EXPECT_EQ(serverInformation, bystander.Request("<ServerInformation/>"));
    }

    VRunningHost host;
    VRawClient bystander = Connect();
    std::size_t descriptors = 0;
};

std::string Repeated(const std::string& text, std::size_t count)
{
    std::string repeated;
    repeated.reserve(text.size() * count);
    for (std::size_t i = 0; i < count; ++i) {
        repeated += text;
    }
    return repeated;
}

} // namespace

TEST_F(HostileDevices, AThousandHeadersThatClaimTheMostCostAtMost64MiB)
{
    const auto devices = ConnectMany(manyDevices);
    TestSupport::ExpectAnswersTheNextGoodFrame(); // all of them are accepted
    const long before = host.Memory("VmRSS");

    for (const auto& device : devices) {
        device->Send("\xFF\xFF\xFF\xFF"s);
    }
    ASSERT_TRUE(HostHasReadEverything());
    TestSupport::ExpectAnswersTheNextGoodFrame();

    const long grown = host.Memory("VmRSS") - before;
    RecordProperty("KiBForAll", std::to_string(grown));
    if (!sanitized) { // whose own memory hides the host's
        EXPECT_LE(grown, 64 * 1024);
    }
}

TEST_F(HostileDevices, ABodyThatComesInPiecesBehindAGreatClaimIsTakenAsItComes)
{
    VRawClient device = Connect();
    device.Send("\x00\x00\x00\x01"s); // 16 MiB
    const std::string piece(1024 * 1024, ' ');
    for (int i = 0; i < 8; ++i) {
        ASSERT_TRUE(device.Send(piece));
        EXPECT_EQ(serverInformation, bystander.Request("<ServerInformation/>"));
    }
    device.Reset();
}

TEST_F(HostileDevices, NestedElementsBeyondMeasureAreMetWithSilence)
{
    constexpr std::size_t levels = 300'000;
    const std::string open = Repeated("<a>", levels);
    const std::string texts[] = {
        open,
        open + Repeated("</a>", levels),
        "<ServerInformation>" + open + Repeated("</a>", levels) + "</ServerInformation>",
        "<ExecuteCommand>" + open,
        Repeated("<Commands>", levels),
    };

    VRawClient device = Connect();
    for (const std::string& text : texts) {
        ASSERT_TRUE(device.SendFrame(text));
        // The reply to what follows is the first that comes.
        EXPECT_EQ(serverInformation, device.Request("<ServerInformation/>"));
    }
}

TEST_F(HostileDevices, OneByteAtATimeIsAFrameAllTheSame)
{
    VRawClient device = Connect();
    for (const char byte : Frame(Echo("1", "slowly"))) {
        ASSERT_TRUE(device.Send(std::string(1, byte)));
        EXPECT_EQ(serverInformation, bystander.Request("<ServerInformation/>"));
    }

    EXPECT_EQ(EchoReply("1", "slowly"), device.ReadFrame());
}

TEST_F(HostileDevices, AFrameCutAtAnyByteAndContinuedIsOneFrame)
{
    const std::string frame = Frame(Echo("1", "cut"));
    VRawClient device = Connect();
    for (std::size_t cut = 0; cut <= frame.size(); ++cut) {
        device.Send(frame.substr(0, cut));
        WaitUntilRead();
        device.Send(frame.substr(cut));

        ASSERT_EQ(EchoReply("1", "cut"), device.ReadFrame()) << cut;
    }
}

TEST_F(HostileDevices, AFrameCutAtAnyByteByTheEndOfTheStreamIsDropped)
{
    const std::string frame = Frame(Echo("1", "cut"));
    for (std::size_t cut = 0; cut < frame.size(); ++cut) {
        VRawClient device = Connect();
        device.Send(frame.substr(0, cut));
        device.ShutdownWrite();

        ASSERT_EQ("", device.ReadToEnd()) << cut;
    }
}

TEST_F(HostileDevices, HalfAFrameAndThenAResetIsDropped)
{
    const std::string frame = Frame(Echo("1", "reset"));
    for (int i = 0; i < 200; ++i) {
        VRawClient device = Connect();
        device.Send(frame.substr(0, frame.size() / 2));
        if (i % 2 == 0) {
            WaitUntilRead();
        }
        device.Reset();
    }
}

TEST_F(HostileDevices, AResetInsteadOfReadingTheReplyIsNoMatter)
{
    for (int i = 0; i < 200; ++i) {
        VRawClient device = Connect();
        for (int request = 0; request < 10; ++request) {
            device.SendFrame(Echo("1", "unread"));
        }
        device.Reset();
    }
}

TEST_F(HostileDevices, AnyTextInAnyValueComesBackAsTheCharactersThatItHolds)
{
    const struct
    {
        const char* sent;
        const char* returned;
    } values[] = {
        // clang-format off
        {"\xD0\xBC",                 "\xD0\xBC"},             // U+043C
        {"\xE4\xB8\x80",             "\xE4\xB8\x80"},         // U+4E00
        {"\xC4\x80\xC4\xBC\xC4\xBE", "\xC4\x80\xC4\xBC\xC4\xBE"}, // U+0100, U+013C, U+013E
        {"\xD0\xA0 \xD0\xA0",        "\xD0\xA0 \xD0\xA0"},    // U+0420, whose low byte is a blank's
        {"\xF0\x9F\x98\x80",         "\xF0\x9F\x98\x80"},     // an emoji
        {"\xF4\x8F\xBF\xBF",         "\xF4\x8F\xBF\xBF"},     // U+10FFFF
        {"\xEF\xBF\xBF",             "\xEF\xBF\xBF"},         // U+FFFF
        {"\xEF\xBB\xBFz",            "\xEF\xBB\xBFz"},        // a byte-order mark
        {"\xFF",                     "\xEF\xBF\xBD"},
        {"a\xC3",                    "a\xEF\xBF\xBD"},        // cut short
        {"\xF0\x9F\x98",             "\xEF\xBF\xBD"},
        {"\xE2\x82" "A",             "\xEF\xBF\xBD" "A"},
        {"\xC0\x80",                 "\xEF\xBF\xBD\xEF\xBF\xBD"}, // overlong
        {"\xED\xA0\xBD",             "\xEF\xBF\xBD\xEF\xBF\xBD\xEF\xBF\xBD"}, // lone surrogates
        {"\xED\xB8\x80",             "\xEF\xBF\xBD\xEF\xBF\xBD\xEF\xBF\xBD"},
        {"\xF4\x90\x80\x80",         "\xEF\xBF\xBD\xEF\xBF\xBD\xEF\xBF\xBD\xEF\xBF\xBD"},
        // clang-format on
    };

    VRawClient device = Connect();
    const std::string commands = device.Request("<Commands><Correlation>1</Correlation></Commands>")
                                     .substr((declaration + "<Correlation>1").size());
    const std::string events = device.Request("<Events/>");
    for (const auto& [x, y] : values) {
        const std::string sent = x;
        const std::string returned = y;
        EXPECT_EQ(EchoReply(returned, returned), device.Request(Echo(sent, sent)));
        EXPECT_EQ(declaration +
                      "<CommandReply><Name>Host.Echo</Name><Correlation>1</Correlation>"
                      "<Result>OK</Result><Parameters><Parameter><Name>" +
                      returned + "</Name><Value/></Parameter></Parameters></CommandReply>",
                  device.Request("<ExecuteCommand><Name>Host.Echo</Name><Correlation>1"
                                 "</Correlation><Parameters><Parameter><Name>" +
                                 sent + "</Name></Parameter></Parameters></ExecuteCommand>"));
        EXPECT_EQ(declaration + "<CommandReply><Name>" + returned +
                      "</Name><Correlation>1</Correlation><Result>Error: Invalid command name or "
                      "command not valid for the host application.</Result><Parameters/>"
                      "</CommandReply>",
                  device.Request("<ExecuteCommand><Name>" + sent +
                                 "</Name><Correlation>1</Correlation></ExecuteCommand>"));
        EXPECT_EQ(declaration + "<Correlation>" + returned + commands,
                  device.Request("<Commands><Correlation>" + sent + "</Correlation></Commands>"));
        EXPECT_EQ(declaration + "<CommandInformation><Correlation>" + returned +
                      "</Correlation><Name/><Description>Command not found.</Description>"
                      "<InputParameters/><ReplyParameters/></CommandInformation>",
                  device.Request("<CommandInformation><Correlation>" + sent +
                                 "</Correlation><Name>" + sent + "</Name></CommandInformation>"));
        EXPECT_EQ(declaration + "<EventInformation><Name/><Description/><Parameters/>"
                                "</EventInformation>",
                  device.Request("<EventInformation>" + sent + "</EventInformation>"));
        EXPECT_EQ(events, device.Request("<Events>" + sent + "</Events>"));
        EXPECT_EQ(serverInformation, device.Request("<ServerInformation a=\"" + sent + "\" b='" +
                                                    sent + "'>" + sent + "</ServerInformation>"));
    }
}

TEST_F(HostileDevices, AnyTextOutsideValuesIsMetWithSilence)
{
    VRawClient device = Connect();
    for (const char* const x : {"\xD0\xBC", "\xE4\xB8\x80", "\xC4\xBC", "\xF0\x9F\x98\x80", "\xFF",
                                "\xED\xA0\xBD", "\xF0\x9F\x98"}) {
        const std::string text = x;
        for (const std::string& frame :
             {text, "<" + text + "/>", "<" + text + ">", "<a " + text + "='1'", "<a><" + text,
              "<a>" + text, "<!" + text, "<?" + text, "</" + text + ">", "&" + text + ";"}) {
            device.SendFrame(frame);
        }
        EXPECT_EQ(serverInformation, device.Request("<ServerInformation/>"));
    }
}

TEST_F(HostileDevices, AThousandIdleOnesAreServedAndCostLittle)
{
    const long before = host.Memory("VmRSS");
    const auto devices = ConnectMany(manyDevices);
    TestSupport::ExpectAnswersTheNextGoodFrame();
    const long grown = host.Memory("VmRSS") - before;
    RecordProperty("KiBForAll", std::to_string(grown));
    if (!sanitized) { // whose own memory hides the host's
        EXPECT_LE(grown, 8 * static_cast<long>(manyDevices));
    }

    EXPECT_EQ("ok", host.Command("fire Event.X"));

    for (const auto& device : devices) {
        ASSERT_EQ(Event("Event.X"), device->ReadFrame());
    }
    EXPECT_EQ(Event("Event.X"), bystander.ReadFrame());
}

TEST_F(HostileDevices, OneThatNeverReadsDisturbsNobodyWhileTheBuffersHoldWhatItIsOwed)
{
    VRawClient deaf = Connect();
    deaf.Request("<ServerInformation/>");

    for (int i = 0; i < 100; ++i) {
        ASSERT_EQ("ok", host.Command("fire Event.X"));
        ASSERT_EQ(Event("Event.X"), bystander.ReadFrame());
        ASSERT_EQ(EchoReply("1", "heard"), bystander.Request(Echo("1", "heard")));
    }
    TestSupport::ExpectAnswersTheNextGoodFrame();
}

TEST_F(HostileDevices, FiftyThousandRandomFramesAreOutlived)
{
    constexpr int batches = 500;
    constexpr int framesInABatch = 100;
    std::mt19937 random(803); // the same frames in every run
    const auto below = [&](std::size_t limit) {
        return std::uniform_int_distribution<std::size_t>(0, limit - 1)(random);
    };
    const std::vector<std::string> pieces = {
        "<",
        ">",
        "</",
        "/>",
        "=",
        "\"",
        "'",
        "&",
        "&amp;",
        "&#x0;",
        "<!",
        "--",
        "]]",
        "<?",
        "?>",
        "<![CDATA[",
        "\0"s,
        "\xD0\xBC",
        "\xF0\x9F",
        "\xFF",
        " ",
        "\n",
        "1",
        "ExecuteCommand",
        "Name",
        "Host.Echo",
        "Correlation",
        "Value",
        "Parameters",
        "Parameter",
        "Commands",
        "Events",
        "EventInformation",
        "CommandInformation",
        "ServerInformation",
    };
    const std::string good = Echo("1", "mutated");
    const auto randomText = [&] {
        std::string text;
        switch (below(3)) {
        case 0: // bytes
            for (std::size_t left = below(300); left > 0; --left) {
                text += static_cast<char>(below(256));
            }
            break;
        case 1: // pieces of messages
            for (std::size_t left = below(60); left > 0; --left) {
                text += pieces[below(pieces.size())];
            }
            break;
        default: // a good message with a few bytes changed
            text = good;
            for (std::size_t left = 1 + below(4); left > 0; --left) {
                text[below(text.size())] = static_cast<char>(below(256));
            }
        }
        return text;
    };

    VRawClient device = Connect();
    for (int batch = 0; batch < batches; ++batch) {
        std::string stream;
        for (int i = 0; i < framesInABatch; ++i) {
            stream += Frame(randomText());
        }
        const std::string last = "batch " + std::to_string(batch);
        ASSERT_TRUE(device.Send(stream + Frame(Echo(last, "done"))));
        std::string reply;
        do { // some of the frames are good ones still
            reply = device.ReadFrame();
        } while (reply != EchoReply(last, "done"));
    }
}

TEST_F(HostileDevices, StreamsWithoutAnyFramesAreOutlived)
{
    std::mt19937 random(803);
    for (int i = 0; i < 200; ++i) {
        VRawClient device = Connect();
        std::string stream;
        for (std::size_t left = random() % 5000; left > 0; --left) {
            stream += static_cast<char>(random());
        }
        device.Send(stream);
        if (i % 2 == 0) {
            device.Reset();
        }
    }
}
