#pragma once

#include "ControlStreamClient/BackOff.h"
#include "ControlStreamClient/EventHandlers.h"
#include "ControlStreamClient/Records.h"

#include <chrono>
#include <cstdint>
#include <functional>
#include <string>

namespace ControlStream {

class VClient;

/// Where a device stands with its host.
enum class EAuthorizationState {
    Unknown,            ///< nothing was asked on this connection, or the operator gave no answer
    Pending,            ///< the operator is being asked
    Authorized,         ///< the device may act, as long as it beats
    Refused,            ///< the operator said no, or the device is banned
    ConnectedElsewhere, ///< another device holds the connection, or its request is waiting
    Lost,               ///< the connection has ended, or the host has said that it goes away
};

/// Asks a host for authorization and keeps the device's place, over a client of the caller's.
///
/// A host keeps a place for 3.5 seconds after a beat: beat every second. There is no thread behind
/// it; everything happens inside of a call.
///
/// Owns: only what it knows of the place; the client must outlive it. Threads: those of the client.
/// Failure: VError as the client throws it; Closed and NoConnection also mean the state Lost. What
/// is no answer of an authorization throws the kind Protocol.
class VAuthorization
{
public:
    using State = EAuthorizationState;

    /// Waits. @return false to give up
    using Wait = std::function<bool(std::chrono::milliseconds)>;

    /// @param id    what the host's lists know the device by
    /// @param name  what its operator is shown
    VAuthorization(VClient& connectedClient, std::string id, std::string name);

    State GetState() const { return state; }

    /// The name under which people know the host; empty until it has answered or told an outcome.
    const std::string& ServerName() const { return serverName; }

    /// The version of the authorization's protocol; empty until the host has answered.
    const std::string& ServerVersion() const { return serverVersion; }

    /// Asks to be let in. The events that were kept before are delivered to the client's handlers
    /// first, as an outcome among them is somebody else's. @return the new state
    State Request();

    /// While the state is Pending, waits for the outcome. The events that come meanwhile go to the
    /// handler.
    ///
    /// @return the state, still Pending where the limit ran out or the client was interrupted
    State WaitForOutcome(std::chrono::milliseconds limit);

    /// Takes a request back. The host answers as if it did not know the command, and this is as it
    /// should be. Whoever else is being asked about just now is taken back instead.
    void Cancel();

    /// Says that the device is alive.
    void Beat();

    /// Takes note of an event that the caller received.
    void OnEvent(const VEvent& event);

    /// Sets what gets the events that WaitForOutcome meets and that are no outcome.
    void SetEventHandler(EventHandler handler) { otherEvents = std::move(handler); }

    /// Connects again, with waits that grow from failure to failure; the state is Unknown then.
    ///
    /// @param limit  of each attempt
    /// @param wait   tells when to give up; a host may be away for hours
    /// @return false, and the state Lost, where it gave up
    bool Reconnect(const std::string& host, std::uint16_t port, std::chrono::milliseconds limit,
                   const Wait& wait, const VBackOffOptions& options = {});

private:
    VCommandReply Run(const std::string& command, const VParameters& parameters);
    State StateOf(const std::string& status) const;

    VClient& client;
    const std::string deviceId;
    const std::string deviceName;
    State state = State::Unknown;
    std::string serverName;
    std::string serverVersion;
    std::uint64_t beats = 0;
    EventHandler otherEvents;
};

} // namespace ControlStream
