#include "device/ClientSupport.h"
#include "device/ProgramSupport.h"

#include <future>

#include <gmock/gmock.h>

namespace {

using testing::AllOf;
using testing::HasSubstr;
using testing::StartsWith;
using namespace std::string_literals;

/// A command with the host's side of it, and all that comes of it.
struct VProgramCase
{
    const char* Name;
    std::vector<std::string> Command;
    std::string Input;
    std::string Request; // as the host must receive it
    std::string Reply;
    int ExitCode;
    std::string Output;
};

class Program : public testing::TestWithParam<VProgramCase>
{
};

TEST_P(Program, PrintsWhatTheHostAnswers)
{
    const VProgramCase& step = GetParam();
    std::string request;
    VScriptedHost host([&](VPeer& peer) {
        request = peer.ReadFrame();
        peer.SendFrame(EventText("Unasked"));
        peer.SendFrame(step.Reply);
        peer.ReadToEnd();
    });

    const VOutcome outcome = RunProgram(At(host, step.Command), step.Input);

    EXPECT_EQ("", host.Finish());
    EXPECT_EQ(step.Request, request);
    EXPECT_EQ(step.Output, outcome.Output);
    EXPECT_EQ(step.ExitCode, outcome.ExitCode) << outcome.Errors;
    EXPECT_EQ("", outcome.Errors);
}

const std::string commandsRequest = "<Commands><Correlation>1</Correlation></Commands>";
const std::string commandsReply = "<Correlation>1</Correlation><Commands><Command>Host.Echo"
                                  "</Command><Command>a\nb</Command></Commands>";
const std::string describeRequest = "<CommandInformation><Correlation>1</Correlation>"
                                    "<Name>Go</Name></CommandInformation>";
const std::string describeReply =
    "<CommandInformation><Correlation>1</Correlation><Name>Go</Name>"
    "<Description>Goes &amp; stops.</Description><InputParameters><Parameter><Name>i</Name>"
    "<Value>How far</Value></Parameter></InputParameters><ReplyParameters/></CommandInformation>";
const std::string notFoundReply =
    "<CommandInformation><Correlation>1</Correlation><Name/><Description>Command not found."
    "</Description><InputParameters/><ReplyParameters/></CommandInformation>";
const std::string runRequest =
    "<ExecuteCommand><Name>Go</Name><Correlation>1</Correlation><Parameters>"
    "<Parameter><Name>a</Name><Value>1=2</Value></Parameter>"
    "<Parameter><Name>b</Name><Value></Value></Parameter>"
    "</Parameters></ExecuteCommand>";
const std::string runReply =
    "<CommandReply><Name>Go</Name><Correlation>1</Correlation><Result>OK</Result><Parameters>"
    "<Parameter><Name>z</Name><Value>\xD0\xBC</Value></Parameter>"
    "<Parameter><Name>a</Name><Value>x y</Value></Parameter></Parameters></CommandReply>";
const std::string plainRunRequest =
    "<ExecuteCommand><Name>Go</Name><Correlation>1</Correlation></ExecuteCommand>";

// clang-format off
const VProgramCase programCases[] = {
    {"InfoAsJson", {"--json", "info"}, "", "<ServerInformation/>", ServerInformationText(), 0,
     R"({"streamVersion":{"major":1,"minor":0}})" "\n"},
    {"Commands", {"commands"}, "", commandsRequest, commandsReply, 0, "Host.Echo\na\\nb\n"},
    {"CommandsAsJson", {"commands", "--json"}, "", commandsRequest, commandsReply, 0,
     R"({"commands":["Host.Echo","a\nb"]})" "\n"},
    {"Describe", {"describe", "Go"}, "", describeRequest, describeReply, 0,
     "Name: Go\nDescription: Goes & stops.\nInput parameters:\n  i: How far\nReply parameters: none\n"},
    {"DescribeAsJson", {"--json", "describe", "Go"}, "", describeRequest, describeReply, 0,
     R"({"name":"Go","description":"Goes & stops.","inputParameters":[{"name":"i","description":"How far"}],"replyParameters":[]})" "\n"},
    {"DescribeWhatTheHostDoesNotKnow", {"describe", "Go"}, "", describeRequest, notFoundReply, 1,
     "Name: \nDescription: Command not found.\nInput parameters: none\nReply parameters: none\n"},
    {"Events", {"events"}, "", "<Events/>", "<Events><Event>A</Event><Event>B</Event></Events>", 0, "A\nB\n"},
    {"NoEventsAsJson", {"--json", "events"}, "", "<Events/>", "<Events/>", 0, "{\"events\":[]}\n"},
    {"DescribeEvent", {"describe-event", "A"}, "", "<EventInformation>A</EventInformation>",
     "<EventInformation><Name>A</Name><Description>d</Description><Parameters><Parameter><Name>p</Name>"
     "<Description>x</Description></Parameter></Parameters></EventInformation>", 0,
     "Name: A\nDescription: d\nParameters:\n  p: x\n"},
    {"DescribeEventAsJsonWithTheEmptyRecord", {"--json", "describe-event", "A"}, "", "<EventInformation>A</EventInformation>",
     "<EventInformation><Name/><Description/><Parameters/></EventInformation>", 0,
     R"({"name":"","description":"","parameters":[]})" "\n"},
    {"Run", {"run", "Go", "a=1=2", "b="}, "", runRequest, runReply, 0, "OK\nz=\xD0\xBC\na=x y\n"},
    {"RunAsJson", {"--json", "run", "Go", "a=1=2", "b="}, "", runRequest, runReply, 0,
     "{\"command\":\"Go\",\"result\":\"OK\",\"ok\":true,\"parameters\":{\"z\":\"\xD0\xBC\",\"a\":\"x y\"}}\n"},
    {"RunThatFails", {"run", "Go"}, "", plainRunRequest, ReplyText("1", "Error: Object not found."), 1,
     "Error: Object not found.\n"},
    {"RunThatFailsAsJson", {"--json", "run", "Go"}, "", plainRunRequest, ReplyText("1", "Error: Object not found."), 1,
     R"({"command":"Go","result":"Error: Object not found.","ok":false,"parameters":{}})" "\n"},
    {"RunOfACommandNamedLikeAnother", {"run", "info"}, "",
     "<ExecuteCommand><Name>info</Name><Correlation>1</Correlation></ExecuteCommand>", ReplyText("1"), 0, "OK\n"},
    {"RunWithParametersLikeOptionsBehindTheMark", {"run", "Go", "b=2", "--", "--a=-1", "-c="}, "",
     "<ExecuteCommand><Name>Go</Name><Correlation>1</Correlation><Parameters>"
     "<Parameter><Name>b</Name><Value>2</Value></Parameter>"
     "<Parameter><Name>--a</Name><Value>-1</Value></Parameter>"
     "<Parameter><Name>-c</Name><Value></Value></Parameter></Parameters></ExecuteCommand>", ReplyText("1"), 0, "OK\n"},
    {"RunWithBracketsAndPluses", {"run", "[Go]", "[a=1,b=2]", "c=[1,2]", "++=1"}, "",
     "<ExecuteCommand><Name>[Go]</Name><Correlation>1</Correlation><Parameters>"
     "<Parameter><Name>[a</Name><Value>1,b=2]</Value></Parameter>"
     "<Parameter><Name>c</Name><Value>[1,2]</Value></Parameter>"
     "<Parameter><Name>++</Name><Value>1</Value></Parameter></Parameters></ExecuteCommand>", ReplyText("1"), 0, "OK\n"},
    {"RunOfACommandNamedPlusPlus", {"run", "++"}, "",
     "<ExecuteCommand><Name>++</Name><Correlation>1</Correlation></ExecuteCommand>", ReplyText("1"), 0, "OK\n"},
    {"DescribeWhatLooksLikeAnOption", {"describe", "--", "--json"}, "",
     "<CommandInformation><Correlation>1</Correlation><Name>--json</Name></CommandInformation>", notFoundReply, 1,
     "Name: \nDescription: Command not found.\nInput parameters: none\nReply parameters: none\n"},
    {"ControlCharactersAreShownNotSent", {"run", "Go"}, "", plainRunRequest,
     "<CommandReply><Correlation>1</Correlation><Result>\x1B]0;x\x07\r\t\n\x7F\xC2\x9B\xE2\x80\xAE\xF0\x9F\x98\x80\\</Result></CommandReply>", 1,
     "\\x1B]0;x\\x07\\r\\t\\n\\x7F\\x9B\\u202E\xF0\x9F\x98\x80\\\n"},
    {"JsonEscapesControlCharacters", {"--json", "run", "Go"}, "", plainRunRequest,
     "<CommandReply><Correlation>1</Correlation><Result>\x1B\n\xFF</Result></CommandReply>", 1,
     "{\"command\":\"Go\",\"result\":\"\\u001b\\n\xEF\xBF\xBD\",\"ok\":false,\"parameters\":{}}\n"},
    {"Raw", {"raw"}, "<Foo a='1'/>\n", "<Foo a='1'/>\n", "<Bar>&lt;\n\xFF</Bar>", 0, "<Bar>&lt;\n\xFF</Bar>\n"},
    {"RawAsJson", {"--json", "raw"}, "", "", "<Bar>\"\xFF</Bar>", 0, "{\"reply\":\"<Bar>\\\"\xEF\xBF\xBD</Bar>\"}\n"},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, Program, testing::ValuesIn(programCases),
                         [](const auto& test) { return test.param.Name; });

TEST(ProgramInfo, TellsTheVersionOfTheStreamAndWhereItIs)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(ServerInformationText());
        peer.ReadToEnd();
    });
    const std::string port = std::to_string(host.Port());

    const VOutcome outcome = RunProgram({"--host", "localhost", "--port", port, "info"});

    EXPECT_EQ("Control stream 1.0 at localhost:" + port + "\n", outcome.Output);
    EXPECT_EQ(0, outcome.ExitCode) << outcome.Errors;
}

