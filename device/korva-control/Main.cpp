#include "korva-control/Arguments.h"
#include "korva-control/Commands.h"
#include "korva-control/Session.h"
#include "korva-control/TerminalText.h"

#include "QuorixVersion.h"
#include "utils/StandardStreams.h"

#include <algorithm>
#include <exception>

#include <CLI/CLI.hpp>
#include <unistd.h>

namespace {

using ControlStream::EErrorKind;
using ControlStream::VError;

constexpr const char* ExitCodeHelp = R"(Exit codes:
  0  done
  1  the host answered with a failure, or with something unreadable
  2  wrong usage; nothing was sent
  3  no connection, or the host closed it
  4  timed out)";

EExitCode ExitCodeOf(EErrorKind kind)
{
    switch (kind) {
    case EErrorKind::Usage:
        return EExitCode::WrongUsage;
    case EErrorKind::NoConnection:
    case EErrorKind::Closed:
        return EExitCode::NoConnection;
    case EErrorKind::TimedOut:
        return EExitCode::TimedOut;
    case EErrorKind::Protocol:
        break;
    }
    return EExitCode::HostFailed;
}

std::string CheckSeconds(const std::string& text)
{
    constexpr double year = 365 * 24 * 3600.0;
    double seconds = 0;
    // The comparison is false for what is not a number.
    const bool good = CLI::detail::lexical_cast(text, seconds) && seconds > 0 && seconds <= year;
    return good ? std::string() : "a time limit is a number of seconds above 0";
}

void AddOptions(CLI::App& program, VSessionOptions& options)
{
    program.set_version_flag("--version", "korva-control " QUORIX_VERSION);
    program
        .add_option("--host", options.Host,
                    "The host's name or IPv4 address, or the name under which it advertises itself")
        ->transform(&PlainWord)
        ->capture_default_str();
    program.add_option("--port", options.Port, "The port on which the host listens")
        ->check(CLI::Range(1, 65535))
        ->capture_default_str();
    program.add_flag("--json", options.Json, "Print each result as one JSON object on a line");
    program
        .add_option("--timeout", options.Timeout,
                    "How many seconds connecting, or a request, may take (5)")
        ->type_name("SECONDS")
        ->check(&CheckSeconds);
}

EExitCode RunGuarded(ICommand& command, const VSessionOptions& options)
{
    try {
        VSession session(options);
        return command.Run(session);
    } catch (const VError& error) {
        PrintNotice(error.what());
        return ExitCodeOf(error.Kind());
    } catch (const std::exception& error) {
        PrintNotice(error.what());
        return EExitCode::HostFailed;
    }
}

std::string FailureText(const CLI::App* /*program*/, const CLI::Error& error)
{
    return "korva-control: " + ForTerminal(PlainMessage(error.what())) + "; --help tells more\n";
}

EExitCode Run(int argc, char** argv)
{
    CLI::App program("Drives a motion-capture host over its control stream", "korva-control");
    program.footer(ExitCodeHelp);
    program.require_subcommand(0, 1); // none is refused below, in words of our own
    program.failure_message(&FailureText);
    program.fallthrough(); // the options may stand behind the command as well

    VSessionOptions options;
    AddOptions(program, options);
    const std::vector<std::unique_ptr<ICommand>> commands = MakeCommands();
    std::vector<const CLI::App*> chosen;
    chosen.reserve(commands.size());
    for (const std::unique_ptr<ICommand>& command : commands) {
        chosen.push_back(command->AddTo(program));
    }
    try {
        std::vector<std::string> words = ProtectArguments(argc, argv);
        std::reverse(words.begin(), words.end()); // the parser takes them from the back
        program.parse(words);
    } catch (const CLI::ParseError& error) {
        return program.exit(error) == 0 ? EExitCode::Done : EExitCode::WrongUsage;
    }
    options.IsHostGiven = program.count("--host") > 0;
    for (std::size_t i = 0; i < commands.size(); ++i) {
        if (chosen[i]->parsed()) {
            return RunGuarded(*commands[i], options);
        }
    }
    PrintNotice("a command is needed; --help lists them");
    return EExitCode::WrongUsage;
}

} // namespace

int main(int argc, char** argv)
{
    KVR::FillStandardStreams();
    return static_cast<int>(Run(argc, argv));
}
