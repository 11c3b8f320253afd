#include "device/PseudoTerminal.h"

#include "ControlStreamClient/Client.h"
#include "FakeHost/FakeHost.h"
#include "FakeHost/SimulatedContent.h"
#include "device/ChildProgram.h"
#include "device/ClientSupport.h"
#include "device/ReservedPort.h"

#include <filesystem>
#include <future>
#include <sstream>

#include <gmock/gmock.h>
#include <nlohmann/json.hpp>

namespace {

using FakeHost::VFakeHost;
using testing::AllOf;
using testing::EndsWith;
using testing::HasSubstr;
using testing::Not;
using testing::StartsWith;

const std::string prompt = "korva> ";
const std::string hidden = "\r\x1B[J"; // what takes a typed line off the screen

std::vector<std::string> ShellAt(std::uint16_t port, const std::vector<std::string>& more = {},
                                 const std::string& history = "")
{
    std::vector<std::string> arguments{"--port", std::to_string(port), "--timeout", "60",
                                       "shell",  "--history",          history};
    arguments.insert(arguments.end(), more.begin(), more.end());
    return arguments;
}

/// A shell that is connected to a fake host and knows its names.
class Shell : public testing::Test
{
protected:
    void Start(unsigned short columns = 80, const std::string& history = "")
    {
        shell.emplace(ShellAt(host.Port(), {}, history), columns);
        shell->Expect("-- connected to 127.0.0.1:" + std::to_string(host.Port()));
        // Its reply comes behind those that the shell asked for by itself.
        shell->Type("commands\r");
        shell->Expect("CameraSettings_GetTapEnabled");
        shell->Expect(prompt);
    }

    /// Has the host publish an event.
    void ToggleTap()
    {
        ControlStream::VClient other(WithLimit(Patient));
        other.Connect("127.0.0.1", host.Port(), Patient);
        other.ExecuteCommand("CameraSettings_ToggleTap", {{"Param_TapEnabled", "1"}});
    }