struct VUsageCase
{
    const char* Name;
    std::vector<std::string> Arguments;
    const char* Errors;
};

class ProgramUsage : public testing::TestWithParam<VUsageCase>
{
};

TEST_P(ProgramUsage, IsRefusedWithTwoBeforeAnyConnection)
{
    const VOutcome outcome = RunProgram(GetParam().Arguments);

    EXPECT_EQ(2, outcome.ExitCode);
    EXPECT_EQ("korva-control: "s + GetParam().Errors + "\n", outcome.Errors);
    EXPECT_EQ("", outcome.Output);
}

// clang-format off
const VUsageCase usageCases[] = {
    {"NoCommand", {}, "a command is needed; --help lists them"},
    {"OptionsAlone", {"--timeout", "1"}, "a command is needed; --help lists them"},
    {"UnknownCommand", {"fly"}, "The following argument was not expected: fly; --help tells more"},
    {"ControlCharacterInAnArgument", {"\x1B[2J"}, "The following argument was not expected: \\x1B[2J; --help tells more"},
    {"UnknownOption", {"info", "--fast"}, "The following argument was not expected: --fast; --help tells more"},
    {"PortZero", {"--port", "0", "info"}, "--port: \"0\" is no whole number from 1 to 65535; --help tells more"},
    {"PortTooGreat", {"--port", "65536", "info"}, "--port: \"65536\" is no whole number from 1 to 65535; --help tells more"},
    {"NoTime", {"--timeout", "0", "info"}, "--timeout: a time limit is a number of seconds above 0; --help tells more"},
    {"NegativeTime", {"--timeout", "-1", "info"}, "--timeout: a time limit is a number of seconds above 0; --help tells more"},
    {"TimeThatIsNoNumber", {"--timeout", "nan", "info"}, "--timeout: a time limit is a number of seconds above 0; --help tells more"},
    {"TimeWithoutEnd", {"--timeout", "inf", "info"}, "--timeout: a time limit is a number of seconds above 0; --help tells more"},
    {"EmptyHost", {"--host", "", "info"}, "a connection needs the name of a host and a port"},
    {"DescribeNothing", {"describe"}, "NAME is required; --help tells more"},
    {"DescribeEmptyName", {"describe", ""}, "the name of the command is empty, and the host answers nothing to that"},
    {"DescribeEmptyEvent", {"describe-event", ""}, "the name of the event is empty, and the host answers nothing to that"},
    {"RunNothing", {"run"}, "NAME is required; --help tells more"},
    {"RunWithBracket", {"run", "a<b"}, "the name of the command holds \"<\", which the host can read in the value of a parameter only"},
    {"RunWithPlusPlus", {"run", "Go", "++"}, "a parameter is written as NAME=VALUE, not as \"++\""},
    {"RunWithAList", {"run", "Go", "[a]"}, "a parameter is written as NAME=VALUE, not as \"[a]\""},
    {"RunWithTheMarkOfTheParserItself", {"run", "\x1F"}, "the name of the command holds the control character U+001F"},
    {"ListTooMany", {"info", "[a,b]"}, "The following argument was not expected: [a,b]; --help tells more"},
    {"RunWithNoAssignment", {"run", "Go", "a"}, "a parameter is written as NAME=VALUE, not as \"a\""},
    {"RunWithEmptyParameterName", {"run", "Go", "=1"}, "the name of a parameter is empty, and the host answers nothing to that"},
    {"RunWithBlankValue", {"run", "Go", "a= "}, "the value of the parameter \"a\" is white space alone, which would reach the host as an empty one"},
    {"RunWithInvalidValue", {"run", "Go", "a=\xFF"}, "the value of the parameter \"a\" is not valid UTF-8"},
    {"CountOfNothing", {"watch", "--count", "0"}, "--count: \"0\" is no whole number from 1 to 18446744073709551615; --help tells more"},
    {"NegativeCount", {"watch", "--count", "-1"}, "--count: \"-1\" is no whole number from 1 to 18446744073709551615; --help tells more"},
    {"CountInWords", {"watch", "--count", "two"}, "--count: \"two\" is no whole number from 1 to 18446744073709551615; --help tells more"},
    {"CountBeyondTheGreatest", {"watch", "--count", "18446744073709551616"}, "--count: \"18446744073709551616\" is no whole number from 1 to 18446744073709551615; --help tells more"},
    {"CameraBeyondTheGreatest", {"watch", "--camera", "4294967296"}, "--camera: \"4294967296\" is no whole number from 0 to 4294967295; --help tells more"},
    {"HexadecimalPort", {"--port", "0x10", "info"}, "--port: \"0x10\" is no whole number from 1 to 65535; --help tells more"},
    {"BytesBeyondTheGreatest", {"serve", "--cut-after", "18446744073709551616"}, "--cut-after: \"18446744073709551616\" is no whole number from 0 to 18446744073709551615; --help tells more"},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, ProgramUsage, testing::ValuesIn(usageCases),
                         [](const auto& test) { return test.param.Name; });

