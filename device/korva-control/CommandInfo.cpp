#include "korva-control/Commands.h"
#include "korva-control/Session.h"
#include "korva-control/TerminalText.h"

#include <CLI/CLI.hpp>

namespace {

class VCommandInfo : public ICommand
{
public:
    CLI::App* AddTo(CLI::App& program) override
    {
        return program.add_subcommand("info", "Ask what the host is");
    }

    EExitCode Run(VSession& session) override
    {
        const ControlStream::VServerInformation information =
            session.Connect().GetServerInformation();

        if (session.Output().IsJson()) {
            session.Output().PrintJson(
                {{"streamVersion", {{"major", information.Major}, {"minor", information.Minor}}}});
        } else {
            session.Output().PrintLine("Control stream " + std::to_string(information.Major) + "." +
                                       std::to_string(information.Minor) + " at " +
                                       ForTerminal(session.Peer()));
        }
        return EExitCode::Done;
    }
};

} // namespace

std::unique_ptr<ICommand> MakeCommandInfo()
{
    return std::make_unique<VCommandInfo>();
}
