#include "device/ClientSupport.h"
#include "device/ProgramSupport.h"

#include <csignal>
#include <functional>
#include <future>

#include <gmock/gmock.h>

namespace {

using testing::EndsWith;

/// Answers the question with which a watcher makes sure of its place, then goes on.
VScriptedHost::Script Watched(const std::function<void(VPeer&)>& events)
{
    return [events](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(ServerInformationText());
        events(peer);
        peer.ReadToEnd();
    };
}

TEST(ProgramWatch, PrintsEventsOfTheGivenNamesUntilItsCount)
{
    VScriptedHost host(Watched([](VPeer& peer) {
        peer.SendFrame(EventText("A", "1"));
        peer.SendFrame(EventText("Other"));
        peer.SendFrame("<Event><Name>B</Name><Parameters><Parameter><Name>p</Name><Value>x \"y\"\n"
                       "</Value></Parameter><Parameter><Name>q</Name><Value/></Parameter>"
                       "</Parameters></Event>");
        peer.SendFrame(EventText("A", "2"));
    }));

    const VOutcome outcome = RunProgram(At(host, {"watch", "A", "B", "--count", "2"}));

    EXPECT_EQ("A p=1\nB p=\"x \\\"y\\\"\\n\" q=\"\"\n", outcome.Output);
    EXPECT_EQ(0, outcome.ExitCode);
    EXPECT_EQ("korva-control: watching 127.0.0.1:" + std::to_string(host.Port()) + "\n",
              outcome.Errors);
}

TEST(ProgramWatch, PrintsOneJsonObjectALineWithTheParametersInOrder)
{
    VScriptedHost host(Watched([](VPeer& peer) {
        peer.SendFrame("<Event><Name>B</Name><Parameters><Parameter><Name>q</Name><Value>\n</Value>"
                       "</Parameter><Parameter><Name>p</Name><Value/></Parameter></Parameters>"
                       "</Event>");
        peer.SendFrame("<Event><Name>C</Name><Parameters/></Event>");
    }));

    const VOutcome outcome = RunProgram(At(host, {"--json", "watch", "--count", "2"}));

    EXPECT_EQ("{\"event\":\"B\",\"parameters\":{\"q\":\"\\n\",\"p\":\"\"}}\n"
              "{\"event\":\"C\",\"parameters\":{}}\n",
              outcome.Output);
    EXPECT_EQ(0, outcome.ExitCode) << outcome.Errors;
}

TEST(ProgramWatch, EventsBeforeTheNoticeCountToo)
{
    VScriptedHost host([](VPeer& peer) {
        peer.SendFrame(EventText("Early", "1"));
        peer.ReadFrame();
        peer.SendFrame(ServerInformationText());
        peer.ReadToEnd();
    });

    const VOutcome outcome = RunProgram(At(host, {"watch", "--count", "1"}));

    EXPECT_EQ("Early p=1\n", outcome.Output);
    EXPECT_EQ(0, outcome.ExitCode) << outcome.Errors;
}

class ProgramWatchSignal : public testing::TestWithParam<int>
{
};

TEST_P(ProgramWatchSignal, EndsItInOrderAfterEachLineWasFlushed)
{
    VScriptedHost host(Watched([](VPeer& peer) { peer.SendFrame(EventText("A", "1")); }));
    VChildProgram program({"--port", std::to_string(host.Port()), "watch"});

    EXPECT_EQ("A p=1", program.ReadLine());
    program.Signal(GetParam());
    const VOutcome outcome = program.Finish();

    EXPECT_EQ(0, outcome.ExitCode) << outcome.Errors;
    EXPECT_EQ("", outcome.Output);
}

INSTANTIATE_TEST_SUITE_P(Both, ProgramWatchSignal, testing::Values(SIGINT, SIGTERM),
                         [](const auto& test) {
                             return std::string(test.param == SIGINT ? "Interrupt" : "Terminate");
                         });

TEST(ProgramWatch, SignalRightAfterTheNoticeEndsItToo)
{
    VScriptedHost host(Watched([](VPeer&) {}));
    VChildProgram program({"--port", std::to_string(host.Port()), "watch"});

    EXPECT_TRUE(program.WaitForError("watching"));
    program.Signal(SIGINT);

    EXPECT_EQ(0, program.Finish().ExitCode);
}

TEST(ProgramWatch, SignalEndsItAtOnceWhileTheHostHasNotAnswered)
{
    std::promise<void> asked;
    VScriptedHost host([&](VPeer& peer) {
        peer.ReadFrame();
        asked.set_value();
        peer.ReadToEnd();
    });
    VChildProgram program({"--port", std::to_string(host.Port()), "--timeout", "60", "watch"});
    asked.get_future().wait();

    program.Signal(SIGINT);

    EXPECT_EQ(128 + SIGINT, program.Finish().ExitCode);
}

TEST(ProgramWatch, SecondSignalEndsItWhereItsOutputIsStuck)
{
    VScriptedHost host(Watched([](VPeer& peer) {
        while (peer.SendFrame(EventText("A", std::string(1000, 'x')))) {
        }
    }));
    VChildProgram program({"--port", std::to_string(host.Port()), "watch"}, "",
                          VChildProgram::EOutput::NotRead);
    program.WaitUntilOutputIsFull();

    // Two that come at once count as one.
    const auto deadline = std::chrono::steady_clock::now() + Patient;
    while (!program.HasEnded() && std::chrono::steady_clock::now() < deadline) {
        program.Signal(SIGINT);
        std::this_thread::yield();
    }

    EXPECT_TRUE(program.HasEnded());
}

TEST(ProgramWatch, GoesOnWithoutLimitWhereNoTimeIsGivenAndStopsAtOneThatIs)
{
    VScriptedHost host(Watched([](VPeer& peer) { peer.SendFrame(EventText("A", "1")); }));

    const VOutcome outcome =
        RunProgram({"--port", std::to_string(host.Port()), "--timeout", "1.5", "watch"});

    EXPECT_EQ(4, outcome.ExitCode);
    EXPECT_EQ("A p=1\n", outcome.Output);
    EXPECT_THAT(outcome.Errors,
                EndsWith("korva-control: timed out, waiting for an event; 1 came in time\n"));
}

TEST(ProgramWatch, HostThatClosesIsThree)
{
    VScriptedHost host([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(ServerInformationText());
        peer.SendFrame(EventText("Event.Disconnect", "1"));
    });

    const VOutcome outcome = RunProgram({"--port", std::to_string(host.Port()), "watch"});

    EXPECT_EQ(3, outcome.ExitCode);
    EXPECT_EQ("Event.Disconnect p=1\n", outcome.Output);
    EXPECT_THAT(outcome.Errors, EndsWith("korva-control: the host closed the connection\n"));
}

} // namespace