    VFakeHost host{FakeHost::MakeSimulatedContent(2, {}), 0};
    std::optional<VPseudoTerminal> shell;
};

TEST_F(Shell, RunsWhatIsTypedAndLeavesWithControlD)
{
    Start();

    shell->Type("run Host.Echo \"Text=Hello, stage\"\r");
    EXPECT_THAT(shell->Expect("Text=Hello, stage\r\n"), HasSubstr("OK\r\n"));
    shell->Type("CameraSettings_GetSelection\r");
    shell->Expect("Param_CameraSelection=\r\n");
    shell->Type("nonsense\r");
    shell->Expect("\x1B[31m\"nonsense\" cannot be done so; help lists what can\x1B[0m");
    shell->Type("run Host.Echo a\r");
    shell->Expect("a parameter is written as NAME=VALUE, not as \"a\"");
    shell->Type("describe Host.Information\r");
    shell->Expect("out Version: ");
    shell->Type("info\r");
    shell->Expect("Connected to 127.0.0.1:");
    shell->Expect(prompt);
    shell->Type("\x04");

    EXPECT_EQ(0, shell->Finish());
}

TEST_F(Shell, CompletesCommandsParametersAndEvents)
{
    Start(200); // so that no line is broken

    shell->Type("CameraSettings_SetSt\t");
    shell->Expect("robeIntensity ");
    shell->Type("Param_Cam\t");
    shell->Expect("eraDeviceId=");
    shell->Type("1 Par\t");
    shell->Expect("am_StrobeIntensity=");
    shell->Type("0.75\r");
    shell->Expect("Event.Cameras.SettingChanged CameraId=1");
    shell->Type("describe-event Event.Cameras.Tap\t");
    shell->Expect("ToSelectChanged ");
    shell->Type("\r");
    shell->Expect("The host tells nothing of it");
}

TEST_F(Shell, ListsWhereThereAreSeveralWaysToGoOn)
{
    Start();

    shell->Type("CameraSettings_GetS\t");
    EXPECT_THAT(shell->Expect("  CameraSettings_GetSelection\r\n"),
                AllOf(HasSubstr("  CameraSettings_GetStrobeIntensity\r\n"), HasSubstr(hidden)));
    shell->Expect(prompt + "CameraSettings_GetS");
    shell->Type("e\t\r");

    shell->Expect("Param_CameraSelection=");
}

TEST_F(Shell, ShowsEventsWithoutBreakingTheTypedLine)
{
    Start();

    shell->Type("hel");
    shell->Expect("hel");
    ToggleTap();

    const std::string text = shell->Expect("Event.Cameras.TapToSelectChanged Param_TapEnabled=1");
    EXPECT_THAT(text, HasSubstr(hidden));
    EXPECT_THAT(text, EndsWith("\x1B[36mEvent.Cameras.TapToSelectChanged Param_TapEnabled=1"));
    shell->Expect(prompt + "hel");
    shell->Type("p\r");
    shell->Expect("Leave, as Ctrl-D does");
}

TEST_F(Shell, TakesOffEveryRowOfALongLine)
{
    Start(40);

    shell->Type(std::string(79, 'x') + "!"); // with the prompt, three rows of 40
    shell->Expect("!");
    ToggleTap();

    EXPECT_THAT(shell->Expect("TapToSelectChanged"), HasSubstr("\x1B[2A" + hidden));
}

TEST_F(Shell, FiltersEvents)
{
    Start();

    shell->Type("quiet\r");
    shell->Expect(prompt);
    ToggleTap();
    shell->Type("watch Event.Cameras.SelectionChanged\r");
    shell->Expect(prompt);
    shell->Type("CameraSettings_SetSelection Param_CameraSelection=2\r");

    EXPECT_THAT(shell->Expect("Event.Cameras.SelectionChanged SelectedCameraIds=2"),
                Not(HasSubstr("Event.Cameras.Tap")));
}

TEST_F(Shell, ReadsKeysAsBeforeOnceItGoesOnFromAStop)
{
    Start();
    shell->Type("hel");
    shell->Expect("hel");

    shell->StopAndGoOn();

    shell->Expect(prompt + "hel");
    shell->Type("\t");
    shell->Expect("p ");
}

TEST_F(Shell, EmptiesTheLineOnControlCAndEndsOnSigterm)
{
    Start();

    shell->Type("nonsense\x03");
    shell->Type("info\r");
    EXPECT_THAT(shell->Expect("Connected to "), Not(HasSubstr("cannot be done")));
    shell->Expect(prompt);
    shell->Signal(SIGTERM);

    EXPECT_EQ(0, shell->Finish());
}

TEST_F(Shell, KeepsItsHistoryInAFileForItsUserAlone)
{
    std::string folder = (std::filesystem::temp_directory_path() / "korva-XXXXXX").string();
    ASSERT_NE(nullptr, mkdtemp(folder.data()));
    const std::string file = folder + "/deep/history";
    Start(80, file);
    shell->Type("run Host.Echo First=1\r");
    shell->Expect("First=1\r\nkorva> ");
    shell->Type("quit\r");
    EXPECT_EQ(0, shell->Finish());

    EXPECT_EQ(std::filesystem::perms::owner_read | std::filesystem::perms::owner_write,
              std::filesystem::status(file).permissions());
    shell.emplace(ShellAt(host.Port(), {}, file));
    shell->Expect("-- connected");
    shell->Expect(prompt);
    shell->Type("\x1B[A"); // up: quit
    shell->Expect("quit");
    shell->Type("\x1B[A");
    shell->Expect("run Host.Echo First=1");
    shell->Type("\r");
    shell->Expect("First=1\r\n");
    shell->Type("\x04");
    EXPECT_EQ(0, shell->Finish());
    std::filesystem::remove_all(folder);
}

TEST_F(Shell, AsksForTheAuthorization)
{
    shell.emplace(ShellAt(host.Port(), {"--id", "d", "--name", "n"}));

    shell->Expect("-- authorization: given");
    shell->Type("info\r");
    shell->Expect("Authorization: given");
}

TEST_F(Shell, TakesLinesFromWhereverTheyCome)
{
    VChildProgram program(ShellAt(host.Port()), "run Host.Echo Text=Hello\nevents\nquit\n");

    const VOutcome outcome = program.Finish();

    EXPECT_EQ(0, outcome.ExitCode) << outcome.Errors;
    EXPECT_THAT(outcome.Output, AllOf(HasSubstr("OK\nText=Hello\n"), HasSubstr("Event.Authorize\n"),
                                      Not(HasSubstr("korva>")), Not(HasSubstr("\x1B"))));
}

TEST_F(Shell, SpeaksJson)
{
    std::vector<std::string> arguments = ShellAt(host.Port());
    arguments.insert(arguments.begin(), "--json");
    VChildProgram program(arguments, "run Host.Echo Text=Hello\ndescribe Host.Echo\n");

    const VOutcome outcome = program.Finish();

    EXPECT_THAT(
        outcome.Output,
        StartsWith(
            R"({"command":"Host.Echo","result":"OK","ok":true,"parameters":{"Text":"Hello"}})"
            "\n"
            R"({"name":"Host.Echo",)"));
}

TEST_F(Shell, SpeaksJsonAlsoOfItself)
{
    std::vector<std::string> arguments = ShellAt(host.Port());
    arguments.insert(arguments.begin(), "--json");
    VChildProgram program(arguments, "help\ninfo\nnonsense\n");

    const VOutcome outcome = program.Finish();

    std::istringstream lines(outcome.Output);
    std::vector<nlohmann::json> objects;
    for (std::string line; std::getline(lines, line);) {
        objects.push_back(nlohmann::json::parse(line));
    }
    ASSERT_EQ(2U, objects.size()) << outcome.Output;
    EXPECT_EQ("quit", objects[0]["help"].back()["usage"]);
    EXPECT_TRUE(objects[1].contains("connected"));
    EXPECT_THAT(outcome.Errors,
                HasSubstr(R"({"error":"\"nonsense\" cannot be done so; help lists what can"})"
                          "\n"));
}

