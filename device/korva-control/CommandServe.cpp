#include "korva-control/Arguments.h"
#include "korva-control/AwaitedSignals.h"
#include "korva-control/Commands.h"
#include "korva-control/Session.h"

#include "FakeHost/FakeHost.h"
#include "FakeHost/Faults.h"
#include "FakeHost/RecordedContent.h"
#include "FakeHost/SimulatedContent.h"

#include <cmath>
#include <fstream>
#include <limits>
#include <map>

#include <CLI/CLI.hpp>

namespace {

using ControlStream::EErrorKind;
using ControlStream::VError;
using FakeHost::EDecision;

const std::map<std::string, EDecision> Decisions{
    {"allow", EDecision::Allow},          {"deny", EDecision::Deny},
    {"ask-allow", EDecision::AskAllow},   {"ask-deny", EDecision::AskDeny},
    {"ask-nobody", EDecision::AskNobody},
};

constexpr int SecondsOfADay = 86400;
constexpr std::uint64_t MostBytes = std::numeric_limits<std::uint64_t>::max();

/// A host, behind a proxy where there are faults.
class VServing
{
public:
    VServing(std::unique_ptr<FakeHost::IFakeContent> content, std::uint16_t port,
             const FakeHost::VFaults& faults)
        : host(std::make_unique<FakeHost::VFakeHost>(std::move(content),
                                                     faults.Any() ? std::uint16_t(0) : port))
    {
        if (faults.Any()) {
            proxy = std::make_unique<FakeHost::VByteProxy>(
                port, FakeHost::LoopbackAddress(host->Port()), [faults](unsigned connection) {
                    return FakeHost::MakeFaultFilter(faults, connection);
                });
        }
    }

    std::uint16_t Port() const { return proxy ? proxy->Port() : host->Port(); }

private:
    std::unique_ptr<FakeHost::VFakeHost> host;
    std::unique_ptr<FakeHost::VByteProxy> proxy; // goes first
};

class VCommandServe : public ICommand
{
public:
    CLI::App* AddTo(CLI::App& program) override
    {
        CLI::App* command = program.add_subcommand("serve", "Play a host, for devices under test");
        command->footer(
            "Simulated cameras answer on the port, with the protocol of a real host, until Ctrl-C "
            "or "
            "for --timeout seconds. Faults are those of a byte proxy before it; several may be "
            "chosen. Whether others than this machine can connect is a matter of its firewall.");
        command->add_option("--listen", listen, "The port to listen on; 0 takes any free one")
            ->transform(WholeNumber(0, 65535))
            ->type_name("PORT");
        AddContent(*command);
        AddFaults(*command);
        return command;
    }

    EExitCode Run(VSession& session) override
    {
        const VAwaitedSignals signals;
        std::unique_ptr<FakeHost::IFakeContent> content = MakeContent();
        const auto port = static_cast<std::uint16_t>(listen.value_or(session.Options().Port));
        const VServing serving = Listen(std::move(content), port);
        PrintPort(session.Output(), serving.Port());
        signals.Await(session.IsTimeLimitGiven() ? std::optional(session.TimeLimit())
                                                 : std::nullopt);
        return EExitCode::Done;
    }

private:
    void AddContent(CLI::App& command)
    {
        auto* const simulated =
            command.add_option("--cameras", cameras, "How many simulated cameras there are")
                ->transform(WholeNumber(0, 1000))
                ->capture_default_str();
        auto* const decides =
            command
                .add_option("--authorize", decision,
                            "What becomes of a device that asks for authorization")
                ->check(CLI::IsMember(Decisions).description(""))
                ->type_name("allow|deny|ask-allow|ask-deny|ask-nobody");
        command
            .add_option("--thinking", thinking, "How many seconds the operator takes, where asked")
            ->check(CheckNumber(SecondsOfADay))
            ->type_name("SECONDS")
            ->capture_default_str();
        command.add_option("--replay", recording, "Say again what the host said in this recording")
            ->transform(&PlainWord)
            ->type_name("FILE")
            ->excludes(simulated)
            ->excludes(decides);
    }

    void AddFaults(CLI::App& command)
    {
        const std::string group = "Faults";
        command.add_option("--delay", delay, "The host's bytes come so many seconds late")
            ->check(CheckNumber(SecondsOfADay))
            ->type_name("SECONDS")
            ->group(group);
        command
            .add_option("--cut-after", cutAfter,
                        "The connection is closed behind so many bytes of the host's")
            ->transform(WholeNumber(0, MostBytes))
            ->type_name("BYTES")
            ->group(group);
        command
            .add_option("--garbage-after", garbageAfter,
                        "What follows so many bytes of the host's is noise")
            ->transform(WholeNumber(0, MostBytes))
            ->type_name("BYTES")
            ->group(group);
        command.add_flag("--never-reply", neverReply, "Nothing of the host's arrives")
            ->group(group);
        command.add_flag("--never-read", neverRead, "Nothing of the device's is read")
            ->group(group);
        command
            .add_option("--faulty", faulty,
                        "Only so many connections are faulty, the first ones; all where it is not "
                        "given")
            ->transform(WholeNumber(1, 1000000))
            ->type_name("COUNT")
            ->group(group);
    }

    std::unique_ptr<FakeHost::IFakeContent> MakeContent() const
    {
        if (recording.empty()) {
            return FakeHost::MakeSimulatedContent(
                cameras,
                {Decisions.at(decision), std::chrono::milliseconds(std::lround(thinking * 1000))});
        }
        std::ifstream file(recording, std::ios::binary);
        if (!file) {
            throw VError(EErrorKind::Usage, recording + " cannot be read");
        }
        return FakeHost::MakeRecordedContent(FakeHost::ReadRecording(file, recording));
    }

    VServing Listen(std::unique_ptr<FakeHost::IFakeContent> content, std::uint16_t port) const
    {
        try {
            return VServing(std::move(content), port, MakeFaults());
        } catch (const std::runtime_error& error) {
            throw VError(EErrorKind::NoConnection, error.what());
        }
    }

    FakeHost::VFaults MakeFaults() const
    {
        FakeHost::VFaults faults;
        faults.Delay = std::chrono::milliseconds(std::lround(delay * 1000));
        faults.CutAfter = cutAfter;
        faults.GarbageAfter = garbageAfter;
        faults.NeverReplies = neverReply;
        faults.NeverReads = neverRead;
        faults.Connections = faulty.value_or(faults.Connections);
        return faults;
    }

    static void PrintPort(VOutput& output, std::uint16_t port)
    {
        if (output.IsJson()) {
            output.PrintJson({{"listening", port}});
        } else {
            output.PrintLine("listening on port " + std::to_string(port));
        }
    }

    std::optional<int> listen;
    std::uint32_t cameras = 4;
    std::string decision = "allow";
    double thinking = 1;
    std::string recording;
    double delay = 0;
    std::optional<std::uint64_t> cutAfter;
    std::optional<std::uint64_t> garbageAfter;
    bool neverReply = false;
    bool neverRead = false;
    std::optional<unsigned> faulty;
};

} // namespace

std::unique_ptr<ICommand> MakeCommandServe()
{
    return std::make_unique<VCommandServe>();
}
