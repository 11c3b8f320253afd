#include "ControlStreamClient/Message.h"

#include "ControlStreamClient/Error.h"
#include "device/ScriptedHost.h"

#include <gmock/gmock.h>

namespace {

using ControlStream::EErrorKind;
using ControlStream::EMessageKind;
using ControlStream::ParseMessage;
using ControlStream::VCommandInformation;
using ControlStream::VCommandReply;
using ControlStream::VError;
using ControlStream::VEvent;
using ControlStream::VEventInformation;
using ControlStream::VMessage;
using ControlStream::VParameters;
using ControlStream::VServerInformation;
using namespace std::string_literals;

using Names = std::vector<std::string>;

/// The value of the only parameter of an event, whose element is given as it stands on the wire.
std::string ValueOf(const std::string& valueElement)
{
    const VMessage message =
        ParseMessage("<Event><Name>e</Name><Parameters><Parameter><Name>p</Name>" + valueElement +
                     "</Parameter></Parameters></Event>");
    const VParameters& parameters = std::get<VEvent>(message.Content).Parameters;
    return parameters.size() == 1 ? parameters[0].Value : "(not one parameter)";
}

std::string ProtocolErrorOf(const std::string& text)
{
    try {
        ParseMessage(text);
    } catch (const VError& error) {
        EXPECT_EQ(EErrorKind::Protocol, error.Kind());
        return error.what();
    }
    return "no error";
}

TEST(Message, ServerInformation)
{
    const VMessage message =
        ParseMessage(R"(<?xml version="1.0" encoding="UTF-16" standalone="no"?><ServerInformation>)"
                     R"(<StreamVersion major="1" minor="0"/></ServerInformation>)");

    ASSERT_EQ(EMessageKind::ServerInformation, message.Kind);
    EXPECT_EQ(1, std::get<VServerInformation>(message.Content).Major);
    EXPECT_EQ(0, std::get<VServerInformation>(message.Content).Minor);
    EXPECT_EQ("", message.Correlation);
}

TEST(Message, DeliberateCommandsBearTheirCorrelationBesideThem)
{
    const VMessage message =
        ParseMessage(Declaration + "<Correlation>7</Correlation><Commands>"
                                   "<Command>b</Command><Command>a</Command></Commands>"s);

    ASSERT_EQ(EMessageKind::Commands, message.Kind);
    EXPECT_EQ("7", message.Correlation);
    EXPECT_EQ((Names{"b", "a"}), std::get<Names>(message.Content));

    const VMessage inside =
        ParseMessage("<Commands><Correlation>7</Correlation><Command>b</Command></Commands>");
    EXPECT_EQ("", inside.Correlation);
}

TEST(Message, CommandsMayBeNone)
{
    const VMessage message = ParseMessage(Declaration + "<Correlation>7</Correlation><Commands/>"s);

    EXPECT_EQ(EMessageKind::Commands, message.Kind);
    EXPECT_EQ(Names{}, std::get<Names>(message.Content));
}

TEST(Message, DeliberateDescriptionsOfACommandsParametersAreCalledValue)
{
    const VMessage message = ParseMessage(
        Declaration +
        "<CommandInformation><Correlation>7</Correlation><Name>n</Name>"
        "<Description>d</Description>"
        "<InputParameters><Parameter><Name>i1</Name><Value>x</Value></Parameter>"
        "<Parameter><Name>i2</Name><Value>y</Value></Parameter></InputParameters>"
        "<ReplyParameters><Parameter><Name>r</Name><Value>z</Value></Parameter></ReplyParameters>"
        "</CommandInformation>"s);

    ASSERT_EQ(EMessageKind::CommandInformation, message.Kind);
    EXPECT_EQ("7", message.Correlation);
    const auto& information = std::get<VCommandInformation>(message.Content);
    EXPECT_EQ("n", information.Name);
    EXPECT_EQ("d", information.Description);
    ASSERT_EQ(2U, information.InputParameters.size());
    EXPECT_EQ("i1", information.InputParameters[0].Name);
    EXPECT_EQ("x", information.InputParameters[0].Description);
    EXPECT_EQ("i2", information.InputParameters[1].Name);
    EXPECT_EQ("y", information.InputParameters[1].Description);
    ASSERT_EQ(1U, information.ReplyParameters.size());
    EXPECT_EQ("r", information.ReplyParameters[0].Name);
    EXPECT_EQ("z", information.ReplyParameters[0].Description);
}

TEST(Message, UnknownCommandIsDescribedByEmptyElements)
{
    const VMessage message =
        ParseMessage(Declaration + "<CommandInformation><Correlation>7</Correlation><Name/>"
                                   "<Description>Command not found.</Description>"
                                   "<InputParameters/><ReplyParameters/></CommandInformation>"s);

    const auto& information = std::get<VCommandInformation>(message.Content);
    EXPECT_EQ("", information.Name);
    EXPECT_EQ("Command not found.", information.Description);
    EXPECT_TRUE(information.InputParameters.empty());
    EXPECT_TRUE(information.ReplyParameters.empty());
}

TEST(Message, Events)
{
    const VMessage message =
        ParseMessage(Declaration + "<Events><Event>b</Event><Event>a</Event></Events>"s);

    ASSERT_EQ(EMessageKind::Events, message.Kind);
    EXPECT_EQ((Names{"b", "a"}), std::get<Names>(message.Content));
    EXPECT_EQ(Names{}, std::get<Names>(ParseMessage("<Events/>").Content));
}

TEST(Message, DescriptionsOfAnEventsParametersAreCalledDescription)
{
    const VMessage message = ParseMessage(
        Declaration + "<EventInformation><Name>n</Name><Description>d</Description><Parameters>"
                      "<Parameter><Name>p</Name><Description>x</Description></Parameter>"
                      "</Parameters></EventInformation>"s);

    ASSERT_EQ(EMessageKind::EventInformation, message.Kind);
    const auto& information = std::get<VEventInformation>(message.Content);
    EXPECT_EQ("n", information.Name);
    EXPECT_EQ("d", information.Description);
    ASSERT_EQ(1U, information.Parameters.size());
    EXPECT_EQ("p", information.Parameters[0].Name);
    EXPECT_EQ("x", information.Parameters[0].Description);
}

TEST(Message, EventInformationMayBeWhollyEmpty)
{
    const VMessage message = ParseMessage(
        Declaration + "<EventInformation><Name/><Description/><Parameters/></EventInformation>"s);

    const auto& information = std::get<VEventInformation>(message.Content);
    EXPECT_EQ("", information.Name);
    EXPECT_EQ("", information.Description);
    EXPECT_TRUE(information.Parameters.empty());
}

TEST(Message, CommandReplyKeepsTheOrderOfItsParameters)
{
    const VMessage message =
        ParseMessage(Declaration + "<CommandReply><Name>n</Name><Correlation>7</Correlation>"
                                   "<Result>OK</Result><Parameters>"
                                   "<Parameter><Name>b</Name><Value>1</Value></Parameter>"
                                   "<Parameter><Name>a</Name><Value/></Parameter>"
                                   "</Parameters></CommandReply>"s);

    ASSERT_EQ(EMessageKind::CommandReply, message.Kind);
    EXPECT_EQ("7", message.Correlation);
    const auto& reply = std::get<VCommandReply>(message.Content);
    EXPECT_TRUE(reply.Ok);
    EXPECT_EQ("OK", reply.Result);
    ASSERT_EQ(2U, reply.Parameters.size());
    EXPECT_EQ("b", reply.Parameters[0].Name);
    EXPECT_EQ("1", reply.Parameters[0].Value);
    EXPECT_EQ("a", reply.Parameters[1].Name);
    EXPECT_EQ("", reply.Parameters[1].Value);
}

TEST(Message, AnyResultButOkIsAFailure)
{
    for (const std::string result : {"Error: System Error", "ok", "OK "}) {
        const VMessage message =
            ParseMessage("<CommandReply><Name>n</Name><Correlation>7</Correlation><Result>" +
                         result + "</Result><Parameters/></CommandReply>");

        const auto& reply = std::get<VCommandReply>(message.Content);
        EXPECT_FALSE(reply.Ok) << result;
        EXPECT_EQ(result, reply.Result);
    }
}

TEST(Message, Event)
{
    const VMessage message =
        ParseMessage(Declaration + "<Event><Name>Event.Disconnect</Name><Parameters/></Event>"s);

    ASSERT_EQ(EMessageKind::Event, message.Kind);
    EXPECT_EQ("Event.Disconnect", std::get<VEvent>(message.Content).Name);
    EXPECT_TRUE(std::get<VEvent>(message.Content).Parameters.empty());
}

TEST(Message, DeliberateCorrelationAndNameComeBackAsTheyWereSent)
{
    // A request's "a&b" travels as it stands, and the host writes it with an entity.
    const VMessage plain = ParseMessage("<CommandReply><Name>n</Name><Correlation>a&amp;b"
                                        "</Correlation><Result>OK</Result></CommandReply>");
    EXPECT_EQ("a&b", plain.Correlation);

    const VMessage twice = ParseMessage("<CommandReply><Name>n</Name><Correlation>a&amp;amp;b"
                                        "</Correlation><Result>OK</Result></CommandReply>");
    EXPECT_EQ("a&amp;b", twice.Correlation);
}

struct VTextCase
{
    const char* Name;
    std::string Element;
    std::string Text;
};

class MessageText : public testing::TestWithParam<VTextCase>
{
};

TEST_P(MessageText, IsReadFromItsElement)
{
    EXPECT_EQ(GetParam().Text, ValueOf(GetParam().Element));
}

// clang-format off
const VTextCase textCases[] = {
    {"ShortForm", "<Value/>", ""},
    {"LongForm", "<Value></Value>", ""},
    {"Absent", "", ""},
    {"FiveEntities", "<Value>&lt;&gt;&apos;&quot;&amp;</Value>", "<>'\"&"},
    {"DecodedOnce", "<Value>&amp;lt;&amp;amp;</Value>", "&lt;&amp;"},
    {"OtherEntitiesStay", "<Value>&nbsp;&#65;&#xD800;&</Value>", "&nbsp;&#65;&#xD800;&"},
    {"BlanksAroundStay", "<Value> a </Value>", " a "},
    {"BlanksAlone", "<Value> \n\t</Value>", " \n\t"},
    {"BlanksInATagWithBlanks", "<Value  > </Value>", " "},
    {"BlanksBehindAnAttribute", "<Value a='x' b=\"\" > </Value>", " "},
    {"ShortFormWithBlank", "<Value />", ""},
    {"BlanksAroundAChild", "<Value> <x/> </Value>", ""},
    {"Latin", "<Value>\xC3\xA9</Value>", "\xC3\xA9"},
    {"Cyrillic", "<Value>\xD0\xBC</Value>", "\xD0\xBC"},
    {"Han", "<Value>\xE4\xB8\x80</Value>", "\xE4\xB8\x80"},
    {"BeyondTheBasicPlane", "<Value>\xF0\x9F\x98\x80</Value>", "\xF0\x9F\x98\x80"},
    {"InvalidByte", "<Value>a\xFF" "b</Value>", "a\xEF\xBF\xBD" "b"},
    {"CutSequence", "<Value>\xF0\x9F\x98</Value>", "\xEF\xBF\xBD"},
    {"EncodedSurrogate", "<Value>\xED\xA0\x80</Value>", "\xEF\xBF\xBD\xEF\xBF\xBD\xEF\xBF\xBD"},
    {"Zero", "<Value>a\0b</Value>"s, "a\xEF\xBF\xBD" "b"},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, MessageText, testing::ValuesIn(textCases),
                         [](const auto& test) { return test.param.Name; });

TEST(Message, OfAnotherKindIsUnknownAndNoError)
{
    EXPECT_EQ(EMessageKind::Unknown, ParseMessage("<Foo/>").Kind);
    EXPECT_EQ(EMessageKind::Unknown, ParseMessage("<event><Name>x</Name></event>").Kind);
    EXPECT_EQ(EMessageKind::Unknown, ParseMessage("").Kind);
    EXPECT_EQ(EMessageKind::Unknown, ParseMessage("<Correlation>7</Correlation>").Kind);
}

struct VFaultCase
{
    const char* Name;
    std::string Text;
    const char* Reason;
};

class MessageFault : public testing::TestWithParam<VFaultCase>
{
};

TEST_P(MessageFault, IsAProtocolErrorWithItsReason)
{
    EXPECT_EQ(GetParam().Reason, ProtocolErrorOf(GetParam().Text));
}

std::string Repeated(const std::string& text, std::size_t count)
{
    std::string repeated;
    for (std::size_t i = 0; i < count; ++i) {
        repeated += text;
    }
    return repeated;
}

constexpr const char* NoXml = "the host sent a frame that cannot be read as XML";
constexpr const char* NoVersion = "the host's server information bears no version of the stream";

// clang-format off
const VFaultCase faultCases[] = {
    {"NoXml", "hello", NoXml},
    {"NotClosed", "<Event><Name>x</Name>", NoXml},
    {"NestedTooDeeply", Repeated("<a>", 1001) + Repeated("</a>", 1001), NoXml},
    {"EndlesslyNested", Repeated("<a>", 300000), NoXml},
    {"TooManyElements", Repeated("<a/>", (1 << 20) + 1), "the host sent a frame of too many elements"},
    {"TooManyAttributes", "<a " + Repeated("b='' ", (1 << 20) + 1) + "/>", "the host sent a frame of too many elements"},
    {"ReplyWithoutResult", "<CommandReply><Name>n</Name><Correlation>7</Correlation></CommandReply>",
     "the host's reply to a command bears no result"},
    {"InformationWithoutVersion", "<ServerInformation/>", NoVersion},
    {"VersionWithoutMinor", "<ServerInformation><StreamVersion major='1'/></ServerInformation>", NoVersion},
    {"VersionInWords", "<ServerInformation><StreamVersion major='one' minor='0'/></ServerInformation>", NoVersion},
    {"VersionWithARest", "<ServerInformation><StreamVersion major='1.5' minor='0'/></ServerInformation>", NoVersion},
    {"VersionTooGreat", "<ServerInformation><StreamVersion major='1' minor='99999999999'/></ServerInformation>", NoVersion},
    {"NegativeVersion", "<ServerInformation><StreamVersion major='-2' minor='0'/></ServerInformation>", NoVersion},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, MessageFault, testing::ValuesIn(faultCases),
                         [](const auto& test) { return test.param.Name; });

TEST(Message, NestedToTheLimitIsRead)
{
    EXPECT_EQ(EMessageKind::Unknown,
              ParseMessage(Repeated("<a>", 1000) + Repeated("</a>", 1000)).Kind);
}

TEST(Message, ALongListIsRead)
{
    const std::size_t count = 100000;
    const VMessage message =
        ParseMessage("<Correlation>1</Correlation><Commands>" +
                     Repeated("<Command>abc</Command>", count) + "</Commands>");

    EXPECT_EQ(count, std::get<Names>(message.Content).size());
}

TEST(Message, TextFullOfZerosIsReadInLinearTime)
{
    EXPECT_EQ(NoXml, ProtocolErrorOf(std::string(4U << 20U, '\0')));
}

} // namespace
