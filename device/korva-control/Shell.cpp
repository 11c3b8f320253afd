#include "korva-control/Shell.h"

#include "korva-control/Assignments.h"
#include "korva-control/EventLine.h"
#include "korva-control/Session.h"
#include "korva-control/ShellWords.h"
#include "korva-control/TerminalText.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <memory>

#include <unistd.h>

namespace {

using namespace ControlStream;

bool WantsColours(bool json)
{
    const char* const terminal = std::getenv("TERM");
    const char* const refused = std::getenv("NO_COLOR");
    return !json && isatty(STDOUT_FILENO) != 0 && terminal != nullptr &&
           std::strcmp(terminal, "dumb") != 0 && (refused == nullptr || *refused == '\0');
}

const char* Describe(EPermission permission)
{
    switch (permission) {
    case EPermission::Unasked:
        return "not asked for";
    case EPermission::Pending:
        return "the operator is being asked";
    case EPermission::Authorized:
        return "given";
    case EPermission::Refused:
        return "refused";
    case EPermission::Taken:
        return "another device has the place";
    }
    return "";
}

} // namespace

VShell::VShell(const VShellOptions& shellOptions, VOutput& shellOutput)
    : options(shellOptions),
      output(shellOutput),
      colours(WantsColours(shellOutput.IsJson())),
      input(inbox),
      names([this](const std::string& command) { return ParametersOf(command); }),
      editor(input, options.HistoryFile,
             [this](const Words& words) { return names.Complete(words); }),
      client(ClientOptions(options.Client))
{
    if (editor.IsAtTerminal()) {
        LimitEvents();
    }
    client.AddEventHandler(
        "", [this](const VEvent& event) { inbox.PostEvent([this, event] { OnEvent(event); }); });
}

/// A terminal may be slower than a host, and whoever types there must not wait for all that it
/// said.
void VShell::LimitEvents()
{
    constexpr std::size_t waitingLimit = 1000;
    inbox.LimitEvents(waitingLimit, [this](std::size_t leftOut) {
        if (showsEvents) {
            Print(EColour::Notice,
                  "-- the terminal is too slow; events left out: " + std::to_string(leftOut));
        }
    });
}

void VShell::Run()
{
    while (std::optional<std::string> line = editor.ReadLine()) {
        if (!DoLine(*line)) {
            return;
        }
    }
}

VAsyncOptions VShell::ClientOptions(VAsyncOptions clientOptions)
{
    clientOptions.OnStatus = [this](const VAsyncStatus& status) {
        inbox.Post([this, status] { OnStatus(status); });
    };
    return clientOptions;
}

/// @return false where the user leaves
bool VShell::DoLine(const std::string& line)
{
    try {
        const Words words = SplitWords(line);
        if (words.size() == 1 && (words.front() == "quit" || words.front() == "exit")) {
            return false;
        }
        if (!words.empty()) {
            DoWords(words);
        }
    } catch (const VError& error) {
        Print(EColour::Failure, error.what());
    }
    return !input.IsTerminated();
}

void VShell::DoWords(const Words& words)
{
    const std::string& first = words.front();
    const Words rest(words.begin() + 1, words.end());
    if (first == "run" && !rest.empty()) {
        RunCommand(rest.front(), Words(rest.begin() + 1, rest.end()));
    } else if (first == "commands" && rest.empty()) {
        PrintList("commands",
                  Await<Words>([this](auto handler) { client.GetCommands(std::move(handler)); }));
    } else if (first == "events" && rest.empty()) {
        PrintList("events",
                  Await<Words>([this](auto handler) { client.GetEvents(std::move(handler)); }));
    } else if (first == "describe" && rest.size() == 1) {
        Describe(rest.front());
    } else if (first == "describe-event" && rest.size() == 1) {
        DescribeEvent(rest.front());
    } else if (first == "watch" || (first == "quiet" && rest.empty())) {
        showsEvents = first == "watch";
        shownEvents = std::set<std::string>(rest.begin(), rest.end());
    } else if (first == "info" && rest.empty()) {
        PrintInfo();
    } else if (first == "authorize" && rest.empty() && options.Client.Device) {
        client.Authorize();
    } else if (first == "help" && rest.empty()) {
        PrintHelp();
    } else if (names.IsCommand(first)) {
        RunCommand(first, rest);
    } else {
        Print(EColour::Failure, "\"" + first + "\" cannot be done so; help lists what can");
    }
}

