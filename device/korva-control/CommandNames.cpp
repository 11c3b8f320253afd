#include "korva-control/Commands.h"
#include "korva-control/Session.h"
#include "korva-control/TerminalText.h"

#include <CLI/CLI.hpp>

namespace {

using ControlStream::VClient;

/// Lists names of one sort.
class VCommandNames : public ICommand
{
public:
    using Query = std::vector<std::string> (VClient::*)();

    /// @param commandWord  the command's name, and the key of the list in JSON
    VCommandNames(const char* commandWord, const char* helpText, Query clientQuery)
        : word(commandWord), help(helpText), query(clientQuery)
    {
    }

    CLI::App* AddTo(CLI::App& program) override { return program.add_subcommand(word, help); }

    EExitCode Run(VSession& session) override
    {
        const std::vector<std::string> names = (session.Connect().*query)();

        if (session.Output().IsJson()) {
            session.Output().PrintJson({{word, names}});
            return EExitCode::Done;
        }
        for (const std::string& name : names) {
            session.Output().PrintLine(ForTerminal(name));
        }
        return EExitCode::Done;
    }

private:
    const char* const word;
    const char* const help;
    const Query query;
};

} // namespace

std::unique_ptr<ICommand> MakeCommandCommands()
{
    return std::make_unique<VCommandNames>("commands", "List the host's commands",
                                           &VClient::GetCommands);
}

std::unique_ptr<ICommand> MakeCommandEvents()
{
    return std::make_unique<VCommandNames>("events", "List the host's events", &VClient::GetEvents);
}
