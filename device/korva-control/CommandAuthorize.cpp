#include "ControlStreamClient/Authorization.h"
#include "korva-control/Arguments.h"
#include "korva-control/Commands.h"
#include "korva-control/Session.h"
#include "korva-control/StopSignals.h"
#include "korva-control/TerminalText.h"

#include <algorithm>
#include <chrono>
#include <optional>
#include <string>

#include <CLI/CLI.hpp>

namespace {

using ControlStream::EAuthorizationState;
using ControlStream::EErrorKind;
using ControlStream::VAuthorization;
using ControlStream::VClient;
using ControlStream::VError;
using ControlStream::VEvent;

// A host lets others in after 3.5 seconds without a beat.
constexpr std::chrono::milliseconds BeatInterval{1000};

/// What a state is called in the output for programs, in the host's own words where it has any.
const char* StatusOf(EAuthorizationState state)
{
    switch (state) {
    case EAuthorizationState::Authorized:
        return "Authorized";
    case EAuthorizationState::Refused:
        return "Failed";
    case EAuthorizationState::Pending:
        return "Pending";
    case EAuthorizationState::ConnectedElsewhere:
        return "Connected";
    case EAuthorizationState::Lost:
        return "Lost";
    case EAuthorizationState::Unknown:
        break;
    }
    return "Cancelled";
}

std::string SentenceOf(EAuthorizationState state, const std::string& server)
{
    switch (state) {
    case EAuthorizationState::Authorized:
        return "authorized by " + server;
    case EAuthorizationState::Refused:
        return "refused by " + server;
    case EAuthorizationState::Pending:
        return "the operator is being asked";
    case EAuthorizationState::ConnectedElsewhere:
        return "another device holds the connection, or its request is waiting for the operator";
    case EAuthorizationState::Lost:
        return "the host goes away";
    case EAuthorizationState::Unknown:
        break;
    }
    return "the request is taken back";
}

std::chrono::milliseconds Until(std::chrono::steady_clock::time_point moment)
{
    return std::chrono::ceil<std::chrono::milliseconds>(moment - std::chrono::steady_clock::now());
}

class VCommandAuthorize : public ICommand
{
public:
    CLI::App* AddTo(CLI::App& program) override
    {
        CLI::App* command = program.add_subcommand("authorize", "Ask the host to be let in");
        command->footer(
            "Ends with 1 where the host refuses, or another device holds the connection. A host\n"
            "keeps the place for 3.5 seconds after the program has ended.\n"
            "With --wait, a --timeout that is given bounds the wait; without one it goes on.");
        idOption = command->add_option("--id", id, "What the host's lists know the device by");
        idOption->transform(&PlainWord);
        nameOption = command->add_option("--name", name, "What the host's operator is shown");
        nameOption->transform(&PlainWord);
        command->add_flag("--wait", wait, "Wait until the operator has answered");
        command->add_flag("--hold", hold, "Wait, then keep the place until Ctrl-C");
        command->add_flag("--cancel", cancel,
                          "Take back a request that the operator is asked about");
        return command;
    }

    EExitCode Run(VSession& session) override
    {
        CheckOptions();
        VAuthorization authorization(session.Connect(), id, name);
        if (cancel) {
            authorization.Cancel();
            Print(session, authorization);
            return EExitCode::Done;
        }
        authorization.Request();
        if (authorization.GetState() == EAuthorizationState::Pending && (wait || hold)) {
            Print(session, authorization);
            Wait(session, authorization);
        }
        Print(session, authorization);
        if (authorization.GetState() == EAuthorizationState::Authorized && hold) {
            return Hold(session, authorization);
        }
        return ExitCodeOf(authorization.GetState());
    }

private:
    void CheckOptions() const
    {
        if (cancel && (wait || hold)) {
            throw VError(EErrorKind::Usage, "--cancel goes with neither --wait nor --hold");
        }
        if (!cancel && (idOption->empty() || nameOption->empty())) {
            throw VError(EErrorKind::Usage, "--id and --name are needed");
        }
    }

    static EExitCode ExitCodeOf(EAuthorizationState state)
    {
        switch (state) {
        case EAuthorizationState::Refused:
        case EAuthorizationState::ConnectedElsewhere:
            return EExitCode::HostFailed;
        case EAuthorizationState::Lost:
            return EExitCode::NoConnection;
        default:
            return EExitCode::Done;
        }
    }

    /// Waits for the outcome. A wait that ends without one takes the request back, so that no
    /// dialog is left before the operator.
    static void Wait(VSession& session, VAuthorization& authorization)
    {
        const VStopSignals stop(session.Connect());
        const auto limit =
            session.IsTimeLimitGiven() ? session.TimeLimit() : ControlStream::NoLimit;
        if (authorization.WaitForOutcome(limit) != EAuthorizationState::Pending) {
            return;
        }
        authorization.Cancel();
        if (!stop.IsRequested()) {
            throw VError(EErrorKind::TimedOut,
                         "timed out, waiting for the operator; the request is taken back");
        }
    }

    /// Beats until Ctrl-C, or until the host says that it goes away.
    static EExitCode Hold(VSession& session, VAuthorization& authorization)
    {
        VClient& client = session.Connect();
        const VStopSignals stop(client);
        auto nextBeat = std::chrono::steady_clock::now();
        while (!stop.IsRequested()) {
            const std::chrono::milliseconds left = Until(nextBeat);
            if (left <= std::chrono::milliseconds::zero()) {
                Beat(client, authorization);
                nextBeat = std::chrono::steady_clock::now() + BeatInterval;
            } else if (const std::optional<VEvent> event = client.WaitForEvent(left)) {
                authorization.OnEvent(*event);
            }
            if (authorization.GetState() == EAuthorizationState::Lost) {
                Print(session, authorization);
                return EExitCode::NoConnection;
            }
        }
        return EExitCode::Done;
    }

    /// A host that goes away takes its commands away before it says so.
    static void Beat(VClient& client, VAuthorization& authorization)
    {
        try {
            authorization.Beat();
        } catch (const VError&) {
            if (!HearsOfTheEnd(client, authorization)) {
                throw;
            }
        }
    }

    static bool HearsOfTheEnd(VClient& client, VAuthorization& authorization)
    {
        try {
            // Other events must not put off the failure for ever.
            const auto end = std::chrono::steady_clock::now() + BeatInterval;
            for (auto left = BeatInterval; left.count() > 0; left = Until(end)) {
                const std::optional<VEvent> event = client.WaitForEvent(left);
                if (!event) {
                    return false;
                }
                authorization.OnEvent(*event);
                if (event->Name == "Event.Disconnect") {
                    return true;
                }
            }
        } catch (const VError&) {
            return false; // what failed first tells more
        }
        return false;
    }

    static void Print(VSession& session, const VAuthorization& authorization)
    {
        const EAuthorizationState state = authorization.GetState();
        if (session.Output().IsJson()) {
            session.Output().PrintJson({{"status", StatusOf(state)},
                                        {"serverName", authorization.ServerName()},
                                        {"serverVersion", authorization.ServerVersion()}});
            return;
        }
        const std::string& known = authorization.ServerName();
        session.Output().PrintLine(
            SentenceOf(state, known.empty() ? "the host" : ForTerminal(known)));
    }

    CLI::Option* idOption = nullptr;
    CLI::Option* nameOption = nullptr;
    std::string id;
    std::string name;
    bool wait = false;
    bool hold = false;
    bool cancel = false;
};

} // namespace

std::unique_ptr<ICommand> MakeCommandAuthorize()
{
    return std::make_unique<VCommandAuthorize>();
}
