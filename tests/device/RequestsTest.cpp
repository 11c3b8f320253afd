#include "ControlStreamClient/Requests.h"

#include "ControlStreamClient/Error.h"

#include <functional>

#include <gmock/gmock.h>

namespace {

using ControlStream::EErrorKind;
using ControlStream::MakeCommandInformationRequest;
using ControlStream::MakeCommandsRequest;
using ControlStream::MakeEventInformationRequest;
using ControlStream::MakeExecuteCommandRequest;
using ControlStream::VError;
using ControlStream::VParameters;
using namespace std::string_literals;

TEST(Requests, AreTheTextsThatHostsKnow)
{
    EXPECT_EQ("<ServerInformation/>", ControlStream::MakeServerInformationRequest());
    EXPECT_EQ("<Commands><Correlation>7</Correlation></Commands>", MakeCommandsRequest("7"));
    EXPECT_EQ("<CommandInformation><Correlation>7</Correlation><Name>Host.Echo</Name>"
              "</CommandInformation>",
              MakeCommandInformationRequest("7", "Host.Echo"));
    EXPECT_EQ("<Events/>", ControlStream::MakeEventsRequest());
    EXPECT_EQ("<EventInformation>Event.Authorize</EventInformation>",
              MakeEventInformationRequest("Event.Authorize"));
}

TEST(Requests, CommandWithoutParametersBearsNoList)
{
    EXPECT_EQ("<ExecuteCommand><Name>Go</Name><Correlation>7</Correlation></ExecuteCommand>",
              MakeExecuteCommandRequest("7", "Go", {}));
}

TEST(Requests, ParametersStandInTheirOrderAndMayBeEmptyOrGivenTwice)
{
    EXPECT_EQ("<ExecuteCommand><Name>Go</Name><Correlation>7</Correlation><Parameters>"
              "<Parameter><Name>b</Name><Value>1</Value></Parameter>"
              "<Parameter><Name>a</Name><Value></Value></Parameter>"
              "<Parameter><Name>b</Name><Value>2</Value></Parameter>"
              "</Parameters></ExecuteCommand>",
              MakeExecuteCommandRequest("7", "Go", {{"b", "1"}, {"a", ""}, {"b", "2"}}));
}

TEST(Requests, DeliberateNamesTravelAsTheyStandSinceTheHostDecodesValuesOnly)
{
    EXPECT_EQ("<ExecuteCommand><Name>a&b>'\"</Name><Correlation>&amp;</Correlation><Parameters>"
              "<Parameter><Name>c&d</Name><Value>&amp;</Value></Parameter>"
              "</Parameters></ExecuteCommand>",
              MakeExecuteCommandRequest("&amp;", "a&b>'\"", {{"c&d", "&"}}));
    EXPECT_EQ("<EventInformation>a&b</EventInformation>", MakeEventInformationRequest("a&b"));
}

struct VValueCase
{
    const char* Name;
    std::string Value;
    std::string Encoded;
};

class RequestValue : public testing::TestWithParam<VValueCase>
{
};

TEST_P(RequestValue, IsEncodedSoThatTheHostDecodesItBack)
{
    EXPECT_EQ("<ExecuteCommand><Name>n</Name><Correlation>c</Correlation><Parameters>"
              "<Parameter><Name>p</Name><Value>" +
                  GetParam().Encoded + "</Value></Parameter></Parameters></ExecuteCommand>",
              MakeExecuteCommandRequest("c", "n", {{"p", GetParam().Value}}));
}

// clang-format off
const VValueCase valueCases[] = {
    {"Plain", "0.5", "0.5"},
    {"Brackets", "a<b>c", "a&lt;b&gt;c"},
    {"Ampersand", "a&b", "a&amp;b"},
    {"EntityOfABracket", "&lt;", "&amp;lt;"},
    {"EntityOfAnAmpersand", "&amp;lt;", "&amp;amp;lt;"},
    {"QuotesStay", "'\"", "'\""},
    {"BlanksAroundStay", " a ", " a "},
    {"LinesAndTabsStay", "a\r\n\tb", "a\r\n\tb"},
    {"OtherScriptsStay", "\xD0\xBC \xE4\xB8\x80 \xF0\x9F\x98\x80", "\xD0\xBC \xE4\xB8\x80 \xF0\x9F\x98\x80"},
    {"ReplacementCharacterStays", "\xEF\xBF\xBD", "\xEF\xBF\xBD"},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, RequestValue, testing::ValuesIn(valueCases),
                         [](const auto& test) { return test.param.Name; });

struct VRefusalCase
{
    const char* Name;
    std::function<std::string()> Make;
    const char* Reason;
};

class RequestRefusal : public testing::TestWithParam<VRefusalCase>
{
};

TEST_P(RequestRefusal, NamesWhatTheHostWouldDropOrChange)
{
    try {
        const std::string request = GetParam().Make();
        FAIL() << "made: " << request;
    } catch (const VError& error) {
        EXPECT_EQ(EErrorKind::Usage, error.Kind());
        EXPECT_STREQ(GetParam().Reason, error.what());
    }
}

std::string Execute(const std::string& name, const VParameters& parameters = {})
{
    return MakeExecuteCommandRequest("1", name, parameters);
}

// clang-format off
const VRefusalCase refusalCases[] = {
    {"EmptyCommandName", [] { return Execute(""); },
     "the name of the command is empty, and the host answers nothing to that"},
    {"BlankCommandName", [] { return Execute(" \t\r\n"); },
     "the name of the command is white space alone, which the host takes for empty and does not answer"},
    {"BracketInCommandName", [] { return Execute("a<b"); },
     "the name of the command holds \"<\", which the host can read in the value of a parameter only"},
    {"ZeroInCommandName", [] { return Execute("a\0b"s); },
     "the name of the command holds the control character U+0000"},
    {"LineEndInCommandName", [] { return Execute("a\nb"); },
     "the name of the command holds the control character U+000A"},
    {"DeleteInCommandName", [] { return Execute("\x7F"); },
     "the name of the command holds the control character U+007F"},
    {"InvalidCommandName", [] { return Execute("a\xFF"); },
     "the name of the command is not valid UTF-8"},
    {"EncodedSurrogateInCommandName", [] { return Execute("\xED\xA0\x80"); },
     "the name of the command is not valid UTF-8"},
    {"EmptyDescribedName", [] { return MakeCommandInformationRequest("1", ""); },
     "the name of the command is empty, and the host answers nothing to that"},
    {"EmptyEventName", [] { return MakeEventInformationRequest(""); },
     "the name of the event is empty, and the host answers nothing to that"},
    {"BlankEventName", [] { return MakeEventInformationRequest(" "); },
     "the name of the event is white space alone, which the host takes for empty and does not answer"},
    {"BracketInEventName", [] { return MakeEventInformationRequest("<Name>x</Name>"); },
     "the name of the event holds \"<\", which the host can read in the value of a parameter only"},
    {"EmptyCorrelationOfList", [] { return MakeCommandsRequest(""); },
     "the correlation is empty, and the host answers nothing to that"},
    {"BlankCorrelationOfDescription", [] { return MakeCommandInformationRequest(" ", "a"); },
     "the correlation is white space alone, which the host takes for empty and does not answer"},
    {"BracketInCorrelation", [] { return MakeExecuteCommandRequest("<", "a", {}); },
     "the correlation holds \"<\", which the host can read in the value of a parameter only"},
    {"EmptyParameterName", [] { return Execute("a", {{"b", "1"}, {"", "1"}}); },
     "the name of a parameter is empty, and the host answers nothing to that"},
    {"BlankParameterName", [] { return Execute("a", {{" ", "1"}}); },
     "the name of a parameter is white space alone, which the host takes for empty and does not answer"},
    {"BracketInParameterName", [] { return Execute("a", {{"b<", "1"}}); },
     "the name of a parameter holds \"<\", which the host can read in the value of a parameter only"},
    {"BlankValue", [] { return Execute("a", {{"b", " "}}); },
     "the value of the parameter \"b\" is white space alone, which would reach the host as an empty one"},
    {"ZeroInValue", [] { return Execute("a", {{"b", "x\0y"s}}); },
     "the value of the parameter \"b\" holds the control character U+0000"},
    {"EscapeInValue", [] { return Execute("a", {{"b", "\x1B[2J"}}); },
     "the value of the parameter \"b\" holds the control character U+001B"},
    {"InvalidValue", [] { return Execute("a", {{"b", "\xC0\x80"}}); },
     "the value of the parameter \"b\" is not valid UTF-8"},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, RequestRefusal, testing::ValuesIn(refusalCases),
                         [](const auto& test) { return test.param.Name; });

} // namespace
