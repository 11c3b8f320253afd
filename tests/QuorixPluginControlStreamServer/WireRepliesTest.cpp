#include "WireText.h"

#include <gtest/gtest.h>

#include <climits>
#include <string>
#include <tuple>
#include <vector>

// Results, special characters, and what the dispatcher gives and gets.

namespace {

using TestSupport::VFakeControlSystem;
using TestSupport::VRawClient;

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
                         testing::Combine(testing::ValuesIn(serverModes),
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
