#include "ControlStreamClient/Requests.h"
#include "korva-control/Arguments.h"
#include "korva-control/Assignments.h"
#include "korva-control/Commands.h"
#include "korva-control/Session.h"
#include "korva-control/TerminalText.h"

#include <CLI/CLI.hpp>

namespace {

using ControlStream::VCommandReply;
using ControlStream::VParameter;

class VCommandRun : public ICommand
{
public:
    CLI::App* AddTo(CLI::App& program) override
    {
        CLI::App* command = program.add_subcommand("run", "Run a command of the host");
        command->footer("Ends with 1 where the host answers with a failure.");
        command->add_option("NAME", name, "The command's name")->required()->transform(&PlainWord);
        command->add_option("PARAMETER", assignments, "NAME=VALUE, as many as there are")
            ->transform(&PlainWord);
        return command;
    }

    EExitCode Run(VSession& session) override
    {
        const ControlStream::VParameters parameters = ParseAssignments(assignments);
        ControlStream::MakeExecuteCommandRequest("1", name, parameters); // refuses early
        const VCommandReply reply = session.Connect().ExecuteCommand(name, parameters);

        Print(session.Output(), reply);
        return reply.Ok ? EExitCode::Done : EExitCode::HostFailed;
    }

private:
    void Print(VOutput& output, const VCommandReply& reply) const
    {
        if (output.IsJson()) {
            output.PrintJson({{"command", name},
                              {"result", reply.Result},
                              {"ok", reply.Ok},
                              {"parameters", ToJson(reply.Parameters)}});
            return;
        }
        output.PrintLine(ForTerminal(reply.Result));
        for (const VParameter& parameter : reply.Parameters) {
            output.PrintLine(ForTerminal(parameter.Name) + "=" + ForTerminal(parameter.Value));
        }
    }

    std::string name;
    std::vector<std::string> assignments;
};

} // namespace

std::unique_ptr<ICommand> MakeCommandRun()
{
    return std::make_unique<VCommandRun>();
}
