#include "device/ChildProgram.h"
#include "device/ClientSupport.h"
#include "device/DiscoverySupport.h"
#include "device/FullListener.h"
#include "support/TestListener.h"

#include <gmock/gmock.h>

namespace {

using testing::ContainsRegex;
using testing::HasSubstr;
using testing::MatchesRegex;
using testing::Not;
using TestSupport::VHostProcess;

/// What every step's line ends with.
const std::string took = " \\([0-9]+\\.[0-9] ms\\)\n";

const std::string serviceRuns = "ok       DNS-SD service: one is running on this machine" + took;
const std::string nobodyAdvertises =
    "problem  advertisement: no host advertises itself; looked on lo \\(127\\.0\\.0\\.1\\)\\. The "
    "host may not run, may be on another network, or a firewall between may drop multicast to UDP "
    "port 5353" +
    took;
const std::string loopback = "ok       address: '127\\.0\\.0\\.1' is at 127\\.0\\.0\\.1" + took;

/// A port of the loopback interface on which nobody listens.
std::string ClosedPort()
{
    return std::to_string(TestSupport::VTestListener().Port());
}

/// Lets the doctor look at a host that behaves as scripted.
VOutcome ExamineScripted(const VScriptedHost::Script& script, const std::string& seconds = "60")
{
    VScriptedHost host(script);
    return RunProgram({"--host", "127.0.0.1", "--port", std::to_string(host.Port()), "--timeout",
                       seconds, "doctor"});
}

class ProgramDoctor : public VQuietNetwork
{
};

TEST_F(ProgramDoctor, FindsAllWellWithARealHost)
{
    VHostProcess host;
    ASSERT_TRUE(host.WaitReady()) << host.Errors();
    const std::string name = "'Quorix on [^']*'";
    VOutcome outcome = RunProgram({"doctor"});
    const auto deadline = std::chrono::steady_clock::now() + TestSupport::hostLimit;
    while (outcome.Output.find("problem") != std::string::npos &&
           std::chrono::steady_clock::now() < deadline) {
        outcome = RunProgram({"doctor"}); // the advertisement comes a little after the host
    }

    EXPECT_THAT(outcome.Output,
                MatchesRegex(serviceRuns + "ok       advertisement: " + name + " on lo" + took +
                             "ok       address: " + name + " is at 127\\.0\\.0\\.1" + took +
                             "ok       port: 127\\.0\\.0\\.1:803 is open" + took +
                             "ok       answer: a host answers with control stream 1\\.0" + took));
    EXPECT_EQ(0, outcome.ExitCode) << outcome.Errors;
}

TEST_F(ProgramDoctor, SaysThatNobodyAdvertisesAndThatThePortIsClosed)
{
    const std::string port = ClosedPort();

    const VOutcome outcome = RunProgram({"--port", port, "doctor"});

    EXPECT_THAT(
        outcome.Output,
        MatchesRegex(serviceRuns + nobodyAdvertises + loopback +
                     "problem  port: 127\\.0\\.0\\.1:" + port +
                     " is closed: the machine is there, but nothing listens on this port\\. "
                     "Is the host running, and may it bind the port\\?" +
                     took));
    EXPECT_EQ(3, outcome.ExitCode);
}

TEST_F(ProgramDoctor, PrintsEachStepAsJson)
{
    const VOutcome outcome = RunProgram({"--json", "--port", ClosedPort(), "doctor"});

    EXPECT_THAT(outcome.Output,
                MatchesRegex("\\{\"step\":\"DNS-SD service\",\"ok\":true,\"milliseconds\":[0-9.]+,"
                             "\"text\":\"[^\"]+\"\\}\n"
                             "\\{\"step\":\"advertisement\",\"ok\":false,[^\n]*\\}\n"
                             "\\{\"step\":\"address\",\"ok\":true,[^\n]*\\}\n"
                             "\\{\"step\":\"port\",\"ok\":false,[^\n]*\\}\n"));
}

TEST_F(ProgramDoctor, SaysThatNothingComesBackFromAPort)
{
    const VFullListener listener(INADDR_LOOPBACK);

    const VOutcome outcome =
        RunProgram({"--host", "127.0.0.1", "--port", std::to_string(listener.Port()), "--timeout",
                    "0.3", "doctor"});

    EXPECT_THAT(outcome.Output, HasSubstr(" is filtered: nothing comes back at all. The machine "
                                          "may be off, or a firewall drops what is sent to this "
                                          "port ("));
    EXPECT_EQ(3, outcome.ExitCode);
}

TEST_F(ProgramDoctor, SaysThatAnAddressCannotBeReached)
{
    // Of this network only the loopback interface is there.
    const VOutcome outcome = RunProgram({"--host", "10.0.0.1", "doctor"});

    EXPECT_THAT(outcome.Output,
                HasSubstr("problem  port: 10.0.0.1:803 cannot be reached: Network is unreachable"));
    EXPECT_EQ(3, outcome.ExitCode);
}

TEST_F(ProgramDoctor, SaysThatWhatListensDoesNotAnswer)
{
    const VOutcome outcome = ExamineScripted([](VPeer& peer) { peer.ReadToEnd(); }, "0.3");

    EXPECT_THAT(outcome.Output, ContainsRegex("ok       port: 127\\.0\\.0\\.1:[0-9]+ is open"));
    EXPECT_THAT(outcome.Output,
                ContainsRegex("problem  answer: something listens on 127\\.0\\.0\\.1:[0-9]+, but "
                              "does not answer in this protocol: timed out after 0\\.3 s"));
    EXPECT_EQ(4, outcome.ExitCode);
}

TEST_F(ProgramDoctor, SaysThatWhatListensHangsUp)
{
    const VOutcome outcome = ExamineScripted([](VPeer&) {});

    EXPECT_THAT(outcome.Output,
                ContainsRegex("problem  answer: what listens on 127\\.0\\.0\\.1:[0-9]+ hangs up "
                              "instead of answering: "));
    EXPECT_EQ(3, outcome.ExitCode);
}

TEST_F(ProgramDoctor, SaysThatWhatListensSpeaksAnotherProtocol)
{
    const VOutcome outcome = ExamineScripted([](VPeer& peer) {
        peer.Send("HTTP/1.1 400 Bad Request\r\n\r\n");
        peer.ReadToEnd();
    });

    EXPECT_THAT(outcome.Output,
                ContainsRegex("problem  answer: what listens on 127\\.0\\.0\\.1:[0-9]+ speaks "
                              "another protocol: "));
    EXPECT_EQ(1, outcome.ExitCode);
}

TEST_F(ProgramDoctor, LooksAtEveryHostThatAdvertisesItselfWhereNoneIsNamed)
{
    const VAdvertiser first("Stage 1", "one.local", "127.0.0.5");
    const VAdvertiser second("Stage 2", "two.local", "127.0.0.6");

    const VOutcome outcome = RunProgram({"--port", ClosedPort(), "doctor"});

    EXPECT_THAT(outcome.Output,
                HasSubstr("ok       advertisement: 'Stage 1' on lo, 'Stage 2' on lo ("));
    EXPECT_THAT(outcome.Output, HasSubstr("ok       address: 'Stage 1' is at 127.0.0.5 ("));
    EXPECT_THAT(outcome.Output, HasSubstr("ok       address: 'Stage 2' is at 127.0.0.6 ("));
    EXPECT_THAT(outcome.Output, Not(HasSubstr("127.0.0.1")));
}

TEST_F(ProgramDoctor, LooksAtTheHostThatIsNamedByItsService)
{
    const VAdvertiser first("Stage 1", "one.local", "127.0.0.5");
    const VAdvertiser second("Stage 2", "two.local", "127.0.0.6");

    const VOutcome outcome = RunProgram({"--host", "Stage 2", "--port", ClosedPort(), "doctor"});

    EXPECT_THAT(outcome.Output, HasSubstr("ok       address: 'Stage 2' is at 127.0.0.6 ("));
    EXPECT_THAT(outcome.Output, Not(HasSubstr("address: 'Stage 1'")));
}

TEST_F(ProgramDoctor, SaysThatAHostAdvertisesNoAddressThatCanBeUsed)
{
    const VAdvertiser advertiser("Stage", "six.local", "fd00::5");

    const VOutcome outcome = RunProgram({"doctor"});

    EXPECT_THAT(outcome.Output,
                HasSubstr("problem  address: 'Stage' advertises no IPv4 address ("));
    EXPECT_EQ(3, outcome.ExitCode);
}

TEST_F(ProgramDoctor, SaysThatANameIsUnknown)
{
    const VOutcome outcome = RunProgram({"--host", "Stage 9", "doctor"});

    EXPECT_THAT(outcome.Output,
                HasSubstr("problem  address: no host advertises itself as 'Stage 9' ("));
    EXPECT_EQ(3, outcome.ExitCode);
}

} // namespace
