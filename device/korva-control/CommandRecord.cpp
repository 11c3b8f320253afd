#include "korva-control/Arguments.h"
#include "korva-control/AwaitedSignals.h"
#include "korva-control/Commands.h"
#include "korva-control/Recorder.h"
#include "korva-control/Session.h"

#include "ControlStreamClient/AsyncClient.h"
#include "ControlStreamClient/HostAddress.h"
#include "FakeHost/ByteProxy.h"

#include <system_error>

#include <CLI/CLI.hpp>

namespace {

using ControlStream::EErrorKind;
using ControlStream::VAsyncClient;
using ControlStream::VError;

class VCommandRecord : public ICommand
{
public:
    CLI::App* AddTo(CLI::App& program) override
    {
        CLI::App* command =
            program.add_subcommand("record", "Record what goes over the stream, with its timing");
        command->footer(
            "Without --listen it listens to the host itself, and records its events. With --listen "
            "it stands between devices and the host, and records both sides, so that \"serve "
            "--replay\" can play the host and \"replay\" the devices. Until Ctrl-C, or for "
            "--timeout seconds. The file has one JSON object a line.");
        command->add_option("FILE", file, "What to write; it must not be there yet")
            ->required()
            ->transform(&PlainWord);
        command->add_flag("--overwrite", overwrite, "The file may be there");
        command->add_option("--listen", listen, "The port for the devices; 0 takes any free one")
            ->transform(WholeNumber(0, 65535))
            ->type_name("PORT");
        return command;
    }

    EExitCode Run(VSession& session) override
    {
        session.Connect().GetServerInformation(); // there is a host at all
        session.Connect().Close();
        const sockaddr_in host = HostSocketAddress(session);
        const VAwaitedSignals signals; // until here a signal ends the program, as any other

        std::optional<VRecorder> recorder;
        Record(session, host, recorder, signals);
        recorder->Finish();
        return EExitCode::Done;
    }

private:
    /// @param recorder  is made once the port is taken, since a file must not suffer where it is
    /// not
    void Record(VSession& session, const sockaddr_in& host, std::optional<VRecorder>& recorder,
                const VAwaitedSignals& signals) const
    {
        FakeHost::VByteProxy proxy = TakePort(host);
        recorder.emplace(file, overwrite, session.Peer());
        proxy.Start([&recorder](unsigned connection) { return recorder->MakeFilter(connection); });
        std::unique_ptr<VAsyncClient> listener;
        if (listen) {
            session.Output().PrintNotice("recording what devices and " + session.Peer() +
                                         " say, on port " + std::to_string(proxy.Port()));
        } else {
            listener = Listen(proxy.Port());
            session.Output().PrintNotice("recording what " + session.Peer() + " says");
        }
        signals.Await(session.IsTimeLimitGiven() ? std::optional(session.TimeLimit())
                                                 : std::nullopt);
    }

    FakeHost::VByteProxy TakePort(const sockaddr_in& host) const
    {
        const auto port = static_cast<std::uint16_t>(listen.value_or(0));
        try {
            return FakeHost::VByteProxy(port, host);
        } catch (const std::system_error& error) {
            throw VError(EErrorKind::NoConnection, error.what());
        }
    }

    static std::unique_ptr<VAsyncClient> Listen(std::uint16_t port)
    {
        ControlStream::VAsyncOptions options;
        options.Port = port;
        auto listener = std::make_unique<VAsyncClient>(options);
        if (!listener->WaitUntilConnected(options.ConnectLimit)) {
            throw VError(EErrorKind::NoConnection, listener->GetStatus().Reason);
        }
        return listener;
    }

    static sockaddr_in HostSocketAddress(VSession& session)
    {
        sockaddr_in address = FakeHost::LoopbackAddress(session.Options().Port);
        address.sin_addr = ControlStream::FindAddresses(
                               session.HostAddress(), ControlStream::VDeadline(session.TimeLimit()))
                               .front();
        return address;
    }

    std::string file;
    bool overwrite = false;
    std::optional<int> listen;
};

} // namespace

std::unique_ptr<ICommand> MakeCommandRecord()
{
    return std::make_unique<VCommandRecord>();
}
