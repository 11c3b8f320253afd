#include "ControlStreamClient/Lint.h"

#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserCommandInformation.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserCommandList.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserEventInformation.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserEventList.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserExecuteCommand.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserServerInformation.h"
#include "QuorixPluginControlStreamServer/FakeConnection.h"
#include "support/FakeControlSystem.h"
#include "utils/WideText.h"

#include <filesystem>
#include <fstream>
#include <iterator>

#include <gmock/gmock.h>

namespace {

using ControlStream::LintRequest;
using testing::ElementsAre;
using testing::IsEmpty;
using namespace std::string_literals;

/// Whether the parsers of the server itself take the text.
bool HostTakes(const std::string& text)
{
    using namespace ControlStreamServer;
    const auto dispatcher = std::make_shared<TestSupport::VFakeControlSystem>();
    const std::vector<std::shared_ptr<IMessageParser>> parsers = {
        std::make_shared<VMessageParserExecuteCommand>(dispatcher),
        std::make_shared<VMessageParserServerInformation>(),
        std::make_shared<VMessageParserCommandList>(dispatcher),
        std::make_shared<VMessageParserCommandInformation>(dispatcher),
        std::make_shared<VMessageParserEventInformation>(dispatcher),
        std::make_shared<VMessageParserEventList>(dispatcher),
    };
    const auto connection = std::make_shared<VFakeConnection>();
    for (const auto& parser : parsers) {
        if (parser->Parse(connection, KVR::Utf8ToWide(text), false)) {
            return true;
        }
    }
    return false;
}

std::string Run(const std::string& inside)
{
    return "<ExecuteCommand><Name>Go</Name><Correlation>1</Correlation>" + inside +
           "</ExecuteCommand>";
}

std::string RunWith(const std::string& parameters)
{
    return Run("<Parameters>" + parameters + "</Parameters>");
}

const std::string p = "<Parameter><Name>p</Name><Value>1</Value></Parameter>";

struct VRefusalCase
{
    const char* Name;
    std::string Text;
    std::string Refusal;
};

class LintRefusal : public testing::TestWithParam<VRefusalCase>
{
};

TEST_P(LintRefusal, SaysWhyTheHostDropsIt)
{
    EXPECT_EQ(GetParam().Refusal, LintRequest(GetParam().Text).Refusal);
    EXPECT_FALSE(HostTakes(GetParam().Text)) << "the server itself takes it";
}

const std::string unknown =
    "none of the elements that a host knows is there: ExecuteCommand, "
    "ServerInformation, Commands, CommandInformation, EventInformation, Events";
const std::string unreadable = "it is no XML that the host can read";

std::string Deep(int levels)
{
    std::string text;
    for (int i = 0; i < levels; ++i) {
        text += "<Events>";
    }
    return text;
}

// clang-format off
const VRefusalCase refusalCases[] = {
    {"Nothing", "", unknown},
    {"NoXml", "Hello", unreadable},
    {"Unclosed", "<Events", unreadable},
    {"Foo", "<Foo/>", unknown},
    {"WrongCase", "<events/>", unknown},
    {"ByteOrderMark", "\xEF\xBB\xBF<Events/>", "it begins with a byte-order mark, which a host takes for text"},
    {"OnlyAZero", "\0<Events/>"s, unknown},
    {"TooDeep", Deep(1001), "its elements lie more than 1000 deep"},
    {"CommandWithoutName", "<ExecuteCommand><Correlation>1</Correlation></ExecuteCommand>", "ExecuteCommand has no Name"},
    {"CommandWithEmptyName", "<ExecuteCommand><Name/><Correlation>1</Correlation></ExecuteCommand>",
     "ExecuteCommand has an empty Name (white space alone and CDATA count as empty)"},
    {"CommandWithBlankName", "<ExecuteCommand><Name> </Name><Correlation>1</Correlation></ExecuteCommand>",
     "ExecuteCommand has an empty Name (white space alone and CDATA count as empty)"},
    {"CommandWithNameAsCdata", "<ExecuteCommand><Name><![CDATA[Go]]></Name><Correlation>1</Correlation></ExecuteCommand>",
     "ExecuteCommand has an empty Name (white space alone and CDATA count as empty)"},
    {"CommandWithNameAsAttribute", "<ExecuteCommand Name='Go'><Correlation>1</Correlation></ExecuteCommand>", "ExecuteCommand has no Name"},
    {"CommandWithoutCorrelation", "<ExecuteCommand><Name>Go</Name></ExecuteCommand>", "ExecuteCommand has no Correlation"},
    {"ParameterWithoutName", RunWith(p + "<Parameter><Value>1</Value></Parameter>"),
     "ExecuteCommand has a parameter that has no Name (entry 2)"},
    {"ParameterWithEmptyName", RunWith("<Parameter><Name></Name></Parameter>"),
     "ExecuteCommand has a parameter that has an empty Name (white space alone and CDATA count as empty) (entry 1)"},
    {"TextBetweenParameters", RunWith(p + "and" + p),
     "ExecuteCommand has text between its parameters, which the host takes for a parameter without a name (entry 2)"},
    {"CommandsWithoutCorrelation", "<Commands/>", "Commands has no Correlation"},
    {"CorrelationBesideCommands", "<Correlation>1</Correlation><Commands/>", "Commands has no Correlation"},
    {"InformationWithoutName", "<CommandInformation><Correlation>1</Correlation></CommandInformation>", "CommandInformation has no Name"},
    {"InformationWithoutCorrelation", "<CommandInformation><Name>Go</Name></CommandInformation>", "CommandInformation has no Correlation"},
    {"EventInformationWithName", "<EventInformation><Name>E</Name></EventInformation>",
     "EventInformation has a Name, but the event's name must be its own text"},
    {"EmptyEventInformation", "<EventInformation/>", "EventInformation has no text: the event's name"},
    {"TwoFaults", "<ExecuteCommand/><Commands/>", "ExecuteCommand has no Name; Commands has no Correlation"},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, LintRefusal, testing::ValuesIn(refusalCases),
                         [](const auto& named) { return std::string(named.param.Name); });

struct VWarningCase
{
    const char* Name;
    std::string Text;
    std::vector<std::string> Warnings;
};

class LintWarning : public testing::TestWithParam<VWarningCase>
{
};

TEST_P(LintWarning, ComesWithWhatTheHostAnswers)
{
    const ControlStream::VLintReport report = LintRequest(GetParam().Text);

    EXPECT_EQ("", report.Refusal);
    EXPECT_EQ(GetParam().Warnings, report.Warnings);
    EXPECT_TRUE(HostTakes(GetParam().Text)) << "the server itself drops it";
}

// clang-format off
const VWarningCase warningCases[] = {
    {"Plain", RunWith(p), {}},
    {"WithoutParameters", Run(""), {}},
    {"EmptyParameters", Run("<Parameters/>"), {}},
    {"Indented", "<ExecuteCommand>\n <Name>Go</Name>\n <Correlation>1</Correlation>\n</ExecuteCommand>\n", {}},
    {"AnyServerInformation", "<ServerInformation>x<y/></ServerInformation>", {}},
    {"EventsWithContent", "<Events>x</Events>", {}},
    {"EventInformation", "<EventInformation>E</EventInformation>", {}},
    {"TheFirstThatIsWhole", "<ExecuteCommand/><Events/>", {}},
    {"Attribute", "<Events a='1'/>", {"attributes are not looked at"}},
    {"BehindAZero", "<Events/>\0<x"s, {"what stands behind the first zero is not looked at"}},
    {"NotUtf8", "<EventInformation>\xFF</EventInformation>", {"bytes that are not UTF-8 arrive as U+FFFD"}},
    {"GivenTwice", RunWith(p + p), {"the parameter p is given twice, and the later value counts"}},
    {"OtherElement", RunWith(p + "<Foo><Name>q</Name></Foo>"),
     {"the element Foo counts as a parameter, as everything behind the first Parameter does"}},
    {"NoParameter", RunWith("<Foo/>"), {"Parameters holds no Parameter, and so the command runs without any"}},
    {"OutsideParameters", Run(p), {"a Parameter outside of Parameters is not looked at"}},
    {"CdataValue", RunWith("<Parameter><Name>p</Name><Value><![CDATA[1]]></Value></Parameter>"),
     {"the value of the parameter p is read as empty: CDATA and elements are no value"}},
    {"EntityInName", "<CommandInformation><Correlation>1</Correlation><Name>a&lt;b</Name></CommandInformation>",
     {"\"a&lt;b\" is taken as it stands: entities are decoded in the Value of a parameter only"}},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, LintWarning, testing::ValuesIn(warningCases),
                         [](const auto& named) { return std::string(named.param.Name); });

/// Every seed of the fuzz target for the server's parsers, and what it becomes by losing bytes.
TEST(Lint, AgreesWithTheServerOnAllThatFuzzingBeganWith)
{
    int compared = 0;
    for (const auto& entry : std::filesystem::directory_iterator(MESSAGE_PARSERS_CORPUS)) {
        std::ifstream file(entry.path(), std::ios::binary);
        const std::string input{std::istreambuf_iterator<char>(file), {}};
        const std::string text = input.substr(std::min<std::size_t>(1, input.size()));
        for (std::size_t size = text.size() + 1; size-- > 0 && text.size() - size < 400;) {
            const std::string part = text.substr(0, size);
            ++compared;
            ASSERT_EQ(HostTakes(part), LintRequest(part).Refusal.empty()) << part;
        }
    }
    EXPECT_GT(compared, 1000);
}

} // namespace
