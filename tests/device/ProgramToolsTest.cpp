#include "device/ChildProgram.h"
#include "device/ScriptedHost.h"

#include <filesystem>
#include <fstream>
#include <future>
#include <iterator>

#include <gmock/gmock.h>
#include <nlohmann/json.hpp>

namespace {

using testing::AllOf;
using testing::EndsWith;
using testing::HasSubstr;
using testing::MatchesRegex;
using testing::StartsWith;

/// A folder that goes with the test.
class VTemporaryFolder
{
public:
    VTemporaryFolder()
    {
        std::string name = (std::filesystem::temp_directory_path() / "korva-XXXXXX").string();
        if (mkdtemp(name.data()) == nullptr) {
            throw std::runtime_error("no folder");
        }
        path = name;
    }
    ~VTemporaryFolder() { std::filesystem::remove_all(path); }
    VTemporaryFolder(const VTemporaryFolder&) = delete;
    VTemporaryFolder& operator=(const VTemporaryFolder&) = delete;

    std::string File(const std::string& name) const { return (path / name).string(); }

private:
    std::filesystem::path path;
};

std::string ReadFile(const std::string& path)
{
    std::ifstream file(path, std::ios::binary);
    return {std::istreambuf_iterator<char>(file), {}};
}

/// A korva-control that plays a host on a free port.
class VServedHost
{
public:
    explicit VServedHost(std::vector<std::string> options = {}) : program(Arguments(options))
    {
        const std::string line = program.ReadLine().value_or("nothing");
        const std::string greeting = "listening on port ";
        if (line.compare(0, greeting.size(), greeting) != 0) {
            throw std::runtime_error("no host: " + line + program.Finish().Errors);
        }
        port = line.substr(greeting.size());
    }

    const std::string& Port() const { return port; }

    void SuspendForAMoment() const { program.SuspendForAMoment(); }

    /// Ends it in order.
    VOutcome Stop()
    {
        program.Signal(SIGTERM);
        return program.Finish();
    }

private:
    static std::vector<std::string> Arguments(std::vector<std::string> options)
    {
        options.insert(options.begin(), {"serve", "--listen", "0"});
        return options;
    }

