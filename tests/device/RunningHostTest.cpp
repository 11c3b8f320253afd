#include "device/ChildProgram.h"

#include <gmock/gmock.h>

namespace {

using testing::EndsWith;
using testing::HasSubstr;
using testing::StartsWith;
using TestSupport::VHostProcess;

/// The program against a host that runs beside the test, on the port that hosts have.
class RunningHost : public testing::Test
{
protected:
    void SetUp() override { ASSERT_TRUE(host.WaitReady()) << host.Errors(); }

    VHostProcess host;
};

TEST_F(RunningHost, TellsWhatItIs)
{
    const VOutcome outcome = RunProgram({"info"});

    EXPECT_EQ("Control stream 1.0 at 127.0.0.1:803\n", outcome.Output);
    EXPECT_EQ(0, outcome.ExitCode) << outcome.Errors;
    EXPECT_EQ("{\"streamVersion\":{\"major\":1,\"minor\":0}}\n",
              RunProgram({"--host", "localhost", "--json", "info"}).Output);
}

TEST_F(RunningHost, ListsAndDescribesItsCommands)
{
    const VOutcome list = RunProgram({"commands"});
    EXPECT_THAT(list.Output, HasSubstr("Host.Information\nHost.Echo\n"));
    EXPECT_EQ(0, list.ExitCode) << list.Errors;
    EXPECT_THAT(RunProgram({"--json", "commands"}).Output, HasSubstr("\"Host.Echo\""));

    const VOutcome description = RunProgram({"describe", "Host.Echo"});
    EXPECT_EQ("Name: Host.Echo\nDescription: Sends every parameter back as it came.\n"
              "Input parameters:\n  *: Any number of parameters of any names.\n"
              "Reply parameters:\n  *: Each input parameter with its value.\n",
              description.Output);
    EXPECT_EQ(0, description.ExitCode) << description.Errors;

    const VOutcome unknown = RunProgram({"describe", "Nothing.Known"});
    EXPECT_THAT(unknown.Output, HasSubstr("Description: Command not found.\n"));
    EXPECT_EQ(1, unknown.ExitCode);
}

TEST_F(RunningHost, ListsItsCamerasWithTheSettingsThatTheyHave)
{
    EXPECT_EQ("ok", host.Command("select 3"));
    EXPECT_EQ("ok", host.Command("mode 2 6"));

    const VOutcome people = RunProgram({"cameras"});

    EXPECT_EQ("Camera 1: StrobeIntensity=0.5 Threshold=0.25 ShutterDuration=0.1 GreyscaleMode=?\n"
              "Camera 2: StrobeIntensity=0.5 Threshold=0.25 GreyscaleMode=?\n"
              "Camera 3: StrobeIntensity=0.5 ShutterDuration=0.1 GreyscaleMode=? (selected)\n"
              "Camera 4: StrobeIntensity=0.5 Threshold=0.25 ShutterDuration=0.1 GreyscaleMode=?\n",
              people.Output);
    EXPECT_EQ(0, people.ExitCode) << people.Errors;

    EXPECT_EQ("ok", host.Command("add 5"));
    for (const char* const gone : {"1", "2", "4"}) {
        EXPECT_EQ("ok", host.Command(std::string("remove ") + gone));
    }
    EXPECT_EQ("{\"id\":3,\"selected\":true,\"StrobeIntensity\":\"0.5\","
              "\"ShutterDuration\":\"0.1\",\"GreyscaleMode\":null}\n"
              "{\"id\":5,\"selected\":false,\"Threshold\":\"0.25\",\"ShutterDuration\":\"0.1\"}\n",
              RunProgram({"--json", "cameras"}).Output);

    EXPECT_EQ("ok", host.Command("remove 3"));
    EXPECT_EQ("ok", host.Command("remove 5"));
    const VOutcome none = RunProgram({"cameras"});
    EXPECT_EQ("", none.Output);
    EXPECT_EQ(0, none.ExitCode) << none.Errors;
}

TEST_F(RunningHost, ListsItsEventsAndDeliberatelyTellsNothingOfThem)
{
    EXPECT_EQ(0, RunProgram({"events"}).ExitCode);
    EXPECT_THAT(RunProgram({"--json", "events"}).Output, StartsWith("{\"events\":["));

    const VOutcome description = RunProgram({"describe-event", "Any.Event"});
    EXPECT_EQ("Name: \nDescription: \nParameters: none\n", description.Output);
    EXPECT_EQ(0, description.ExitCode) << description.Errors;
}

TEST_F(RunningHost, RunsACommandAndGivesEveryTextBackAsItWas)
{
    const VOutcome outcome = RunProgram({"run", "Host.Echo", "c&d=&lt;&amp;lt;&", "a=<x>'\"",
                                         "b=", "\xD0\xBC=\xE4\xB8\x80 \xF0\x9F\x98\x80 ", "e=1=2"});

    EXPECT_EQ("OK\na=<x>'\"\nb=\nc&d=&lt;&amp;lt;&\ne=1=2\n"
              "\xD0\xBC=\xE4\xB8\x80 \xF0\x9F\x98\x80 \n",
              outcome.Output);
    EXPECT_EQ(0, outcome.ExitCode) << outcome.Errors;
    EXPECT_EQ("{\"command\":\"Host.Echo\",\"result\":\"OK\",\"ok\":true,"
              "\"parameters\":{\"a\":\".\\n\\t.\"}}\n",
              RunProgram({"--json", "run", "Host.Echo", "a=x", "a=.\n\t."}).Output)
        << "the later of two values counts";
}

TEST_F(RunningHost, FailureOfACommandIsOne)
{
    for (const char* const name : {"Nothing.Known", "a&b", "host.echo"}) {
        const VOutcome outcome = RunProgram({"run", name, "p=1"});

        EXPECT_EQ("Error: Invalid command name or command not valid for the host application.\n",
                  outcome.Output);
        EXPECT_EQ(1, outcome.ExitCode) << outcome.Errors;
    }
}

TEST_F(RunningHost, EventsReachAWatcherUntilTheHostStops)
{
    VChildProgram all({"watch"});
    VChildProgram some({"--json", "watch", "Wanted", "--count", "1"});
    ASSERT_TRUE(all.WaitForError("watching 127.0.0.1:803"));
    ASSERT_TRUE(some.WaitForError("watching 127.0.0.1:803"));

    EXPECT_EQ("ok", host.Command("fire Other"));
    EXPECT_EQ("ok", host.Command("fire Wanted b=2 a=1"));

    EXPECT_EQ("Other", all.ReadLine());
    EXPECT_EQ("Wanted a=1 b=2", all.ReadLine());
    const VOutcome outcome = some.Finish();
    EXPECT_EQ("{\"event\":\"Wanted\",\"parameters\":{\"a\":\"1\",\"b\":\"2\"}}\n", outcome.Output);
    EXPECT_EQ(0, outcome.ExitCode) << outcome.Errors;

    EXPECT_EQ("ok", host.Command("quit"));
    const VOutcome end = all.Finish();
    EXPECT_EQ(3, end.ExitCode);
    EXPECT_THAT(end.Errors, EndsWith("korva-control: the host closed the connection\n"));
    EXPECT_EQ(0, host.WaitExit());
}

TEST_F(RunningHost, AnswersARawFrameOrKeepsSilent)
{
    const VOutcome outcome = RunProgram({"raw"}, " <ServerInformation/>\n");
    EXPECT_EQ("<?xml version=\"1.0\" encoding=\"UTF-16\" standalone=\"no\"?><ServerInformation>"
              "<StreamVersion major=\"1\" minor=\"0\"/></ServerInformation>\n",
              outcome.Output);
    EXPECT_EQ(0, outcome.ExitCode) << outcome.Errors;

    EXPECT_EQ(4, RunProgram({"--timeout", "0.2", "raw"}, "<Foo/>").ExitCode);
    EXPECT_EQ(4, RunProgram({"--timeout", "0.2", "raw"}, "\xFF").ExitCode);
    EXPECT_EQ(4, RunProgram({"--timeout", "0.2", "raw"}).ExitCode);
}

TEST_F(RunningHost, RawWithoutReplyEndsOnceTheHostHasHandledTheFrame)
{
    const VOutcome outcome =
        RunProgram({"--timeout", "60", "raw", "--no-reply"},
                   "<ExecuteCommand><Name>Host.Echo</Name><Correlation>1</Correlation>"
                   "</ExecuteCommand>");

    EXPECT_EQ("", outcome.Output);
    EXPECT_EQ(0, outcome.ExitCode) << outcome.Errors;
}

TEST_F(RunningHost, ThatHasGoneIsNoConnection)
{
    EXPECT_EQ("ok", host.Command("quit"));
    EXPECT_EQ(0, host.WaitExit());

    EXPECT_EQ(3, RunProgram({"info"}).ExitCode);
}

} // namespace