struct VJsonFailureCase
{
    const char* Name;
    std::vector<std::string> Arguments;
    const char* Errors; // as JSON
    int ExitCode;
};

class ProgramJson : public testing::TestWithParam<VJsonFailureCase>
{
};

TEST_P(ProgramJson, TellsAFailureAsOneObjectOnStandardError)
{
    const VOutcome outcome = RunProgram(GetParam().Arguments);

    EXPECT_EQ(GetParam().Errors + "\n"s, outcome.Errors);
    EXPECT_EQ(GetParam().ExitCode, outcome.ExitCode);
    EXPECT_EQ("", outcome.Output);
}

// clang-format off
const VJsonFailureCase jsonFailureCases[] = {
    {"NoCommand", {"--json"}, R"({"error":"a command is needed; --help lists them","exitCode":2})", 2},
    {"BeforeWhatIsWrong", {"--json", "fly"}, R"({"error":"The following argument was not expected: fly; --help tells more","exitCode":2})", 2},
    {"BehindWhatIsWrong", {"--port", "0", "info", "--json"}, R"({"error":"--port: \"0\" is no whole number from 1 to 65535; --help tells more","exitCode":2})", 2},
    {"ControlCharacter", {"--json", "\x1B\xFF"}, "{\"error\":\"The following argument was not expected: \\u001b\xEF\xBF\xBD; --help tells more\",\"exitCode\":2}", 2},
    {"RefusedByTheClient", {"--json", "run", "Go", "a"}, R"({"error":"a parameter is written as NAME=VALUE, not as \"a\"","exitCode":2})", 2},
    {"NoConnection", {"--json", "--port", "1", "info"}, R"({"error":"no connection to 127.0.0.1:1: Connection refused","exitCode":3})", 3},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, ProgramJson, testing::ValuesIn(jsonFailureCases),
                         [](const auto& test) { return test.param.Name; });

