#include "RunningServer.h"

#include <gtest/gtest.h>

#include <climits>
#include <string>
#include <utility>
#include <vector>

// What goes over the wire, as literal texts: each request is sent as a frame over a real socket,
// and each reply compared byte by byte.

namespace {

using namespace std::string_literals;
using TestSupport::VFakeControlSystem;
using TestSupport::VRawClient;

const char* const Silence = nullptr;
const char* const TheSame = "";

#define DECLARATION "<?xml version=\"1.0\" encoding=\"UTF-16\" standalone=\"no\"?>"

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

const VServerMode modes[] = {
    {"AsThePlugInSetsIt", false, false},
    {"OnItsOwnPostalService", false, true},
    {"TranslatingEntities", true, false},
    {"TranslatingEntitiesOnItsOwnPostalService", true, true},
};

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
                         testing::Combine(testing::ValuesIn(modes),
                                          testing::ValuesIn(messageCases)),
                         [](const auto& parameters) {
                             return std::string(std::get<0>(parameters.param).Name) + "_" +
                                    std::get<1>(parameters.param).Name;
                         });

struct VResultCase
{
    std::int32_t Code;
    const char* Text;
};

// clang-format off
const VResultCase resultCases[] = {
    {INT_MIN, "Error: Unknown return code"},
    {-1, "Error: Unknown return code"},
    {0, "Error: System Error"},
    {1, "OK"},
    {2, "Error: Invalid command name or command not valid for the host application."},
    {3, "Error: Invalid event name or event not valid for the host application."},
    {4, "Error: Invalid Parameter Name"},
    {5, "Error: Invalid Parameter Value"},
    {6, "Error: System Error"},
    {7, "Error: Subject name is invalid or the subject is not currently loaded in to the workspace."},
    {8, "Error: Marker name is not valid for the specified subject."},
    {9, "Error: Frame number specified is not in the range of valid frames for the loaded trial."},
    {10, "Error: Unable to access requested data."},
    {11, "Error: Data update failed, the number of frames/samples provided does not match the existing data."},
    {12, "Error: Data update failed, the number of components provided does not match the existing data."},
    {13, "Error: Unable to create new subject parameter."},
    {14, "Error: Unable to create new subject parameter, parameter already exists."},
    {15, "Error: Unable to modify read only data."},
    {16, "Error: Unable to create new model output."},
    {17, "Error: Unable to create new model output - a model output with that name already exists."},
    {18, "Error: At least one component must be specified."},
    {19, "Error: Invalid component definition."},
    {20, "Error: Application can not be in Live mode."},
    {21, "Error: Unable to complete request, a pipeline is running."},
    {22, "Error: Unable to locate pipeline, or the pipeline is invalid."},
    {23, "Error: Unable to locate the requested device."},
    {24, "Error: Device improperly configured or lacks supporting components."},
    {25, "Error: Unable to locate the requested device output."},
    {26, "Error: Unable to locate the requested device channel."},
    {27, "Error: Skeleton type must be either Labeling or Solving."},
    {28, "Error: Bone name is not valid for the specified skeleton."},
    {29, "Error: Constraint name is not valid for the specified skeleton."},
    {30, "Error: Invalid import type."},
    {31, "Error: Object not found."},
    {32, "Error: Attribute not found."},
    {33, "Error: Channel not found."},
    {34, "Error: Parameter not found."},
    {35, "Error: Failed to execute KSL command text."},
    {36, "Error: Invalid Object Type"},
    {37, "Error: Maximum number of NLE objects has been reached. Unable to create any more."},
    {38, "Error: Object already exists. Can&apos;t create more than one object of this type."},
    {39, "Error: Unable to remove QXDevices while running in Real Time."},
    {40, "Error: Unable to create node. No active project in the database."},
    {41, "Error: Unable to create node. No active capture day."},
    {42, "Error: Unable to change parameter value while capture is in progress."},
    {43, "Error: Not enough points for spline fit."},
    {44, "Error: Unknown return code"},
    {45, "Error: Unknown return code"},
    {46, "Error: An unknown error occurred."},
    {47, "Error: Unknown return code"},
    {INT_MAX, "Error: Unknown return code"},
};
// clang-format on