TEST_F(Shell, EndsWhereItsInputWasClosed)
{
    const std::string command = std::string(KORVA_CONTROL_PROGRAM) + " --port " +
                                std::to_string(host.Port()) + " shell --history '' <&- >/dev/null";

    EXPECT_EQ(0, std::system(command.c_str())); // NOLINT: a shell, to have the redirection
}

TEST_F(Shell, TakesLinesThatEndAsOnOtherSystems)
{
    VChildProgram program(ShellAt(host.Port()), "run Host.Echo Text=Hello\r\nquit\r\n");

    const VOutcome outcome = program.Finish();

    EXPECT_THAT(outcome.Output, HasSubstr("OK\nText=Hello\n"));
    EXPECT_EQ(0, outcome.ExitCode) << outcome.Errors;
}

TEST(ShellHost, GetsABeatEverySecond)
{
    std::promise<std::chrono::steady_clock::duration> between;
    VScriptedHost host([&](VPeer& peer) {
        // Before the first beat can be sent: when it arrives, it may have been on its way for long.
        std::chrono::steady_clock::time_point start;
        while (const auto request = peer.ReadFrameOrEnd()) {
            if (*request == "<ServerInformation/>") {
                start = std::chrono::steady_clock::now();
                peer.SendFrame(ServerInformationText());
            } else if (request->find("System.Heartbeat") != std::string::npos) {
                const std::size_t at = request->find("<Correlation>") + 13;
                peer.SendFrame(ReplyText(request->substr(at, request->find('<', at) - at)));
                if (request->find("<Value>2</Value>") != std::string::npos) {
                    between.set_value(std::chrono::steady_clock::now() - start);
                }
            }
        }
    });
    VPseudoTerminal shell(ShellAt(host.Port()));

    const auto time = between.get_future().get();

    EXPECT_GE(time, std::chrono::seconds(1));
    shell.Type("\x04");
    EXPECT_EQ(0, shell.Finish());
    EXPECT_EQ("", host.Finish());
}

TEST(ShellHost, MayReplyAfterMoreWasTyped)
{
    std::promise<void> asked, typed;
    VScriptedHost host([&](VPeer& peer) {
        while (const auto request = peer.ReadFrameOrEnd()) {
            if (*request == "<ServerInformation/>") {
                peer.SendFrame(ServerInformationText());
            } else if (request->find("<Name>Go</Name>") != std::string::npos) {
                asked.set_value();
                typed.get_future().wait();
                const std::size_t at = request->find("<Correlation>") + 13;
                peer.SendFrame(ReplyText(request->substr(at, request->find('<', at) - at)));
            }
        }
    });
    VPseudoTerminal shell(ShellAt(host.Port()));
    shell.Expect("-- connected to");
    shell.Expect(prompt);

    shell.Type("run Go\r");
    asked.get_future().wait();
    shell.Type("inf\x04"); // shows, and lists what may follow, once it is read
    shell.Type("\x15\x04");
    typed.set_value();

    shell.Expect("\r\nOK\r\n" + prompt + "inf"); // and nothing between the lines
    EXPECT_EQ(0, shell.Finish());
    EXPECT_EQ("", host.Finish());
}

TEST(ShellInAStorm, DoesWhatIsTypedWhileEventsNeverEnd)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(ServerInformationText());
        while (peer.SendFrame(EventText("Storm"))) {
        }
    });
    VPseudoTerminal shell(ShellAt(host.Port()));
    shell.Expect("Storm");

    shell.Type("quit\r");

    EXPECT_EQ(0, shell.Finish());
}

TEST(ShellWithoutAHost, GoesOnAndConnectsWhenOneComes)
{
    const VReservedPort port;
    auto host = std::make_unique<VFakeHost>(FakeHost::MakeSimulatedContent(1, {}), port.Number());
    VPseudoTerminal shell(ShellAt(port.Number()));
    shell.Expect("-- connected to");

    host.reset();
    shell.Expect("; trying again"); // what for depends on whether the host had read everything
    const VFakeHost next(FakeHost::MakeSimulatedContent(1, {}), port.Number());

    shell.Expect("-- connected to");
}

} // namespace