void VShell::RunCommand(const std::string& name, const Words& assignments)
{
    const VParameters parameters = ParseAssignments(assignments);
    PrintReply(name, Await<VCommandReply>([&](auto handler) {
                   client.ExecuteCommand(name, parameters, std::move(handler));
               }));
}

void VShell::Describe(const std::string& name)
{
    const auto information = Await<VCommandInformation>(
        [&](auto handler) { client.GetCommandInformation(name, std::move(handler)); });
    if (output.IsJson()) {
        output.PrintJson({{"name", information.Name},
                          {"description", information.Description},
                          {"inputParameters", ToJson(information.InputParameters)},
                          {"replyParameters", ToJson(information.ReplyParameters)}});
        return;
    }
    Print(EColour::Plain, information.Description);
    for (const VParameterInformation& parameter : information.InputParameters) {
        Print(EColour::Plain, "  in  " + parameter.Name + ": " + parameter.Description);
    }
    for (const VParameterInformation& parameter : information.ReplyParameters) {
        Print(EColour::Plain, "  out " + parameter.Name + ": " + parameter.Description);
    }
}

void VShell::DescribeEvent(const std::string& name)
{
    const auto information = Await<VEventInformation>(
        [&](auto handler) { client.GetEventInformation(name, std::move(handler)); });
    if (output.IsJson()) {
        output.PrintJson({{"name", information.Name},
                          {"description", information.Description},
                          {"parameters", ToJson(information.Parameters)}});
        return;
    }
    Print(EColour::Plain,
          information.Name.empty() ? "The host tells nothing of it" : information.Description);
    for (const VParameterInformation& parameter : information.Parameters) {
        Print(EColour::Plain, "  " + parameter.Name + ": " + parameter.Description);
    }
}

void VShell::PrintList(const char* key, const std::vector<std::string>& list)
{
    if (output.IsJson()) {
        output.PrintJson({{key, list}});
        return;
    }
    for (const std::string& name : list) {
        Print(EColour::Plain, name);
    }
}

void VShell::PrintHelp()
{
    if (output.IsJson()) {
        VJson words = VJson::array();
        for (const VShellWord& word : ShellWordList()) {
            words.push_back({{"usage", word.Usage}, {"help", word.Help}});
        }
        output.PrintJson({{"help", words}});
        return;
    }
    for (const VShellWord& word : ShellWordList()) {
        std::string usage = word.Usage;
        usage.resize(std::max<std::size_t>(usage.size() + 1, 32), ' ');
        Print(EColour::Plain, usage + word.Help);
    }
}

void VShell::PrintInfo()
{
    const VAsyncStatus status = client.GetStatus();
    const bool connected = status.State == EConnectionState::Connected;
    if (output.IsJson()) {
        output.PrintJson({{"connected", connected},
                          {"authorization", ::Describe(status.Permission)},
                          {"reason", status.Reason}});
        return;
    }
    Print(EColour::Plain,
          connected ? "Connected to " + options.Peer : "Not connected: " + status.Reason);
    Print(EColour::Plain, std::string("Authorization: ") + ::Describe(status.Permission));
}

void VShell::PrintReply(const std::string& name, const VCommandReply& reply)
{
    if (output.IsJson()) {
        output.PrintJson({{"command", name},
                          {"result", reply.Result},
                          {"ok", reply.Ok},
                          {"parameters", ToJson(reply.Parameters)}});
        return;
    }
    Print(reply.Ok ? EColour::Plain : EColour::Failure, reply.Result);
    for (const VParameter& parameter : reply.Parameters) {
        Print(EColour::Plain, parameter.Name + "=" + parameter.Value);
    }
}

