#include "WireText.h"

#include <gtest/gtest.h>

#include <string>
#include <tuple>

// What goes over the wire, as literal texts: each request is sent as a frame over a real socket,
// and each reply compared byte by byte.

namespace {

using namespace std::string_literals;
using TestSupport::VFakeControlSystem;
using TestSupport::VRawClient;

const char* const Silence = nullptr;
const char* const TheSame = "";

// A message whose reply cannot be taken for another: a reply to what was sent before it would come
// first.
const char* const Marker = "<ExecuteCommand><Name>Marker</Name><Correlation>m</Correlation>"
                           "</ExecuteCommand>";
const char* const MarkerReply =
    DECLARATION "<CommandReply><Name>Marker</Name><Correlation>m</Correlation>"
                "<Result>OK</Result><Parameters/></CommandReply>";

void Populate(VFakeControlSystem& dispatcher)
{
    dispatcher.CommandNames = {L"Second.Command", L"First<&>'\"Command", L"Echo"};
    dispatcher.EventNames = {L"Event.B", L"Event.A", L"Event<&>'\""};
    dispatcher.Commands[L"Marker"] = &VFakeControlSystem::Echo;
    dispatcher.Commands[L"Echo"] = &VFakeControlSystem::Echo;
    dispatcher.Commands[L"a&amp;b"] = &VFakeControlSystem::Echo;
    dispatcher.Commands[L"a&b"] = &VFakeControlSystem::Echo;
    dispatcher.Commands[L" Echo "] = &VFakeControlSystem::Echo;

    ControlSystem::ICommandInformation known;
    known.Name = L"Known";
    known.Description = L"Does \"this\" & 'that' <now>.";
    known.InputParameters = {{L"In2", L"second & last"}, {L"In1", L""}};
    known.ReplyParameters = {{L"Out", L"a result"}};
    dispatcher.CommandInformation[L"Known"] = known;
    ControlSystem::ICommandInformation bare;
    bare.Name = L"Bare";
    bare.Description = L"";
    dispatcher.CommandInformation[L"Bare"] = bare;

    ControlSystem::IEventInformation event;
    event.Name = L"Event.A";
    event.Description = L"It happened <again>.";
    event.Parameters = {{L"P2", L"the second"}, {L"P1", L"the \"first\""}};
    dispatcher.EventInformation[L"Event.A"] = event;
}

struct VMessageCase
{
    const char* Name;
    std::string Request;
    const char* Reply;                     ///< null for silence
    const char* TranslatedReply = TheSame; ///< with entities translated
};

void PrintTo(const VMessageCase& message, std::ostream* out)
{
    *out << message.Name;
}

// clang-format off
const VMessageCase messageCases[] = {
    // Server information.
    {"ServerInformation", "<ServerInformation/>",
        DECLARATION "<ServerInformation><StreamVersion major=\"1\" minor=\"0\"/></ServerInformation>"},
    {"ServerInformationWithAnyContent", "<ServerInformation x='1'>text<Correlation>5</Correlation><Foo/></ServerInformation>",
        DECLARATION "<ServerInformation><StreamVersion major=\"1\" minor=\"0\"/></ServerInformation>"},
    {"ServerInformationBehindADeclaration", DECLARATION "<ServerInformation></ServerInformation>",
        DECLARATION "<ServerInformation><StreamVersion major=\"1\" minor=\"0\"/></ServerInformation>"},

    // Command list: the one reply with two top-level elements.
    {"CommandsReplyHasTwoTopLevelElementsIsKept", "<Commands><Correlation>7</Correlation></Commands>",
        DECLARATION "<Correlation>7</Correlation><Commands><Command>Second.Command</Command>"
        "<Command>First&lt;&amp;&gt;&apos;&quot;Command</Command><Command>Echo</Command></Commands>"},
    {"CommandsWithIndentation", "<?xml version=\"1.0\"?>\r\n<Commands>\r\n\t<Correlation>7</Correlation>\r\n</Commands>\r\n",
        DECLARATION "<Correlation>7</Correlation><Commands><Command>Second.Command</Command>"
        "<Command>First&lt;&amp;&gt;&apos;&quot;Command</Command><Command>Echo</Command></Commands>"},
    {"CommandsCorrelationKeepsItsBlanks", "<Commands><Correlation> 7\n</Correlation></Commands>",
        DECLARATION "<Correlation> 7\n</Correlation><Commands><Command>Second.Command</Command>"
        "<Command>First&lt;&amp;&gt;&apos;&quot;Command</Command><Command>Echo</Command></Commands>"},
    {"CommandsCorrelationIsEchoedUndecodedIsKept", "<Commands><Correlation>a&amp;b</Correlation></Commands>",
        DECLARATION "<Correlation>a&amp;amp;b</Correlation><Commands><Command>Second.Command</Command>"
        "<Command>First&lt;&amp;&gt;&apos;&quot;Command</Command><Command>Echo</Command></Commands>",
        DECLARATION "<Correlation>a&amp;b</Correlation><Commands><Command>Second.Command</Command>"
        "<Command>First&lt;&amp;&gt;&apos;&quot;Command</Command><Command>Echo</Command></Commands>"},
    {"CommandsWithoutCorrelation", "<Commands/>", Silence},
    {"CommandsWithEmptyCorrelation", "<Commands><Correlation></Correlation></Commands>", Silence},
    {"CommandsWithShortCorrelation", "<Commands><Correlation/></Commands>", Silence},
    {"CommandsWithBlankCorrelation", "<Commands><Correlation> \t</Correlation></Commands>", Silence},
    {"CommandsWithCdataCorrelation", "<Commands><Correlation><![CDATA[7]]></Correlation></Commands>", Silence},
    {"CommandsWithCorrelationAttribute", "<Commands Correlation='7'/>", Silence},
    {"CommandsWithCorrelationInAnotherCase", "<Commands><correlation>7</correlation></Commands>", Silence},
    {"CommandsWithCorrelationDeeper", "<Commands><A><Correlation>7</Correlation></A></Commands>", Silence},
    {"CommandsWithEmptyCorrelationFirst", "<Commands><Correlation/><Correlation>7</Correlation></Commands>", Silence},
    {"CommandsFirstOfTwoCorrelations", "<Commands><Correlation>7</Correlation><Correlation>8</Correlation></Commands>",
        DECLARATION "<Correlation>7</Correlation><Commands><Command>Second.Command</Command>"
        "<Command>First&lt;&amp;&gt;&apos;&quot;Command</Command><Command>Echo</Command></Commands>"},

    // Command information: the description of a parameter goes under Value.
    {"CommandInformationValueIsADescriptionIsKept",
        "<CommandInformation><Correlation>c</Correlation><Name>Known</Name></CommandInformation>",
        DECLARATION "<CommandInformation><Correlation>c</Correlation><Name>Known</Name>"
        "<Description>Does &quot;this&quot; &amp; &apos;that&apos; &lt;now&gt;.</Description>"
        "<InputParameters><Parameter><Name>In2</Name><Value>second &amp; last</Value></Parameter>"
        "<Parameter><Name>In1</Name><Value/></Parameter></InputParameters>"
        "<ReplyParameters><Parameter><Name>Out</Name><Value>a result</Value></Parameter></ReplyParameters>"
        "</CommandInformation>"},
    {"CommandInformationInAnyOrder",
        "<CommandInformation><Name>Bare</Name><Correlation>c</Correlation></CommandInformation>",
        DECLARATION "<CommandInformation><Correlation>c</Correlation><Name>Bare</Name><Description/>"
        "<InputParameters/><ReplyParameters/></CommandInformation>"},
    {"CommandInformationOfAnUnknownCommandIsAnsweredIsKept",
        "<CommandInformation><Correlation>c</Correlation><Name>Unknown</Name></CommandInformation>",
        DECLARATION "<CommandInformation><Correlation>c</Correlation><Name/>"
        "<Description>Command not found.</Description><InputParameters/><ReplyParameters/></CommandInformation>"},
    {"CommandInformationNamesAreComparedWithCase",
        "<CommandInformation><Correlation>c</Correlation><Name>known</Name></CommandInformation>",
        DECLARATION "<CommandInformation><Correlation>c</Correlation><Name/>"
        "<Description>Command not found.</Description><InputParameters/><ReplyParameters/></CommandInformation>"},
    {"CommandInformationWithoutName", "<CommandInformation><Correlation>c</Correlation></CommandInformation>", Silence},
    {"CommandInformationWithEmptyName", "<CommandInformation><Correlation>c</Correlation><Name/></CommandInformation>", Silence},
    {"CommandInformationWithoutCorrelation", "<CommandInformation><Name>Known</Name></CommandInformation>", Silence},
    {"CommandInformationWithEmptyCorrelation",
        "<CommandInformation><Correlation/><Name>Known</Name></CommandInformation>", Silence},

    // Event list.
    {"Events", "<Events/>",
        DECLARATION "<Events><Event>Event.B</Event><Event>Event.A</Event>"
        "<Event>Event&lt;&amp;&gt;&apos;&quot;</Event></Events>"},
    {"EventsWithAnyContent", "<Events a='b'>x<Correlation>9</Correlation><!-- c --></Events>",
        DECLARATION "<Events><Event>Event.B</Event><Event>Event.A</Event>"
        "<Event>Event&lt;&amp;&gt;&apos;&quot;</Event></Events>"},

    // Event information: the element's own text is the name, and the description bears its own name.
    {"EventInformation", "<EventInformation>Event.A</EventInformation>",
        DECLARATION "<EventInformation><Name>Event.A</Name><Description>It happened &lt;again&gt;.</Description>"
        "<Parameters><Parameter><Name>P2</Name><Description>the second</Description></Parameter>"
        "<Parameter><Name>P1</Name><Description>the &quot;first&quot;</Description></Parameter></Parameters>"
        "</EventInformation>"},
    {"EventInformationIsEmptyWhereTheRecordIs", "<EventInformation>Event.B</EventInformation>",
        DECLARATION "<EventInformation><Name/><Description/><Parameters/></EventInformation>"},
    {"EventInformationOfAnUnknownEvent", "<EventInformation>Unknown</EventInformation>",
        DECLARATION "<EventInformation><Name/><Description/><Parameters/></EventInformation>"},
    {"EventInformationEmpty", "<EventInformation></EventInformation>", Silence},
    {"EventInformationShort", "<EventInformation/>", Silence},
    {"EventInformationWithNameChild", "<EventInformation><Name>Event.A</Name></EventInformation>", Silence},
    {"EventInformationWithCdata", "<EventInformation><![CDATA[Event.A]]></EventInformation>", Silence},
    {"EventInformationTakesTheFirstText", "<EventInformation> <Name>x</Name>Event.A</EventInformation>",
        DECLARATION "<EventInformation><Name>Event.A</Name><Description>It happened &lt;again&gt;.</Description>"
        "<Parameters><Parameter><Name>P2</Name><Description>the second</Description></Parameter>"
        "<Parameter><Name>P1</Name><Description>the &quot;first&quot;</Description></Parameter></Parameters>"
        "</EventInformation>"},

    // Execution.
    {"ExecuteWithoutParameters", "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters/></CommandReply>"},
    {"ExecuteWithEmptyParameters",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters/></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters/></CommandReply>"},
    {"ExecuteWithTextForParameters",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters>text</Parameters></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters/></CommandReply>"},
    {"ExecuteInAnyOrder",
        "<ExecuteCommand><Parameters><Parameter><Value>v</Value><Name>n</Name></Parameter></Parameters>"
        "<Correlation>1</Correlation><Name>Echo</Name></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters><Parameter><Name>n</Name><Value>v</Value></Parameter></Parameters></CommandReply>"},
    {"ExecuteReplyIsInTheMapsOrder",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters>"
        "<Parameter><Name>b</Name><Value>2</Value></Parameter>"
        "<Parameter><Name>a</Name><Value>1</Value></Parameter>"
        "<Parameter><Name>B</Name><Value>3</Value></Parameter></Parameters></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result><Parameters>"
        "<Parameter><Name>B</Name><Value>3</Value></Parameter>"
        "<Parameter><Name>a</Name><Value>1</Value></Parameter>"
        "<Parameter><Name>b</Name><Value>2</Value></Parameter></Parameters></CommandReply>"},
    {"ExecuteWithIndentation",
        "<ExecuteCommand>\n  <Name>Echo</Name>\n  <Correlation>1</Correlation>\n  <Parameters>\n    <Parameter>\n"
        "      <Name>n</Name>\n      <Value>v</Value>\n    </Parameter>\n  </Parameters>\n</ExecuteCommand>\n",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters><Parameter><Name>n</Name><Value>v</Value></Parameter></Parameters></CommandReply>"},
    {"ExecuteWithEmptyValue",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters>"
        "<Parameter><Name>n</Name><Value/></Parameter></Parameters></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters><Parameter><Name>n</Name><Value/></Parameter></Parameters></CommandReply>"},
    {"ExecuteWithAbsentValue",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters>"
        "<Parameter><Name>n</Name></Parameter></Parameters></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters><Parameter><Name>n</Name><Value/></Parameter></Parameters></CommandReply>"},
    {"ExecuteLaterValueOfOneNameWins",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters>"
        "<Parameter><Name>n</Name><Value>first</Value></Parameter>"
        "<Parameter><Name>n</Name><Value>later</Value></Parameter></Parameters></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters><Parameter><Name>n</Name><Value>later</Value></Parameter></Parameters></CommandReply>"},
    {"ExecuteEverySiblingOfTheFirstParameterCountsIsKept",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters>"
        "<Foo><Name>skipped</Name><Value>0</Value></Foo>"
        "<Parameter><Name>n</Name><Value>1</Value></Parameter>"
        "<Foo><Name>f</Name><Value>2</Value></Foo></Parameters></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result><Parameters>"
        "<Parameter><Name>f</Name><Value>2</Value></Parameter>"
        "<Parameter><Name>n</Name><Value>1</Value></Parameter></Parameters></CommandReply>"},
    {"ExecuteCommentsAmongParametersDoNotCount",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters><!-- c -->"
        "<Parameter><Name>n</Name><Value>1</Value></Parameter><!-- c --></Parameters></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result><Parameters>"
        "<Parameter><Name>n</Name><Value>1</Value></Parameter></Parameters></CommandReply>"},
    {"ExecuteTextAmongParametersCounts",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters>"
        "<Parameter><Name>n</Name><Value>1</Value></Parameter>text</Parameters></ExecuteCommand>", Silence},
    {"ExecuteTextBeforeTheFirstParameterDoesNotCount",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters>text"
        "<Parameter><Name>n</Name><Value>1</Value></Parameter></Parameters></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result><Parameters>"
        "<Parameter><Name>n</Name><Value>1</Value></Parameter></Parameters></CommandReply>"},
    {"ExecuteCdataAmongParametersCounts",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters>"
        "<Parameter><Name>n</Name></Parameter><![CDATA[x]]></Parameters></ExecuteCommand>", Silence},
    {"ExecuteSiblingWithoutNameSpoilsTheMessage",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters>"
        "<Parameter><Name>n</Name></Parameter><Foo/></Parameters></ExecuteCommand>", Silence},
    {"ExecuteFirstParameterWithoutName",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters>"
        "<Parameter><Value>v</Value></Parameter></Parameters></ExecuteCommand>", Silence},
    {"ExecuteLastParameterWithEmptyName",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters>"
        "<Parameter><Name>n</Name><Value>v</Value></Parameter>"
        "<Parameter><Name></Name><Value>v</Value></Parameter></Parameters></ExecuteCommand>", Silence},
    {"ExecuteSecondParametersElementIsIgnored",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters/><Parameters>"
        "<Parameter><Name>n</Name></Parameter></Parameters></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters/></CommandReply>"},
    {"ExecuteWithoutName", "<ExecuteCommand><Correlation>1</Correlation></ExecuteCommand>", Silence},
    {"ExecuteWithEmptyName", "<ExecuteCommand><Name/><Correlation>1</Correlation></ExecuteCommand>", Silence},
    {"ExecuteWithBlankName", "<ExecuteCommand><Name> </Name><Correlation>1</Correlation></ExecuteCommand>", Silence},
    {"ExecuteWithCdataName",
        "<ExecuteCommand><Name><![CDATA[Echo]]></Name><Correlation>1</Correlation></ExecuteCommand>", Silence},
    {"ExecuteWithoutCorrelation", "<ExecuteCommand><Name>Echo</Name></ExecuteCommand>", Silence},
    {"ExecuteWithEmptyCorrelation", "<ExecuteCommand><Name>Echo</Name><Correlation></Correlation></ExecuteCommand>", Silence},
    {"ExecuteNameAsAttribute", "<ExecuteCommand Name='Echo' Correlation='1'/>", Silence},
    {"ExecuteUnknownCommand", "<ExecuteCommand><Name>Nope</Name><Correlation>1</Correlation></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Nope</Name><Correlation>1</Correlation>"
        "<Result>Error: Invalid command name or command not valid for the host application.</Result>"
        "<Parameters/></CommandReply>"},
    {"ExecuteNamesAreComparedWithCase", "<ExecuteCommand><Name>echo</Name><Correlation>1</Correlation></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>echo</Name><Correlation>1</Correlation>"
        "<Result>Error: Invalid command name or command not valid for the host application.</Result>"
        "<Parameters/></CommandReply>"},
    {"ExecuteNameKeepsItsBlanks", "<ExecuteCommand><Name> Echo </Name><Correlation>1</Correlation></ExecuteCommand>",
        DECLARATION "<CommandReply><Name> Echo </Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters/></CommandReply>"},
    {"ExecuteNameAndCorrelationAreEchoedUndecodedIsKept",
        "<ExecuteCommand><Name>a&amp;b</Name><Correlation>c&lt;d</Correlation></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>a&amp;amp;b</Name><Correlation>c&amp;lt;d</Correlation><Result>OK</Result>"
        "<Parameters/></CommandReply>",
        DECLARATION "<CommandReply><Name>a&amp;b</Name><Correlation>c&lt;d</Correlation><Result>OK</Result>"
        "<Parameters/></CommandReply>"},
    {"ExecuteParameterNameIsNotDecodedIsKept",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters>"
        "<Parameter><Name>a&gt;b</Name><Value/></Parameter></Parameters></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters><Parameter><Name>a&amp;gt;b</Name><Value/></Parameter></Parameters></CommandReply>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters><Parameter><Name>a&gt;b</Name><Value/></Parameter></Parameters></CommandReply>"},
    {"ExecuteValueIsDecoded",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters><Parameter><Name>n</Name>"
        "<Value>&lt;a&gt; &quot;b&quot; &apos;c&apos; &amp;d</Value></Parameter></Parameters></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters><Parameter><Name>n</Name><Value>&lt;a&gt; &quot;b&quot; &apos;c&apos; &amp;d</Value>"
        "</Parameter></Parameters></CommandReply>"},
    {"ExecuteValueIsDecodedAmpersandLastAndTwiceWhereTranslatedIsKept",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters><Parameter><Name>n</Name>"
        "<Value>&amp;lt;&amp;amp;&amp;#65;</Value></Parameter></Parameters></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters><Parameter><Name>n</Name><Value>&amp;lt;&amp;amp;&amp;#65;</Value>"
        "</Parameter></Parameters></CommandReply>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters><Parameter><Name>n</Name><Value>&lt;&amp;&amp;#65;</Value>"
        "</Parameter></Parameters></CommandReply>"},
    {"ExecuteValueDecodingIsOnePassEach",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters><Parameter><Name>n</Name>"
        "<Value>&amp;quot;&amp;amp;amp;&amp;apos;&amp;gt;</Value></Parameter></Parameters></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters><Parameter><Name>n</Name><Value>&amp;quot;&amp;amp;amp;&amp;apos;&amp;gt;</Value>"
        "</Parameter></Parameters></CommandReply>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters><Parameter><Name>n</Name><Value>&quot;&amp;amp;&apos;&gt;</Value>"
        "</Parameter></Parameters></CommandReply>"},
    {"ExecuteValueWithOtherReferences",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters><Parameter><Name>n</Name>"
        "<Value>&#65;&#x42;&copy;&lt</Value></Parameter></Parameters></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters><Parameter><Name>n</Name><Value>&amp;#65;&amp;#x42;&amp;copy;&amp;lt</Value>"
        "</Parameter></Parameters></CommandReply>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters><Parameter><Name>n</Name><Value>AB&amp;copy;&amp;lt</Value>"
        "</Parameter></Parameters></CommandReply>"},
    {"ExecuteBadNumericReferenceIsMalformedOnlyWhereTranslated",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters><Parameter><Name>n</Name>"
        "<Value>&#x110000;</Value></Parameter></Parameters></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters><Parameter><Name>n</Name><Value>&amp;#x110000;</Value>"
        "</Parameter></Parameters></CommandReply>", Silence},
    {"ExecuteValueIsItsFirstText",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters><Parameter><Name>n</Name>"
        "<Value>one<b>x</b>two</Value></Parameter></Parameters></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters><Parameter><Name>n</Name><Value>one</Value></Parameter></Parameters></CommandReply>"},
    {"ExecuteValueInCdataIsEmpty",
        "<ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation><Parameters><Parameter><Name>n</Name>"
        "<Value><![CDATA[x]]></Value></Parameter></Parameters></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters><Parameter><Name>n</Name><Value/></Parameter></Parameters></CommandReply>"},
    {"ExecuteClosingTagsAreNotCompared",
        "<ExecuteCommand><Name>Echo</Foo><Correlation>1</></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters/></CommandReply>"},

    // Documents as a whole.
    {"Empty", "", Silence},
    {"WhiteSpace", " \r\n", Silence},
    {"NotXml", "hello", Silence},
    {"UnknownRoot", "<Foo/>", Silence},
    {"RootInAnotherCase", "<serverinformation/>", Silence},
    {"RootWithAPrefixOfTheName", "<Event>Event.A</Event>", Silence},
    {"RootWithALongerName", "<Eventss/>", Silence},
    {"RootBelowAnother", "<Foo><ServerInformation/></Foo>", Silence},
    {"TheServersOwnEvent", "<Event><Name>Event.A</Name><Parameters/></Event>", Silence},
    {"TheServersOwnReply", "<CommandReply><Name>Echo</Name><Correlation>1</Correlation></CommandReply>", Silence},
    {"Unclosed", "<ServerInformation>", Silence},
    {"TextAtTopLevel", "x<ServerInformation/>", Silence},
    {"TextBehindTheRoot", "<ServerInformation/>x", Silence},
    {"ByteOrderMark", "\xEF\xBB\xBF<ServerInformation/>", Silence},
    {"EverythingBehindAZeroIsIgnored", "<Events/>\0<"s,
        DECLARATION "<Events><Event>Event.B</Event><Event>Event.A</Event>"
        "<Event>Event&lt;&amp;&gt;&apos;&quot;</Event></Events>"},
    {"ZeroInsideAnElement", "<Events>\0</Events>"s, Silence},
    {"Doctype", "<!DOCTYPE Events [<!ENTITY a 'b'>]><Events/>",
        DECLARATION "<Events><Event>Event.B</Event><Event>Event.A</Event>"
        "<Event>Event&lt;&amp;&gt;&apos;&quot;</Event></Events>"},
    {"CommentsAndInstructions", "<!-- <Commands/> --><?foo <Commands/> ?><Events/><!-- -->",
        DECLARATION "<Events><Event>Event.B</Event><Event>Event.A</Event>"
        "<Event>Event&lt;&amp;&gt;&apos;&quot;</Event></Events>"},
    {"MismatchedEndTag", "<Events>1</Foo>",
        DECLARATION "<Events><Event>Event.B</Event><Event>Event.A</Event>"
        "<Event>Event&lt;&amp;&gt;&apos;&quot;</Event></Events>"},
    {"SeveralRootsGoByTheOrderOfTheTable", "<Events/><EventInformation>x</EventInformation>",
        DECLARATION "<EventInformation><Name/><Description/><Parameters/></EventInformation>"},
    {"SeveralRootsTheFirstParserThatTakesItWins", "<Events/><ServerInformation/><ExecuteCommand/>",
        DECLARATION "<ServerInformation><StreamVersion major=\"1\" minor=\"0\"/></ServerInformation>"},
    {"SeveralRootsExecuteComesFirst",
        "<ServerInformation/><Events/><ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation></ExecuteCommand>",
        DECLARATION "<CommandReply><Name>Echo</Name><Correlation>1</Correlation><Result>OK</Result>"
        "<Parameters/></CommandReply>"},
    {"SeveralRootsCommandsBeforeCommandInformation",
        "<CommandInformation><Correlation>c</Correlation><Name>Bare</Name></CommandInformation><Commands/>",
        DECLARATION "<CommandInformation><Correlation>c</Correlation><Name>Bare</Name><Description/>"
        "<InputParameters/><ReplyParameters/></CommandInformation>"},
    {"TheFirstOfTwoEqualRootsCounts",
        "<ExecuteCommand/><ExecuteCommand><Name>Echo</Name><Correlation>1</Correlation></ExecuteCommand>", Silence},
};
// clang-format on

class WireMessages : public testing::TestWithParam<std::tuple<VServerMode, VMessageCase>>
{
};

TEST_P(WireMessages, GetExactlyTheirReply)
{
    const auto& [mode, message] = GetParam();
    VRunningServer running(mode);
    Populate(*running.Dispatcher);
    VRawClient client(running.Socket->Port());
    const char* expected = mode.TranslateEntities && message.TranslatedReply != TheSame
                               ? message.TranslatedReply
                               : message.Reply;

    client.SendFrame(message.Request);
    client.SendFrame(Marker);

    if (expected != Silence) {
        EXPECT_EQ(expected, client.ReadFrame());
    }
    EXPECT_EQ(MarkerReply, client.ReadFrame());
    EXPECT_FALSE(client.IsReadable());
    if (expected == Silence) {
        EXPECT_EQ(1U, running.Dispatcher->Executed().size()); // the marker, nothing else was run
    }
}

INSTANTIATE_TEST_SUITE_P(Table, WireMessages,
                         testing::Combine(testing::ValuesIn(serverModes),
                                          testing::ValuesIn(messageCases)),
                         [](const auto& parameters) {
                             return std::string(std::get<0>(parameters.param).Name) + "_" +
                                    std::get<1>(parameters.param).Name;
                         });

} // namespace
