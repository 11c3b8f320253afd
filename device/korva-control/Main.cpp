#include "korva-control/Arguments.h"
#include "korva-control/Commands.h"
#include "korva-control/Session.h"

#include "QuorixVersion.h"
#include "utils/StandardStreams.h"

#include <algorithm>
#include <exception>
#include <iostream>

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
        ->transform(WholeNumber(1, 65535))
        ->capture_default_str();
    program.add_flag("--json", options.Json, "Print each result as one JSON object on a line");
    program
        .add_option("--timeout", options.Timeout,
                    "How many seconds connecting, or a request, may take (5)")
        ->type_name("SECONDS")
        ->check(&CheckSeconds);
}

EExitCode Fail(const VOutput& output, const std::string& text, EExitCode exitCode)
{
    output.PrintFailure(text, exitCode);
    return exitCode;
}

EExitCode RunGuarded(ICommand& command, const VSessionOptions& options)
{
    const VOutput output(options.Json);
    try {
        VSession session(options);
        return command.Run(session);
    } catch (const VError& error) {
        return Fail(output, error.what(), ExitCodeOf(error.Kind()));
    } catch (const std::exception& error) {
        return Fail(output, error.what(), EExitCode::HostFailed);
    }
}

/// Help and version come as an error too, one with the code 0.
EExitCode EndEarly(const CLI::App& program, const CLI::ParseError& error, bool json)
{
    const VOutput output(json);
    if (error.get_exit_code() != 0) {
        return Fail(output, PlainMessage(error.what()) + "; --help tells more",
                    EExitCode::WrongUsage);
    }
    program.exit(error);
    return std::cout.flush()
               ? EExitCode::Done
               : Fail(output, "standard output cannot be written", EExitCode::HostFailed);
}

EExitCode Run(int argc, char** argv)
{
    CLI::App program("Drives a motion-capture host over its control stream", "korva-control");
    program.footer(ExitCodeHelp);
    program.require_subcommand(0, 1); // none is refused below, in words of our own
    program.fallthrough();            // the options may stand behind the command as well

    VSessionOptions options;
    AddOptions(program, options);
    const std::vector<std::unique_ptr<ICommand>> commands = MakeCommands();
    std::vector<const CLI::App*> chosen;
    chosen.reserve(commands.size());
    for (const std::unique_ptr<ICommand>& command : commands) {
        chosen.push_back(command->AddTo(program));
    }
    std::vector<std::string> words = ProtectArguments(argc, argv);
    // Wherever it stands, since the parser may not have come to it.
    const bool json = std::find(words.begin(), words.end(), "--json") != words.end();
    try {
        std::reverse(words.begin(), words.end()); // the parser takes them from the back
        program.parse(words);
    } catch (const CLI::ParseError& error) {
        return EndEarly(program, error, json);
    }
    options.IsHostGiven = program.count("--host") > 0;
    for (std::size_t i = 0; i < commands.size(); ++i) {
        if (chosen[i]->parsed()) {
            return RunGuarded(*commands[i], options);
        }
    }
    return Fail(VOutput(options.Json), "a command is needed; --help lists them",
                EExitCode::WrongUsage);
}

} // namespace

int main(int argc, char** argv)
{
    KVR::FillStandardStreams();
    return static_cast<int>(Run(argc, argv));
}
