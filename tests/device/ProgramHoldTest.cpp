#include "device/ClientSupport.h"
#include "device/ProgramSupport.h"

#include <gmock/gmock.h>

// korva-control authorize --hold against a host that goes away while it is asked.

namespace {

using testing::EndsWith;
using testing::HasSubstr;

const std::vector<std::string> hold = {"authorize", "--id", "a", "--name", "Ann", "--hold"};
const std::string farewell = "the host goes away\n";

/// Lets the device in, and has a script do something with its first beat.
void Serve(VPeer& peer, const std::function<void(const std::string& correlation)>& atBeat)
{
    while (const auto request = peer.ReadFrameOrEnd()) {
        const std::size_t at = request->find("<Correlation>") + 13;
        const std::string correlation = request->substr(at, request->find('<', at) - at);
        if (request->find("System.Heartbeat") != std::string::npos) {
            atBeat(correlation);
            return;
        }
        peer.SendFrame(Declaration + ("<CommandReply><Name>Go</Name><Correlation>" + correlation) +
                       "</Correlation><Result>OK</Result><Parameters><Parameter><Name>Status</Name>"
                       "<Value>Authorized</Value></Parameter></Parameters></CommandReply>");
    }
}

} // namespace

TEST(ProgramHold, HearsOfTheEndBehindABeatThatFailed)
{
    VScriptedHost host([](VPeer& peer) {
        Serve(peer, [&](const std::string& correlation) {
            peer.SendFrame(ReplyText(correlation, "Error: Invalid command name"));
            peer.SendFrame(EventText("Event.Other"));
            peer.SendFrame(EventText("Event.Disconnect"));
        });
    });

    const VOutcome outcome = RunProgram(At(host, hold));

    EXPECT_THAT(outcome.Output, EndsWith(farewell));
    EXPECT_EQ("", outcome.Errors);
    EXPECT_EQ(3, outcome.ExitCode);
    EXPECT_EQ("", host.Finish());
}

TEST(ProgramHold, HearsOfTheEndInPlaceOfAReply)
{
    VScriptedHost host([](VPeer& peer) {
        Serve(peer, [&](const std::string&) { peer.SendFrame(EventText("Event.Disconnect")); });
    });

    const VOutcome outcome = RunProgram(At(host, hold));

    EXPECT_THAT(outcome.Output, EndsWith(farewell));
    EXPECT_EQ(3, outcome.ExitCode) << outcome.Errors;
}

TEST(ProgramHold, TellsWhatFailedWhereTheHostSaysNoMore)
{
    VScriptedHost host([](VPeer& peer) {
        Serve(peer, [&](const std::string& correlation) {
            peer.SendFrame(ReplyText(correlation, "Error: no"));
        });
    });

    const VOutcome outcome = RunProgram(At(host, hold));

    EXPECT_THAT(outcome.Errors, HasSubstr("System.Heartbeat as it should: Error: no"));
    EXPECT_EQ(1, outcome.ExitCode);
}

TEST(ProgramHold, TellsWhatFailedThoughEventsNeverEnd)
{
    VScriptedHost host([](VPeer& peer) {
        Serve(peer, [&](const std::string& correlation) {
            peer.SendFrame(ReplyText(correlation, "Error: no"));
            while (peer.SendFrame(EventText("Event.Other"))) {
            }
        });
    });

    EXPECT_EQ(1, RunProgram(At(host, hold)).ExitCode);
}