TEST(ResultCodes, GoOnTheWireAsTheirTexts)
{
    VRunningServer running;
    for (const VResultCase& result : resultCases) {
        running.Dispatcher->Commands[L"Fail" + std::to_wstring(result.Code)] =
            VFakeControlSystem::FailWith(result.Code);
    }
    VRawClient client(running.Socket->Port());

    for (const VResultCase& result : resultCases) {
        const std::string name = "Fail" + std::to_string(result.Code);
        EXPECT_EQ(DECLARATION "<CommandReply><Name>" + name +
                      "</Name><Correlation>c</Correlation><Result>" + result.Text +
                      "</Result><Parameters/></CommandReply>",
                  client.Request("<ExecuteCommand><Name>" + name +
                                 "</Name><Correlation>c</Correlation></ExecuteCommand>"));
    }
}

struct VFrameExchange
{
    const char* Name;
    std::string Request;
    std::string Reply;
};

// Header and text are separate literals: in one, "\x31<" might be read on as an escape.
// clang-format off
const VFrameExchange frameExchanges[] = {
    {"ServerInformation", "\x14\x00\x00\x00" "<ServerInformation/>"s,
        "\x82\x00\x00\x00" DECLARATION
        "<ServerInformation><StreamVersion major=\"1\" minor=\"0\"/></ServerInformation>"s},
    {"Commands", "\x31\x00\x00\x00" "<Commands><Correlation>1</Correlation></Commands>"s,
        "\x7C\x00\x00\x00" DECLARATION
        "<Correlation>1</Correlation><Commands><Command>C</Command></Commands>"s},
    {"CommandInformation", "\x53\x00\x00\x00"
        "<CommandInformation><Correlation>1</Correlation><Name>X</Name></CommandInformation>"s,
        "\xD4\x00\x00\x00" DECLARATION
        "<CommandInformation><Correlation>1</Correlation><Name/><Description>Command not found.</Description>"
        "<InputParameters/><ReplyParameters/></CommandInformation>"s},
    {"EventInformation", "\x26\x00\x00\x00" "<EventInformation>E</EventInformation>"s,
        "\x7E\x00\x00\x00" DECLARATION
        "<EventInformation><Name/><Description/><Parameters/></EventInformation>"s},
    {"Events", "\x09\x00\x00\x00" "<Events/>"s,
        "\x58\x00\x00\x00" DECLARATION "<Events><Event>E</Event></Events>"s},
    {"ExecuteCommand", "\x9A\x00\x00\x00"
        "<ExecuteCommand><Name>C</Name><Correlation>1</Correlation><Parameters><Parameter><Name>n</Name>"
        "<Value>\xC3\xA9</Value></Parameter></Parameters></ExecuteCommand>"s,
        "\xE0\x00\x00\x00" DECLARATION
        "<CommandReply><Name>C</Name><Correlation>1</Correlation><Result>OK</Result><Parameters><Parameter>"
        "<Name>n</Name><Value>\xC3\xA9</Value></Parameter></Parameters></CommandReply>"s},
};
// clang-format on

TEST(WireFrames, AreTheseBytesForEachMessage)
{
    VRunningServer running;
    running.Dispatcher->CommandNames = {L"C"};
    running.Dispatcher->EventNames = {L"E"};
    running.Dispatcher->Commands[L"C"] = &VFakeControlSystem::Echo;
    VRawClient client(running.Socket->Port());

    for (const VFrameExchange& exchange : frameExchanges) {
        client.Send(exchange.Request);
        EXPECT_EQ(exchange.Reply, client.ReadBytes(exchange.Reply.size())) << exchange.Name;
    }
}

TEST(WireFrames, AreTheseBytesForAnEvent)
{
    VRunningServer running;
    VRawClient client = running.Connect();

    running.Fire(L"E");
    running.Dispatcher->FireEvent(L"E", ControlSystem::IParameters());

    EXPECT_EQ("\xA2\x00\x00\x00" DECLARATION
              "<Event><Name>E</Name><Parameters><Parameter><Name>P</Name><Value>1</Value>"
              "</Parameter></Parameters></Event>"
              "\x61\x00\x00\x00" DECLARATION "<Event><Name>E</Name><Parameters/></Event>"s,
              client.ReadBytes(4 + 162 + 4 + 97));
}

