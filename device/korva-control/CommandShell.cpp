#include "korva-control/Arguments.h"
#include "korva-control/Commands.h"
#include "korva-control/Session.h"
#include "korva-control/Shell.h"

#include <cstdlib>

#include <CLI/CLI.hpp>

namespace {

/// Where the history lies unless the user says otherwise; empty without a home.
std::string DefaultHistoryFile()
{
    const char* const state = std::getenv("XDG_STATE_HOME");
    const char* const home = std::getenv("HOME");
    if (state != nullptr && *state == '/') {
        return std::string(state) + "/korva-control/history";
    }
    if (home != nullptr && *home == '/') {
        return std::string(home) + "/.local/state/korva-control/history";
    }
    return std::string();
}

class VCommandShell : public ICommand
{
public:
    CLI::App* AddTo(CLI::App& program) override
    {
        CLI::App* command = program.add_subcommand("shell", "Talk with the host, line by line");
        command->footer(
            "The Tab key completes commands, parameters and events by what the host tells; events "
            "appear as they come. Sends a heartbeat every second, and connects again by itself. "
            "With --id it asks for the authorization.");
        auto* const id =
            command->add_option("--id", identity.Id, "The device's id")->transform(&PlainWord);
        command->add_option("--name", identity.Name, "The device's name for the operator")
            ->transform(&PlainWord)
            ->needs(id);
        command->add_option("--history", history, "Where the history is kept; empty for none")
            ->transform(&PlainWord)
            ->type_name("FILE");
        return command;
    }

    EExitCode Run(VSession& session) override
    {
        VShellOptions options;
        options.Client.Host = session.HostAddress();
        options.Client.Port = session.Options().Port;
        options.Client.TimeLimit = session.TimeLimit();
        options.Client.ConnectLimit = session.TimeLimit();
        options.Client.BeatsAlways = true;
        if (!identity.Id.empty()) {
            options.Client.Device = identity;
        }
        options.HistoryFile = history.value_or(DefaultHistoryFile());
        options.Peer = session.Peer();

        VShell(options, session.Output()).Run();
        return EExitCode::Done;
    }

private:
    ControlStream::VDeviceIdentity identity;
    std::optional<std::string> history;
};

} // namespace

std::unique_ptr<ICommand> MakeCommandShell()
{
    return std::make_unique<VCommandShell>();
}
