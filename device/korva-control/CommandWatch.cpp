#include "korva-control/Arguments.h"
#include "korva-control/Commands.h"
#include "korva-control/EventLine.h"
#include "korva-control/Session.h"
#include "korva-control/StopSignals.h"

#include <algorithm>
#include <limits>

#include <CLI/CLI.hpp>

namespace {

using ControlStream::EErrorKind;
using ControlStream::VClient;
using ControlStream::VError;
using ControlStream::VEvent;

constexpr std::uint64_t Endless = std::numeric_limits<std::uint64_t>::max();

class VCommandWatch : public ICommand
{
public:
    CLI::App* AddTo(CLI::App& program) override
    {
        CLI::App* command =
            program.add_subcommand("watch", "Print the host's events as they come, until Ctrl-C");
        command->footer(
            "A --timeout that is given bounds the whole of it; without one it goes on.");
        command->add_option("EVENT", names, "Only events of these names; all where none is given")
            ->transform(&PlainWord);
        command
            ->add_option("--camera", cameras, "Only events about these cameras, by their numbers")
            ->transform(WholeNumber(0, std::numeric_limits<std::uint32_t>::max()))
            ->type_name("NUMBER")
            ->allow_extra_args(false); // behind it stand the names of events
        command->add_flag("--time", stamps, "Print the time of each event, in universal time");
        command->add_option("--count", count, "End after so many events")
            ->transform(WholeNumber(1, Endless));
        return command;
    }

    EExitCode Run(VSession& session) override
    {
        VClient& client = session.Connect();
        // A host that answers has entered this connection among those that hear events, so that
        // none is missed from the notice on.
        client.GetServerInformation();
        const VStopSignals stop(client); // until here a signal ends the program, as any other
        session.Output().PrintNotice("watching " + session.Peer());

        const auto start = std::chrono::steady_clock::now();
        std::uint64_t seen = 0;
        while (seen < count && !stop.IsRequested()) {
            const std::chrono::milliseconds left = TimeLeft(session, start);
            const std::optional<VEvent> event = client.WaitForEvent(left);
            if (event && IsWanted(*event)) {
                Print(session.Output(), *event);
                ++seen;
            } else if (!stop.IsRequested() && left <= std::chrono::milliseconds::zero()) {
                throw VError(EErrorKind::TimedOut, "timed out, waiting for an event; " +
                                                       std::to_string(seen) + " came in time");
            }
        }
        return EExitCode::Done;
    }

private:
    static std::chrono::milliseconds TimeLeft(const VSession& session,
                                              std::chrono::steady_clock::time_point start)
    {
        if (!session.IsTimeLimitGiven()) {
            return ControlStream::NoLimit;
        }
        const auto left = session.TimeLimit() - (std::chrono::steady_clock::now() - start);
        return std::max(std::chrono::ceil<std::chrono::milliseconds>(left),
                        std::chrono::milliseconds::zero());
    }

    bool IsWanted(const VEvent& event) const
    {
        const bool byName =
            names.empty() || std::find(names.begin(), names.end(), event.Name) != names.end();
        const auto isAbout = [&event](std::uint32_t camera) {
            return IsAboutCamera(event, camera);
        };
        return byName && (cameras.empty() || std::any_of(cameras.begin(), cameras.end(), isAbout));
    }

    void Print(VOutput& output, const VEvent& event) const
    {
        const std::string time =
            stamps ? TimeStamp(std::chrono::system_clock::now()) : std::string();
        if (output.IsJson()) {
            VJson object = {{"event", event.Name}, {"parameters", ToJson(event.Parameters)}};
            if (stamps) {
                object["time"] = time;
            }
            output.PrintJson(object);
            return;
        }
        output.PrintLine((stamps ? time + " " : std::string()) + EventLine(event));
    }

    std::vector<std::string> names;
    std::vector<std::uint32_t> cameras;
    bool stamps = false;
    std::uint64_t count = Endless;
};

} // namespace

std::unique_ptr<ICommand> MakeCommandWatch()
{
    return std::make_unique<VCommandWatch>();
}