/// The server answers the same wherever the stream is cut into segments.
TEST(WireFrames, MayBeCutAtEveryByte)
{
    VRunningServer running;
    running.Dispatcher->CommandNames = {L"C"};
    running.Dispatcher->EventNames = {L"E"};
    running.Dispatcher->Commands[L"C"] = &VFakeControlSystem::Echo;
    std::string stream;
    std::string replies;
    for (const VFrameExchange& exchange : frameExchanges) {
        stream += exchange.Request;
        replies += exchange.Reply;
    }
    VRawClient other = running.Connect();

    for (std::size_t cut = 0; cut <= stream.size(); ++cut) {
        VRawClient client(running.Socket->Port());
        client.Send(stream.substr(0, cut));
        VRunningServer::Fence(other); // the first part has been read by now
        client.Send(stream.substr(cut));
        ASSERT_EQ(replies, client.ReadBytes(replies.size())) << "cut at " << cut;
    }
}

TEST(WireFrames, MayComeOneByteAtATime)
{
    VRunningServer running;
    running.Dispatcher->CommandNames = {L"C"};
    running.Dispatcher->EventNames = {L"E"};
    running.Dispatcher->Commands[L"C"] = &VFakeControlSystem::Echo;
    VRawClient client(running.Socket->Port());

    for (const VFrameExchange& exchange : frameExchanges) {
        for (const char byte : exchange.Request) {
            client.Send(std::string(1, byte));
        }
        EXPECT_EQ(exchange.Reply, client.ReadBytes(exchange.Reply.size())) << exchange.Name;
    }
}

// Characters in every place of a request whose text comes back in the reply.

struct VCharacterCase
{
    const char* Name;
    std::string Sent;
    std::string Returned;
};

void PrintTo(const VCharacterCase& character, std::ostream* out)
{
    *out << character.Name;
}

// clang-format off
const VCharacterCase characterCases[] = {
    {"E9", "\xC3\xA9", "\xC3\xA9"},
    {"LowByteOfLessThan", "\xC4\xBC", "\xC4\xBC"},                       // U+013C
    {"Cyrillic", "\xD0\xBC", "\xD0\xBC"},                               // U+043C
    {"CyrillicLowByteOfBlank", "\xD0\xA0", "\xD0\xA0"},                 // U+0420
    {"LowByteOfZero", "\xC4\x80", "\xC4\x80"},                          // U+0100
    {"Han", "\xE4\xB8\x80", "\xE4\xB8\x80"},                            // U+4E00
    {"Emoji", "\xF0\x9F\x98\x80", "\xF0\x9F\x98\x80"},                  // U+1F600
    {"LastCodePoint", "\xF4\x8F\xBF\xBF", "\xF4\x8F\xBF\xBF"},          // U+10FFFF
    {"NonCharacter", "\xEF\xBF\xBF", "\xEF\xBF\xBF"},                   // U+FFFF
    {"ByteOrderMark", "\xEF\xBB\xBF", "\xEF\xBB\xBF"},                  // U+FEFF
    {"ControlCharacter", "\x01\x1F", "\x01\x1F"},
    {"InvalidByte", "\xFF", "\xEF\xBF\xBD"},
    {"CutSequence", "\xF0\x9F\x98", "\xEF\xBF\xBD"},
    {"Overlong", "\xC0\x80", "\xEF\xBF\xBD\xEF\xBF\xBD"},
    {"LoneSurrogate", "\xED\xA0\x80", "\xEF\xBF\xBD\xEF\xBF\xBD\xEF\xBF\xBD"},
    {"BeyondTheLastCodePoint", "\xF4\x90\x80\x80", "\xEF\xBF\xBD\xEF\xBF\xBD\xEF\xBF\xBD\xEF\xBF\xBD"},
};
// clang-format on

class WireCharacters : public testing::TestWithParam<std::tuple<VServerMode, VCharacterCase>>
{
protected:
    static std::string Surround(const std::string& text) { return "x" + text + text + "y"; }

    const std::string sent = Surround(std::get<1>(GetParam()).Sent);
    const std::string returned = Surround(std::get<1>(GetParam()).Returned);
};