TEST(ProgramJson, TellsNoticesAndWarningsAsObjectsToo)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(ServerInformationText());
        peer.SendFrame(EventText("A"));
        peer.ReadToEnd();
    });
    EXPECT_EQ("{\"notice\":\"watching 127.0.0.1:" + std::to_string(host.Port()) + "\"}\n",
              RunProgram(At(host, {"--json", "watch", "--count", "1"})).Errors);

    VScriptedHost other([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame("<Events/>");
        peer.ReadToEnd();
    });
    EXPECT_EQ("{\"warning\":\"attributes are not looked at\"}\n",
              RunProgram(At(other, {"--json", "raw", "--lint"}), "<Events a='1'/>").Errors);
}

TEST(ProgramOptions, NumbersAreDecimalWithZerosBefore)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(ServerInformationText());
        peer.ReadToEnd();
    });

    EXPECT_EQ(0, RunProgram({"--port", "0" + std::to_string(host.Port()), "info"}).ExitCode);
}

TEST(ProgramOptions, HelpListsCommandsAndExitCodes)
{
    const VOutcome outcome = RunProgram({"--help"});

    EXPECT_EQ(0, outcome.ExitCode);
    for (const char* const word :
         {"info", "cameras", "commands", "describe", "events", "describe-event", "run", "watch",
          "raw", "--host", "--port", "--json", "--timeout", "--version", "4  timed out"}) {
        EXPECT_THAT(outcome.Output, HasSubstr(word));
    }
    EXPECT_THAT(RunProgram({"run", "--help"}).Output, HasSubstr("NAME=VALUE"));
}

