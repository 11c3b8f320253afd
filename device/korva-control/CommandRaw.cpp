#include "korva-control/Commands.h"
#include "korva-control/Session.h"

#include "ControlStreamClient/Lint.h"

#include <iostream>
#include <iterator>

#include <CLI/CLI.hpp>

namespace {

using ControlStream::EErrorKind;
using ControlStream::VClient;
using ControlStream::VError;

class VCommandRaw : public ICommand
{
public:
    CLI::App* AddTo(CLI::App& program) override
    {
        CLI::App* command =
            program.add_subcommand("raw", "Send standard input as one frame and print the reply");
        command->footer("Nothing is checked without --lint. The reply is the first frame that is "
                        "not an event; a host "
                        "answers nothing to what it does not understand, which ends with 4.");
        command->add_flag("--no-reply", noReply,
                          "Wait only until the host has handled the frame, and print nothing");
        command->add_flag("--lint", lint,
                          "Refuse what a host would drop in silence and say why, and warn of what "
                          "it would take otherwise than it looks");
        return command;
    }

    EExitCode Run(VSession& session) override
    {
        const std::string text{std::istreambuf_iterator<char>(std::cin), {}};
        if (lint) {
            Lint(session.Output(), text);
        }
        VClient& client = session.Connect();
        if (noReply) {
            SendOnly(session, client, text);
            return EExitCode::Done;
        }
        const std::string reply = client.ExchangeRaw(text);

        if (session.Output().IsJson()) {
            session.Output().PrintJson({{"reply", reply}});
        } else {
            session.Output().PrintRaw(reply);
        }
        return EExitCode::Done;
    }

private:
    static void Lint(const VOutput& output, const std::string& text)
    {
        const ControlStream::VLintReport report = ControlStream::LintRequest(text);
        if (!report.Refusal.empty()) {
            throw VError(EErrorKind::Usage, "a host would drop this in silence: " + report.Refusal);
        }
        for (const std::string& warning : report.Warnings) {
            output.PrintWarning(warning);
        }
    }

    /// To close at once could take the frame back: a close with something unread resets the
    /// connection.
    static void SendOnly(const VSession& session, VClient& client, const std::string& text)
    {
        client.SendRaw(text);
        if (!client.Finish(session.TimeLimit())) {
            throw VError(EErrorKind::TimedOut,
                         "timed out, waiting for the host to handle the frame and close");
        }
    }

    bool noReply = false;
    bool lint = false;
};

} // namespace

std::unique_ptr<ICommand> MakeCommandRaw()
{
    return std::make_unique<VCommandRaw>();
}