TEST_P(WireCharacters, ComeBackFromEveryPlaceOfAnExecution)
{
    VRunningServer running(std::get<0>(GetParam()));
    VRawClient client(running.Socket->Port());
    const auto request = [](const std::string& name, const std::string& text) {
        return "<ExecuteCommand><Name>" + name + "</Name><Correlation>" + text +
               "</Correlation><Parameters><Parameter><Name>" + text + "</Name><Value>" + text +
               "</Value></Parameter></Parameters></ExecuteCommand>";
    };
    running.Dispatcher->Commands[L"Echo"] = &VFakeControlSystem::Echo;

    EXPECT_EQ(DECLARATION "<CommandReply><Name>Echo</Name><Correlation>" + returned +
                  "</Correlation><Result>OK</Result><Parameters><Parameter><Name>" + returned +
                  "</Name><Value>" + returned + "</Value></Parameter></Parameters></CommandReply>",
              client.Request(request("Echo", sent)));
    EXPECT_EQ(DECLARATION "<CommandReply><Name>" + returned + "</Name><Correlation>" + returned +
                  "</Correlation><Result>Error: Invalid command name or command not valid for the "
                  "host application.</Result><Parameters/></CommandReply>",
              client.Request(request(sent, sent)));
}

TEST_P(WireCharacters, ComeBackFromDiscovery)
{
    VRunningServer running(std::get<0>(GetParam()));
    VRawClient client(running.Socket->Port());

    EXPECT_EQ(DECLARATION "<Correlation>" + returned + "</Correlation><Commands/>",
              client.Request("<Commands><Correlation>" + sent + "</Correlation></Commands>"));
    EXPECT_EQ(DECLARATION "<CommandInformation><Correlation>" + returned +
                  "</Correlation><Name/><Description>Command not found.</Description>"
                  "<InputParameters/><ReplyParameters/></CommandInformation>",
              client.Request("<CommandInformation><Correlation>" + sent + "</Correlation><Name>" +
                             sent + "</Name></CommandInformation>"));
    EXPECT_EQ(DECLARATION "<EventInformation><Name/><Description/><Parameters/></EventInformation>",
              client.Request("<EventInformation>" + sent + "</EventInformation>"));
}

TEST_P(WireCharacters, AreIgnoredInNamesAndAttributes)
{
    VRunningServer running(std::get<0>(GetParam()));
    VRawClient client(running.Socket->Port());

    EXPECT_EQ(DECLARATION "<Events/>",
              client.Request("<?" + sent + "?><!--" + sent + "--><" + sent + "/><Events " + sent +
                             "='" + sent + "' b=\"" + sent + "\"><" + sent + ">" + sent + "</" +
                             sent + "><![CDATA[" + sent + "]]></Events>"));
}

INSTANTIATE_TEST_SUITE_P(Table, WireCharacters,
                         testing::Combine(testing::ValuesIn(modes),
                                          testing::ValuesIn(characterCases)),
                         [](const auto& parameters) {
                             return std::string(std::get<0>(parameters.param).Name) + "_" +
                                    std::get<1>(parameters.param).Name;
                         });

// Lists, records, events and replies of the dispatcher, with what XML and UTF-8 make special.

TEST(WireReplies, EscapeAndEncodeWhatTheDispatcherGives)
{
    VRunningServer running;
    // A host's literal of this compiler holds the emoji as one element, a provider as two.
    const std::wstring name = L"<&>'\"\u013C\u4E00\U0001F600\xD83D\xDE00\xD800";
    const std::string wire = "&lt;&amp;&gt;&apos;&quot;\xC4\xBC\xE4\xB8\x80\xF0\x9F\x98\x80"
                             "\xF0\x9F\x98\x80\xEF\xBF\xBD";
    running.Dispatcher->CommandNames = {name, L""};
    running.Dispatcher->EventNames = {name, L""};
    ControlSystem::ICommandInformation command;
    command.Name = name;
    command.Description = name;
    command.InputParameters = {{name, name}};
    running.Dispatcher->CommandInformation[L"C"] = command;
    ControlSystem::IEventInformation event;
    event.Name = name;
    event.Description = name;
    event.Parameters = {{name, name}};
    running.Dispatcher->EventInformation[L"E"] = event;
    VRawClient client = running.Connect();

    EXPECT_EQ(DECLARATION "<Correlation>1</Correlation><Commands><Command>" + wire +
                  "</Command><Command/></Commands>",
              client.Request("<Commands><Correlation>1</Correlation></Commands>"));
    EXPECT_EQ(DECLARATION "<Events><Event>" + wire + "</Event><Event/></Events>",
              client.Request("<Events/>"));
    EXPECT_EQ(DECLARATION "<CommandInformation><Correlation>1</Correlation><Name>" + wire +
                  "</Name><Description>" + wire +
                  "</Description><InputParameters><Parameter><Name>" + wire + "</Name><Value>" +
                  wire +
                  "</Value></Parameter></InputParameters><ReplyParameters/></CommandInformation>",
              client.Request("<CommandInformation><Correlation>1</Correlation><Name>C</Name>"
                             "</CommandInformation>"));
    EXPECT_EQ(DECLARATION "<EventInformation><Name>" + wire + "</Name><Description>" + wire +
                  "</Description><Parameters><Parameter><Name>" + wire + "</Name><Description>" +
                  wire + "</Description></Parameter></Parameters></EventInformation>",
              client.Request("<EventInformation>E</EventInformation>"));
    running.Fire(name, name);
    EXPECT_EQ(DECLARATION "<Event><Name>" + wire +
                  "</Name><Parameters><Parameter><Name>P</Name><Value>" + wire +
                  "</Value></Parameter></Parameters></Event>",
              client.ReadFrame());
}

