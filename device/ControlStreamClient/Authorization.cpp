#include "ControlStreamClient/Authorization.h"

#include "ControlStreamClient/Client.h"
#include "ControlStreamClient/Deadline.h"
#include "ControlStreamClient/Error.h"

#include <optional>
#include <utility>

namespace ControlStream {
namespace {

constexpr char authorizeCommand[] = "System.Authorize";
constexpr char cancelCommand[] = "System.Authorize.Cancel";
constexpr char heartbeatCommand[] = "System.Heartbeat";
constexpr char authorizeEvent[] = "Event.Authorize";
constexpr char disconnectEvent[] = "Event.Disconnect";

// What a host answers to the command that takes a request back, though it has done so.
constexpr char unknownCommandResult[] =
    "Error: Invalid command name or command not valid for the host application.";

std::chrono::milliseconds Left(const VDeadline& deadline)
{
    const int left = deadline.PollMilliseconds();
    return left < 0 ? NoLimit : std::chrono::milliseconds(left);
}

VError NoAnswer(const std::string& command, const VCommandReply& reply)
{
    return VError(EErrorKind::Protocol,
                  "the host does not answer " + command + " as it should: " + reply.Result);
}

} // namespace

VAuthorization::VAuthorization(VClient& connectedClient, std::string id, std::string name)
    : client(connectedClient), deviceId(std::move(id)), deviceName(std::move(name))
{
}

VCommandReply VAuthorization::Run(const std::string& command, const VParameters& parameters)
{
    try {
        return client.ExecuteCommand(command, parameters);
    } catch (const VError& error) {
        if (error.Kind() == EErrorKind::Closed || error.Kind() == EErrorKind::NoConnection) {
            state = State::Lost;
        }
        throw;
    }
}

VAuthorization::State VAuthorization::Request()
{
    if (client.IsConnected()) {
        while (client.DeliverEvents(std::chrono::milliseconds(0)) > 0) {
        }
    }
    const VCommandReply reply =
        Run(authorizeCommand, {{"DeviceId", deviceId}, {"DeviceName", deviceName}});
    if (!reply.Ok) {
        throw NoAnswer(authorizeCommand, reply);
    }
    serverName = GetValue(reply.Parameters, "ServerName");
    serverVersion = GetValue(reply.Parameters, "ServerVersion");
    state = StateOf(GetValue(reply.Parameters, "Status"));
    return state;
}

VAuthorization::State VAuthorization::StateOf(const std::string& status) const
{
    if (status == "Authorized") {
        return State::Authorized;
    }
    if (status == "Failed") {
        return State::Refused;
    }
    if (status == "Pending") {
        return State::Pending;
    }
    if (status == "Connected") {
        return State::ConnectedElsewhere;
    }
    throw VError(EErrorKind::Protocol,
                 "the host answers with a status that there is not: \"" + status + "\"");
}

VAuthorization::State VAuthorization::WaitForOutcome(std::chrono::milliseconds limit)
{
    const VDeadline deadline(limit);
    while (state == State::Pending) {
        std::optional<VEvent> event;
        try {
            event = client.WaitForEvent(Left(deadline));
        } catch (const VError&) {
            state = State::Lost;
            throw;
        }
        if (!event) {
            break;
        }
        OnEvent(*event);
        if (event->Name != authorizeEvent && otherEvents) {
            otherEvents(*event);
        }
    }
    return state;
}

void VAuthorization::OnEvent(const VEvent& event)
{
    if (event.Name == disconnectEvent) {
        state = State::Lost;
    } else if (event.Name == authorizeEvent && state == State::Pending) {
        // No parameter tells whose outcome it is: a device knows by its waiting.
        serverName = GetValue(event.Parameters, "ServerName");
        state = StateOf(GetValue(event.Parameters, "Status"));
    }
}

void VAuthorization::Cancel()
{
    const VCommandReply reply = Run(cancelCommand, {{"DeviceId", deviceId}});
    if (!reply.Ok && reply.Result != unknownCommandResult) {
        throw NoAnswer(cancelCommand, reply);
    }
    if (state == State::Pending) {
        state = State::Unknown;
    }
}

void VAuthorization::Beat()
{
    const std::string beatId = std::to_string(++beats);
    const VCommandReply reply = Run(heartbeatCommand, {{"BeatId", beatId}});
    if (!reply.Ok || GetValue(reply.Parameters, "BeatId") != beatId) {
        throw NoAnswer(heartbeatCommand, reply);
    }
}

bool VAuthorization::Reconnect(const std::string& host, std::uint16_t port,
                               std::chrono::milliseconds limit, const Wait& wait,
                               const VBackOffOptions& options)
{
    VBackOff backOff(options);
    for (;;) {
        try {
            client.Connect(host, port, limit);
            state = State::Unknown;
            return true;
        } catch (const VError&) {
            state = State::Lost; // and tried again, whatever it was
        }
        if (!wait(backOff.Next())) {
            return false;
        }
    }
}

} // namespace ControlStream
