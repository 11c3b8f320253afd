#include "ControlStreamClient/Requests.h"
#include "korva-control/Arguments.h"
#include "korva-control/Commands.h"
#include "korva-control/Session.h"
#include "korva-control/TerminalText.h"

#include <CLI/CLI.hpp>

namespace {

using ControlStream::VParameterInformation;

// What every host writes for a command that it does not describe. There is no other sign of it.
constexpr const char* NotFound = "Command not found.";

void PrintField(VOutput& output, const char* field, const std::string& text)
{
    output.PrintLine(std::string(field) + ForTerminal(text));
}

void PrintParameters(VOutput& output, const char* title,
                     const std::vector<VParameterInformation>& parameters)
{
    output.PrintLine(std::string(title) + (parameters.empty() ? " none" : ""));
    for (const VParameterInformation& parameter : parameters) {
        output.PrintLine("  " + ForTerminal(parameter.Name) + ": " +
                         ForTerminal(parameter.Description));
    }
}

class VCommandDescribe : public ICommand
{
public:
    CLI::App* AddTo(CLI::App& program) override
    {
        CLI::App* command = program.add_subcommand("describe", "Describe a command of the host");
        command->footer(
            "Ends with 1 where the host has no description. Some commands, those of the "
            "authorization among them, can be run all the same.");
        command->add_option("NAME", name, "The command's name")->required()->transform(&PlainWord);
        return command;
    }

    EExitCode Run(VSession& session) override
    {
        ControlStream::MakeCommandInformationRequest("1", name); // refuses before connecting
        const ControlStream::VCommandInformation information =
            session.Connect().GetCommandInformation(name);

        Print(session.Output(), information);
        return information.Description == NotFound ? EExitCode::HostFailed : EExitCode::Done;
    }

private:
    static void Print(VOutput& output, const ControlStream::VCommandInformation& information)
    {
        if (output.IsJson()) {
            output.PrintJson({{"name", information.Name},
                              {"description", information.Description},
                              {"inputParameters", ToJson(information.InputParameters)},
                              {"replyParameters", ToJson(information.ReplyParameters)}});
            return;
        }
        PrintField(output, "Name: ", information.Name);
        PrintField(output, "Description: ", information.Description);
        PrintParameters(output, "Input parameters:", information.InputParameters);
        PrintParameters(output, "Reply parameters:", information.ReplyParameters);
    }

    std::string name;
};

class VCommandDescribeEvent : public ICommand
{
public:
    CLI::App* AddTo(CLI::App& program) override
    {
        CLI::App* command =
            program.add_subcommand("describe-event", "Describe an event of the host");
        command->footer("Hosts commonly tell nothing, also of events that they send.");
        command->add_option("NAME", name, "The event's name")->required()->transform(&PlainWord);
        return command;
    }

    EExitCode Run(VSession& session) override
    {
        ControlStream::MakeEventInformationRequest(name); // refuses before connecting
        const ControlStream::VEventInformation information =
            session.Connect().GetEventInformation(name);

        Print(session.Output(), information);
        return EExitCode::Done;
    }

private:
    static void Print(VOutput& output, const ControlStream::VEventInformation& information)
    {
        if (output.IsJson()) {
            output.PrintJson({{"name", information.Name},
                              {"description", information.Description},
                              {"parameters", ToJson(information.Parameters)}});
            return;
        }
        PrintField(output, "Name: ", information.Name);
        PrintField(output, "Description: ", information.Description);
        PrintParameters(output, "Parameters:", information.Parameters);
    }

    std::string name;
};

} // namespace

std::unique_ptr<ICommand> MakeCommandDescribe()
{
    return std::make_unique<VCommandDescribe>();
}

std::unique_ptr<ICommand> MakeCommandDescribeEvent()
{
    return std::make_unique<VCommandDescribeEvent>();
}