TEST(ProgramOptions, VersionNamesTheProgram)
{
    const VOutcome outcome = RunProgram({"--version"});

    EXPECT_EQ(0, outcome.ExitCode);
    EXPECT_THAT(outcome.Output, testing::MatchesRegex("korva-control [0-9]+\\.[0-9]+\\.[0-9]+\n"));
}

TEST(ProgramFailure, NoConnectionIsThree)
{
    std::uint16_t port = 0;
    {
        VScriptedHost host([](VPeer&) {});
        port = host.Port();
    }
    const VOutcome outcome = RunProgram({"--port", std::to_string(port), "info"});

    EXPECT_EQ(3, outcome.ExitCode);
    EXPECT_EQ("korva-control: no connection to 127.0.0.1:" + std::to_string(port) +
                  ": Connection refused\n",
              outcome.Errors);
}

TEST(ProgramFailure, HostWithoutAddressIsThree)
{
    const VOutcome outcome = RunProgram({"--host", "::1", "info"});

    EXPECT_EQ(3, outcome.ExitCode);
    EXPECT_THAT(outcome.Errors, StartsWith("korva-control: no IPv4 address is known for ::1: "));
}

TEST(ProgramFailure, HostThatClosesIsThree)
{
    VScriptedHost host([](VPeer& peer) { peer.ReadFrame(); });

    const VOutcome outcome = RunProgram(At(host, {"info"}));

    EXPECT_EQ(3, outcome.ExitCode);
    EXPECT_EQ("korva-control: the host closed the connection\n", outcome.Errors);
}