TEST(WireReplies, OfAnEmptySystemAreInShortForm)
{
    VRunningServer running;
    VRawClient client(running.Socket->Port());

    EXPECT_EQ(DECLARATION "<Correlation>1</Correlation><Commands/>",
              client.Request("<Commands><Correlation>1</Correlation></Commands>"));
    EXPECT_EQ(DECLARATION "<Events/>", client.Request("<Events/>"));
}

TEST(WireReplies, AskTheListsWithTheArgumentZero)
{
    VRunningServer running;
    VRawClient client(running.Socket->Port());

    client.Request("<Commands><Correlation>1</Correlation></Commands>");
    client.Request("<Events/>");

    EXPECT_EQ((std::vector<int>{0, 0}), running.Dispatcher->ListArguments());
}

TEST(WireReplies, OfAFailureHoldNoParametersWhateverTheProviderWrote)
{
    VRunningServer running;
    running.Dispatcher->Commands[L"Fail"] = VFakeControlSystem::FailWith(15);
    VRawClient client(running.Socket->Port());

    EXPECT_EQ(DECLARATION "<CommandReply><Name>Fail</Name><Correlation>1</Correlation>"
                          "<Result>Error: Unable to modify read only data.</Result><Parameters/>"
                          "</CommandReply>",
              client.Request("<ExecuteCommand><Name>Fail</Name><Correlation>1</Correlation>"
                             "<Parameters><Parameter><Name>n</Name><Value>v</Value></Parameter>"
                             "</Parameters></ExecuteCommand>"));
}

TEST(WireExecution, HandsTheProviderDecodedValuesAndUndecodedNames)
{
    VRunningServer running;
    VRawClient client(running.Socket->Port());

    client.Request("<ExecuteCommand><Name>a&lt;b</Name><Correlation>c</Correlation><Parameters>"
                   "<Parameter><Name>n&amp;</Name><Value>a&lt;b&amp;lt;</Value></Parameter>"
                   "<Parameter><Name>\xF0\x9F\x98\x80</Name><Value/></Parameter>"
                   "</Parameters></ExecuteCommand>");

    const std::vector<VFakeControlSystem::VExecuted> expected = {
        {L"a&lt;b", {{L"n&amp;", L"a<b&lt;"}, {L"\xD83D\xDE00", L""}}}};
    EXPECT_EQ(expected, running.Dispatcher->Executed());
}

TEST(WireExecution, ExpandsNumericReferencesToBytesOnlyWhereTranslated)
{
    VRunningServer running({"", true, false});
    VRawClient client(running.Socket->Port());

    client.Request("<ExecuteCommand><Name>C</Name><Correlation>c</Correlation><Parameters>"
                   "<Parameter><Name>n</Name><Value>&#65;&#x1F600;</Value></Parameter>"
                   "</Parameters></ExecuteCommand>");

    const std::vector<VFakeControlSystem::VExecuted> expected = {
        {L"C", {{L"n", L"A\xF0\x9F\x98\x80"}}}};
    EXPECT_EQ(expected, running.Dispatcher->Executed());
}

} // namespace
