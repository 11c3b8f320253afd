#include "korva-control/Arguments.h"
#include "korva-control/Commands.h"
#include "korva-control/Replayer.h"
#include "korva-control/Session.h"
#include "korva-control/TerminalText.h"

#include <algorithm>
#include <fstream>

#include <CLI/CLI.hpp>

namespace {

using ControlStream::EErrorKind;
using ControlStream::VError;
using FakeHost::ERecorded;
using FakeHost::VRecordedMoment;

class VCommandReplay : public ICommand
{
public:
    CLI::App* AddTo(CLI::App& program) override
    {
        CLI::App* command =
            program.add_subcommand("replay", "Play the devices of a recording against the host");
        command->footer(
            "Sends what the devices sent, at its time, and compares each reply with the recorded "
            "one; events are not compared. Ends with 1 where a reply differs.");
        command->add_option("FILE", file, "What \"record\" wrote")
            ->required()
            ->transform(&PlainWord);
        command->add_option("--speed", speed, "How many times as fast; 0 leaves out the pauses")
            ->check(CheckNumber(1000000))
            ->type_name("FACTOR")
            ->capture_default_str();
        return command;
    }

    EExitCode Run(VSession& session) override
    {
        const std::vector<VRecordedMoment> moments = Read();
        std::size_t differences = 0;
        VReplayer replayer(
            {session.HostAddress(), session.Options().Port, session.TimeLimit(), speed},
            [&](const VReplayDifference& difference) {
                ++differences;
                Print(session.Output(), difference);
            });
        const std::size_t sent = replayer.Play(moments);

        PrintSummary(session.Output(), sent, replayer.Replies(), differences);
        return differences == 0 ? EExitCode::Done : EExitCode::HostFailed;
    }

private:
    std::vector<VRecordedMoment> Read() const
    {
        std::ifstream input(file, std::ios::binary);
        if (!input) {
            throw VError(EErrorKind::Usage, file + " cannot be read");
        }
        std::vector<VRecordedMoment> moments = FakeHost::ReadRecording(input, file);
        const bool any = std::any_of(moments.begin(), moments.end(), [](const auto& moment) {
            return moment.Kind == ERecorded::Device;
        });
        if (!any) {
            throw VError(EErrorKind::Usage,
                         file + " holds nothing that a device sent; serve --replay plays the host");
        }
        return moments;
    }

    static void Print(VOutput& output, const VReplayDifference& difference)
    {
        if (output.IsJson()) {
            output.PrintJson({{"connection", difference.Connection},
                              {"seconds", difference.Seconds},
                              {"recorded", difference.Recorded},
                              {"received", difference.Received}});
            return;
        }
        output.PrintLine("Connection " + std::to_string(difference.Connection) +
                         ", recorded: " + ForTerminal(difference.Recorded));
        output.PrintLine("Connection " + std::to_string(difference.Connection) +
                         ", received: " + ForTerminal(difference.Received));
    }

    static void PrintSummary(VOutput& output, std::size_t sent, std::size_t replies,
                             std::size_t differences)
    {
        if (output.IsJson()) {
            output.PrintJson({{"sent", sent}, {"replies", replies}, {"differences", differences}});
        } else {
            output.PrintLine("Sent " + std::to_string(sent) + ", replies " +
                             std::to_string(replies) + ", differences " +
                             std::to_string(differences));
        }
    }

    std::string file;
    double speed = 1;
};

} // namespace

std::unique_ptr<ICommand> MakeCommandReplay()
{
    return std::make_unique<VCommandReplay>();
}