TEST(ProgramFailure, TimeOutIsFourAndSaysWhatWasWaitedFor)
{
    VScriptedHost host([](VPeer& peer) { peer.ReadToEnd(); });

    const VOutcome outcome = RunProgram(
        {"--port", std::to_string(host.Port()), "--timeout", "0.05", "run", "Host.Echo"});

    EXPECT_EQ(4, outcome.ExitCode);
    EXPECT_EQ("korva-control: timed out after 0.05 s, waiting for the reply to the command "
              "\"Host.Echo\"\n",
              outcome.Errors);
}

TEST(ProgramFailure, UnreadableAnswerIsOne)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame("no XML");
        peer.ReadToEnd();
    });

    const VOutcome outcome = RunProgram(At(host, {"info"}));

    EXPECT_EQ(1, outcome.ExitCode);
    EXPECT_EQ("korva-control: the host sent a frame that cannot be read as XML\n", outcome.Errors);
}

TEST(ProgramFailure, OutputThatCannotBeWrittenIsOne)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(ServerInformationText());
        peer.ReadToEnd();
    });
    const std::string program = std::string(KORVA_CONTROL_PROGRAM) + " --port " +
                                std::to_string(host.Port()) + " --timeout 60 ";
    for (const char* const words : {"info", "serve --listen 0", "--help", "--version"}) {
        const std::string command = program + words + " >/dev/full 2>/dev/null";

        const int status = std::system(command.c_str()); // NOLINT: a shell, to have the redirection

        ASSERT_TRUE(WIFEXITED(status));
        EXPECT_EQ(1, WEXITSTATUS(status)) << words;
    }
}

TEST(ProgramFailure, ClosedOutputIsNeverTakenForTheConnection)
{
    std::string rest;
    VScriptedHost host([&](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(ServerInformationText());
        rest = peer.ReadToEnd();
    });
    const std::string command = std::string(KORVA_CONTROL_PROGRAM) + " --port " +
                                std::to_string(host.Port()) + " info <&- >&- 2>&-";

    const int status = std::system(command.c_str()); // NOLINT: a shell, to have the redirection

    EXPECT_EQ("", host.Finish());
    EXPECT_EQ("", rest);
    ASSERT_TRUE(WIFEXITED(status));
    EXPECT_EQ(1, WEXITSTATUS(status));
}

TEST(ProgramRaw, WithoutReplyWaitsUntilTheHostHasReadTheFrame)
{
    std::string received;
    VScriptedHost host([&](VPeer& peer) {
        peer.SendFrame(EventText("Unread"));
        received = peer.ReadToEnd();
    });

    const VOutcome outcome = RunProgram(At(host, {"raw", "--no-reply"}), "<Foo/>");

    EXPECT_EQ("", host.Finish());
    EXPECT_EQ(0, outcome.ExitCode) << outcome.Errors;
    EXPECT_EQ("", outcome.Output);
    EXPECT_EQ("\x06\x00\x00\x00<Foo/>"s, received);
}

TEST(ProgramRaw, WithoutReplyTimesOutOnAHostThatDoesNotClose)
{
    std::promise<void> done;
    VScriptedHost host([&](VPeer&) { done.get_future().wait(); });

    const VOutcome outcome = RunProgram(
        {"--port", std::to_string(host.Port()), "--timeout", "0.05", "raw", "--no-reply"}, "x");
    done.set_value();

    EXPECT_EQ(4, outcome.ExitCode);
    EXPECT_EQ("korva-control: timed out, waiting for the host to handle the frame and close\n",
              outcome.Errors);
}

TEST(ProgramRaw, SilenceIsFour)
{
    VScriptedHost host([](VPeer& peer) { peer.ReadToEnd(); });

    const VOutcome outcome =
        RunProgram({"--port", std::to_string(host.Port()), "--timeout", "0.05", "raw"}, "<Foo/>");

    EXPECT_EQ(4, outcome.ExitCode);
    EXPECT_THAT(outcome.Errors, HasSubstr("waiting for a reply to the raw frame"));
}

} // namespace