void VShell::OnEvent(const VEvent& event)
{
    const bool isShown = shownEvents.empty() || shownEvents.count(event.Name) > 0;
    if (!showsEvents || !isShown) {
        return;
    }
    if (output.IsJson()) {
        output.PrintJson({{"event", event.Name}, {"parameters", ToJson(event.Parameters)}});
    } else {
        Print(EColour::Event, EventLine(event));
    }
}

void VShell::OnStatus(const VAsyncStatus& status)
{
    const EConnectionState before = shownStatus ? shownStatus->State : EConnectionState::Connecting;
    const bool wasConnected = before == EConnectionState::Connected;
    const bool isConnected = status.State == EConnectionState::Connected;
    if (isConnected && !wasConnected) {
        Print(EColour::Notice, "-- connected to " + options.Peer);
        LoadNames();
    } else if (status.State == EConnectionState::Waiting &&
               (!shownStatus || wasConnected || shownStatus->Reason != status.Reason)) {
        Print(EColour::Notice, "-- " + status.Reason + "; trying again");
        names.Forget();
    }
    if (isConnected && options.Client.Device &&
        (!shownStatus || shownStatus->Permission != status.Permission) &&
        status.Permission != EPermission::Unasked) {
        Print(EColour::Notice, std::string("-- authorization: ") + ::Describe(status.Permission));
    }
    if (status.State != EConnectionState::Connecting) {
        shownStatus = status;
    }
}

/// Asks for what can be completed; whoever types meanwhile is not kept waiting.
void VShell::LoadNames()
{
    client.GetCommands([this](const VOutcome<Words>& outcome) {
        if (outcome) {
            inbox.Post([this, list = outcome.Get()] { names.SetCommands(list); });
        }
    });
    client.GetEvents([this](const VOutcome<Words>& outcome) {
        if (outcome) {
            inbox.Post([this, list = outcome.Get()] { names.SetEvents(list); });
        }
    });
}

std::vector<VParameterInformation> VShell::ParametersOf(const std::string& command)
{
    // Nobody waits longer than this for a completion.
    constexpr std::chrono::milliseconds patience{500};
    try {
        std::future<VCommandInformation> information = client.GetCommandInformation(command);
        if (information.wait_for(patience) == std::future_status::ready) {
            return information.get().InputParameters;
        }
    } catch (const VError&) {
        return {}; // nothing can be offered
    }
    return {};
}

void VShell::Print(EColour colour, const std::string& line)
{
    if (output.IsJson()) {
        if (colour == EColour::Notice) {
            output.PrintNotice(line);
        } else if (colour == EColour::Failure) {
            output.PrintFailure(line, std::nullopt);
        } else {
            output.PrintLine(line);
        }
        return;
    }
    const char* start = "";
    if (colours && colour != EColour::Plain) {
        start = colour == EColour::Event    ? "\x1B[36m"
                : colour == EColour::Notice ? "\x1B[33m"
                                            : "\x1B[31m";
    }
    output.PrintLine(start + ForTerminal(line) + (*start != '\0' ? "\x1B[0m" : ""));
}

/// Makes a request and waits for its result, showing events meanwhile. Ctrl-C ends the wait.
template <typename TResult, typename TStart>
TResult VShell::Await(const TStart& start)
{
    const auto result = std::make_shared<std::optional<VOutcome<TResult>>>();
    start(VAsyncClient::Handler<TResult>([this, result](const VOutcome<TResult>& outcome) {
        inbox.Post([result, outcome] { *result = outcome; });
    }));
    while (!*result) {
        switch (input.Wait(false)) {
        case EShellInput::Posted:
            inbox.RunSome();
            break;
        case EShellInput::Interrupted:
        case EShellInput::Terminated:
            throw VError(EErrorKind::TimedOut, "given up; the host may do it all the same");
        case EShellInput::Ready:
        case EShellInput::Ended:
        case EShellInput::Resized:
        case EShellInput::Resumed:
            break;
        }
    }
    return std::move(**result).Get();
}