    VChildProgram program;
    std::string port;
};

std::vector<std::string> At(const std::string& port, std::vector<std::string> command)
{
    command.insert(command.begin(), {"--port", port, "--timeout", "60"});
    return command;
}

TEST(ProgramServe, PlaysAHostUntilItIsStopped)
{
    VServedHost host({"--cameras", "2"});

    EXPECT_EQ("Camera 1: StrobeIntensity=0.5 Threshold=0.25 ShutterDuration=0.1 GreyscaleMode=?\n"
              "Camera 2: StrobeIntensity=0.5 Threshold=0.25 GreyscaleMode=?\n",
              RunProgram(At(host.Port(), {"cameras"})).Output);
    const VOutcome outcome = host.Stop();

    EXPECT_EQ(0, outcome.ExitCode) << outcome.Errors;
}

TEST(ProgramServe, TellsItsPortAsJson)
{
    VChildProgram program({"--json", "serve", "--listen", "0"});

    EXPECT_THAT(program.ReadLine().value_or(""), MatchesRegex(R"(\{"listening":[0-9]+\})"));
}

TEST(ProgramServe, EndsByItselfAfterATimeThatIsGiven)
{
    EXPECT_EQ(0, RunProgram({"serve", "--listen", "0", "--timeout", "0.05"}).ExitCode);
}

TEST(ProgramServe, SaysWhenThePortIsTaken)
{
    VServedHost host;
    const std::string reason = "port " + host.Port() + " cannot be taken";

    const VOutcome plain = RunProgram({"serve", "--listen", host.Port()});
    EXPECT_EQ(3, plain.ExitCode);
    EXPECT_THAT(plain.Errors, HasSubstr(reason));
    EXPECT_EQ(3, RunProgram({"serve", "--listen", host.Port(), "--never-reply"}).ExitCode);
}

TEST(ProgramServe, GoesOnAfterItWasSuspended)
{
    VServedHost host({"--timeout", "600"});

    host.SuspendForAMoment();

    EXPECT_EQ(0, RunProgram(At(host.Port(), {"info"})).ExitCode);
    EXPECT_EQ(0, host.Stop().ExitCode);
}

struct VFaultSwitch
{
    const char* Name;
    std::vector<std::string> Options;
    std::string Timeout;
    int ExitCode;
    std::string Error;
};

class ProgramServeFault : public testing::TestWithParam<VFaultSwitch>
{
};

TEST_P(ProgramServeFault, IsMetByTheFirstDeviceOnly)
{
    std::vector<std::string> options = GetParam().Options;
    options.insert(options.end(), {"--faulty", "1"});
    VServedHost host(options);

    const VOutcome faulty =
        RunProgram({"--port", host.Port(), "--timeout", GetParam().Timeout, "commands"});
    const VOutcome sound = RunProgram(At(host.Port(), {"commands"}));

    EXPECT_EQ(GetParam().ExitCode, faulty.ExitCode);
    EXPECT_THAT(faulty.Errors, HasSubstr(GetParam().Error));
    EXPECT_EQ(0, sound.ExitCode) << sound.Errors;
    EXPECT_THAT(sound.Output, StartsWith("Host.Information\nHost.Echo\nSystem.Authorize\n"));
}

// clang-format off
const VFaultSwitch faultSwitches[] = {
    {"Delay", {"--delay", "3600"}, "0.2", 4, "timed out after 0.2 s, waiting for the list of commands"},
    {"NeverReply", {"--never-reply"}, "0.2", 4, "timed out after 0.2 s"},
    {"NeverRead", {"--never-read"}, "0.2", 4, "timed out after 0.2 s"},
    {"Cut", {"--cut-after", "10"}, "60", 3, "the host closed the connection in the middle of a frame, after 6 of its"},
    {"Garbage", {"--garbage-after", "0"}, "60", 1, "the host announced a frame of"},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, ProgramServeFault, testing::ValuesIn(faultSwitches),
                         [](const auto& named) { return std::string(named.param.Name); });

struct VWrongUsage
{
    const char* Name;
    std::vector<std::string> Command;
};

class ProgramToolsUsage : public testing::TestWithParam<VWrongUsage>
{
};

TEST_P(ProgramToolsUsage, IsRefused)
{
    const VOutcome outcome = RunProgram(GetParam().Command);

    EXPECT_EQ(2, outcome.ExitCode);
    EXPECT_EQ("", outcome.Output);
    EXPECT_THAT(outcome.Errors, StartsWith("korva-control: "));
}

// clang-format off
const VWrongUsage wrongUsages[] = {
    {"ServeNegativeCut", {"serve", "--cut-after", "-1"}},
    {"ServePortTooGreat", {"serve", "--listen", "65536"}},
    {"ServeUnknownDecision", {"serve", "--authorize", "perhaps"}},
    {"ServeBothContents", {"serve", "--cameras", "1", "--replay", "f"}},
    {"ServeNoSuchFile", {"serve", "--listen", "0", "--replay", "/nowhere"}},
    {"ReplayNoSuchFile", {"replay", "/nowhere"}},
    {"ReplayNoRecording", {"replay", "/dev/null"}},
    {"BenchNoRequests", {"bench", "--requests", "0"}},
    {"BenchBadParameter", {"bench", "Go", "x"}},
    {"WatchBadCamera", {"watch", "--camera", "-1"}},
    {"RecordWithoutFile", {"record"}},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, ProgramToolsUsage, testing::ValuesIn(wrongUsages),
                         [](const auto& named) { return std::string(named.param.Name); });

struct VNoNumber
{
    const char* Name;
    std::vector<std::string> Command;
    std::string Range;
};

class ProgramNoNumber : public testing::TestWithParam<VNoNumber>
{
};

TEST_P(ProgramNoNumber, IsRefusedThoughItIsOutsideOfNoRange)
{
    const VOutcome outcome = RunProgram(GetParam().Command);

    EXPECT_EQ(2, outcome.ExitCode);
    EXPECT_THAT(outcome.Errors, HasSubstr("\"nan\" is no number from 0 to " + GetParam().Range));
}

// clang-format off
const VNoNumber noNumbers[] = {
    {"Speed", {"replay", "file", "--speed", "nan"}, "1000000;"},
    {"Delay", {"serve", "--delay", "nan"}, "86400;"},
    {"Thinking", {"serve", "--thinking", "nan"}, "86400;"},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, ProgramNoNumber, testing::ValuesIn(noNumbers),
                         [](const auto& named) { return std::string(named.param.Name); });

TEST(ProgramRecord, StandsBetweenADeviceAndItsHostAndBothCanBeReplayed)
{
    const VTemporaryFolder folder;
    const std::string file = folder.File("stream.jsonl");
    VServedHost host;
    VChildProgram recorder({"--port", host.Port(), "record", file, "--listen", "0"});
    const std::string notice = "say, on port ";
    ASSERT_TRUE(recorder.WaitForError(notice));
    ASSERT_TRUE(recorder.WaitForError("\n"));
    const std::string said = recorder.Errors();
    const std::string port = said.substr(said.find(notice) + notice.size(), said.size());
    const std::vector<std::string> echo = {"run", "Host.Echo", "Text=Hello"};

    EXPECT_EQ("OK\nText=Hello\n", RunProgram(At(port.substr(0, port.find('\n')), echo)).Output);
    recorder.Signal(SIGINT);
    EXPECT_EQ(0, recorder.Finish().ExitCode);

    const std::string text = ReadFile(file);
    EXPECT_THAT(text, StartsWith("{\"recording\":\"korva-control recording\",\"version\":1,"));
    EXPECT_THAT(text, AllOf(HasSubstr("\"what\":\"connected\""), HasSubstr("\"what\":\"device\""),
                            HasSubstr("\"what\":\"host\""), HasSubstr("\"what\":\"closed\"")));
    const VOutcome replayed = RunProgram(At(host.Port(), {"replay", file}));
    EXPECT_EQ("Sent 1, replies 1, differences 0\n", replayed.Output) << replayed.Errors;
    EXPECT_EQ(0, replayed.ExitCode);
    VServedHost again({"--replay", file});
    EXPECT_EQ("OK\nText=Hello\n", RunProgram(At(again.Port(), echo)).Output);
    EXPECT_EQ(1, RunProgram(At(again.Port(), {"run", "Host.Information"})).ExitCode);
}

TEST(ProgramRecord, ListensToTheHostItself)
{
    const VTemporaryFolder folder;
    const std::string file = folder.File("events.jsonl");
    VServedHost host;
    VChildProgram recorder({"--port", host.Port(), "record", file});
    ASSERT_TRUE(recorder.WaitForError("recording what 127.0.0.1:" + host.Port() + " says\n"));

    VChildProgram watcher(At(host.Port(), {"watch", "--count", "1"}));
    ASSERT_TRUE(watcher.WaitForError("watching"));
    RunProgram(At(host.Port(), {"run", "CameraSettings_ToggleTap", "Param_TapEnabled=1"}));
    EXPECT_EQ(0, watcher.Finish().ExitCode); // the event is out
    host.Stop();                             // and everybody has read to the end
    recorder.Signal(SIGTERM);
    EXPECT_EQ(0, recorder.Finish().ExitCode);

    EXPECT_THAT(ReadFile(file), HasSubstr("Event.Cameras.TapToSelectChanged"));
    const VOutcome replayed = RunProgram({"replay", file});
    EXPECT_EQ(3, replayed.ExitCode) << "its own first question is all there is to send, and the "
                                       "host has gone";
}

TEST(ProgramRecord, TouchesNoFileThatIsThere)
{
    const VTemporaryFolder folder;
    const std::string file = folder.File("kept");
    std::ofstream(file) << "precious";
    VServedHost host;

    const VOutcome refused = RunProgram(At(host.Port(), {"record", file}));

    EXPECT_EQ(2, refused.ExitCode);
    EXPECT_THAT(refused.Errors, HasSubstr("is there already; --overwrite replaces it"));
    EXPECT_EQ("precious", ReadFile(file));
    EXPECT_EQ(0,
              RunProgram({"--port", host.Port(), "--timeout", "0.2", "record", file, "--overwrite"})
                  .ExitCode);
    EXPECT_THAT(ReadFile(file), StartsWith("{\"recording\""));
    EXPECT_EQ(2, RunProgram(At(host.Port(), {"record", "/nowhere/file"})).ExitCode);
    EXPECT_EQ(1, RunProgram({"--port", host.Port(), "--timeout", "0.2", "record", "/dev/full",
                             "--overwrite"})
                     .ExitCode);
}

TEST(ProgramRecord, LeavesTheFileAloneWhereItsPortIsTaken)
{
    const VTemporaryFolder folder;
    const std::string file = folder.File("kept");
    std::ofstream(file) << "precious";
    VServedHost host;

    const VOutcome refused =
        RunProgram(At(host.Port(), {"record", file, "--overwrite", "--listen", host.Port()}));

    EXPECT_EQ(3, refused.ExitCode);
    EXPECT_THAT(refused.Errors, HasSubstr("the port cannot be taken"));
    EXPECT_EQ("precious", ReadFile(file));
}

TEST(ProgramRecord, EndsAtOnceWhileTheHostHasNotAnswered)
{
    std::promise<void> asked;
    VScriptedHost host([&](VPeer& peer) {
        peer.ReadFrame();
        asked.set_value();
        peer.ReadToEnd();
    });
    VChildProgram recorder(At(std::to_string(host.Port()), {"record", "/nowhere/file"}));
    asked.get_future().wait();

    recorder.Signal(SIGINT);

    EXPECT_EQ(128 + SIGINT, recorder.Finish().ExitCode);
}

std::string RecordingOf(const std::string& request, const std::string& reply)
{
    const nlohmann::ordered_json lines[] = {
        {{"recording", "korva-control recording"}, {"version", 1}},
        {{"seconds", 0}, {"connection", 1}, {"what", "device"}, {"text", request}},
        {{"seconds", 0.1}, {"connection", 1}, {"what", "host"}, {"text", reply}},
    };
    std::string text;
    for (const auto& line : lines) {
        text += line.dump() + "\n";
    }
    return text;
}

TEST(ProgramReplay, TellsWhereAReplyDiffers)
{
    const VTemporaryFolder folder;
    const std::string file = folder.File("old.jsonl");
    std::ofstream(file) << RecordingOf("<ServerInformation/>", "<Old/>");
    VServedHost host;
    const std::string reply = R"(<?xml version="1.0" encoding="UTF-16" standalone="no"?>)"
                              R"(<ServerInformation><StreamVersion major="1" minor="0"/>)"
                              "</ServerInformation>";

    const VOutcome outcome = RunProgram(At(host.Port(), {"replay", file, "--speed", "0"}));

    EXPECT_EQ(1, outcome.ExitCode) << outcome.Errors;
    EXPECT_EQ("Connection 1, recorded: <Old/>\nConnection 1, received: " + reply +
                  "\nSent 1, replies 1, differences 1\n",
              outcome.Output);
    const VOutcome json = RunProgram(At(host.Port(), {"--json", "replay", file}));
    EXPECT_THAT(json.Output, HasSubstr(R"({"sent":1,"replies":1,"differences":1})"));
    EXPECT_THAT(json.Output, StartsWith(R"({"connection":1,"seconds":0.1,"recorded":"<Old/>",)"));
}

TEST(ProgramReplay, TimesOutWhereAReplyIsMissing)
{
    const VTemporaryFolder folder;
    const std::string file = folder.File("old.jsonl");
    std::ofstream(file) << RecordingOf("<Unknown/>", "<Old/>");
    VServedHost host;

    const VOutcome outcome =
        RunProgram({"--port", host.Port(), "--timeout", "0.2", "replay", file});

    EXPECT_EQ(4, outcome.ExitCode);
    EXPECT_THAT(outcome.Errors, HasSubstr("waiting for the reply that was recorded as <Old/>"));
}

TEST(ProgramRaw, RefusesWithItsReasonWhatAHostWouldDrop)
{
    VServedHost host;

    const VOutcome refused = RunProgram(At(host.Port(), {"raw", "--lint"}), "<Commands/>");
    EXPECT_EQ(2, refused.ExitCode);
    EXPECT_EQ("korva-control: a host would drop this in silence: Commands has no Correlation\n",
              refused.Errors);
    const VOutcome taken = RunProgram(At(host.Port(), {"raw", "--lint"}), "<Events a='1'/>");
    EXPECT_EQ(0, taken.ExitCode);
    EXPECT_EQ("korva-control: warning: attributes are not looked at\n", taken.Errors);
    EXPECT_THAT(taken.Output, HasSubstr("<Events>"));
}

TEST(ProgramBench, PrintsPercentilesOfAClosedLoop)
{
    VServedHost host;

    const VOutcome people = RunProgram(
        At(host.Port(), {"bench", "Host.Echo", "a=b", "--requests", "20", "--connections", "3"}));
    const VOutcome json = RunProgram(At(host.Port(), {"--json", "bench", "--requests", "10"}));

    EXPECT_EQ(0, people.ExitCode) << people.Errors;
    EXPECT_THAT(people.Output, StartsWith("60 requests in "));
    EXPECT_THAT(people.Output, AllOf(HasSubstr("0 failures\np50: "), HasSubstr("\np99.9: ")));
    const auto object = nlohmann::json::parse(json.Output);
    EXPECT_EQ(10, object["requests"]);
    EXPECT_EQ(0, object["failures"]);
    EXPECT_GT(object["requestsPerSecond"], 0);
    EXPECT_LE(object["microseconds"]["p50"], object["microseconds"]["greatest"]);
}

TEST(ProgramBench, EndsWithOneWhereTheHostFails)
{
    VServedHost host;

    const VOutcome outcome = RunProgram(At(host.Port(), {"bench", "Nothing", "--requests", "5"}));

    EXPECT_EQ(1, outcome.ExitCode);
    EXPECT_THAT(outcome.Output, HasSubstr("5 failures"));
    host.Stop();
    EXPECT_EQ(3, RunProgram(At(host.Port(), {"bench"})).ExitCode);
}

TEST(ProgramWatch, ShowsOnlyTheCamerasThatWereChosenWithTheTime)
{
    VServedHost host;
    VChildProgram watcher(
        At(host.Port(), {"watch", "--camera", "2", "--count", "2", "--time", "--camera", "4"}));
    ASSERT_TRUE(watcher.WaitForError("watching"));
    const auto setStrobe = [&](const char* camera) {
        RunProgram(At(host.Port(), {"run", "CameraSettings_SetStrobeIntensity",
                                    std::string("Param_CameraDeviceId=") + camera,
                                    "Param_StrobeIntensity=0.75"}));
    };

    setStrobe("1");
    setStrobe("2");
    const std::string setting = watcher.ReadLine().value_or("nothing"); // else the other overtakes
    RunProgram(
        At(host.Port(), {"run", "CameraSettings_SetSelection", "Param_CameraSelection=1,3"}));
    RunProgram(
        At(host.Port(), {"run", "CameraSettings_SetSelection", "Param_CameraSelection=1,4"}));

    EXPECT_THAT(setting, MatchesRegex("[0-9]{4}-[0-9]{2}-[0-9]{2}T[0-9:]{8}[.][0-9]{3}Z "
                                      "Event.Cameras.SettingChanged CameraId=2 [^\n]*"));
    EXPECT_THAT(watcher.Finish().Output,
                MatchesRegex("[^\n]* Event.Cameras.SelectionChanged SelectedCameraIds=1,4\n"));
}

TEST(ProgramWatch, PutsTheTimeIntoJson)
{
    VServedHost host;
    VChildProgram watcher(At(host.Port(), {"--json", "watch", "Event.Cameras.TapToSelectChanged",
                                           "--count", "1", "--time"}));
    ASSERT_TRUE(watcher.WaitForError("watching"));

    RunProgram(At(host.Port(), {"run", "CameraSettings_ToggleTap", "Param_TapEnabled=1"}));

    EXPECT_THAT(watcher.Finish().Output,
                AllOf(StartsWith(R"({"event":"Event.Cameras.TapToSelectChanged","parameters":)"),
                      EndsWith("Z\"}\n")));
}

} // namespace
