#pragma once

#include "ControlStreamClient/BackOff.h"
#include "ControlStreamClient/Error.h"
#include "ControlStreamClient/Records.h"

#include <chrono>
#include <cstdint>
#include <functional>
#include <optional>
#include <string>

namespace ControlStream {

/// What a device is known by to the operator and to the host's lists.
struct VDeviceIdentity
{
    std::string Id;
    std::string Name;
};

/// Where an asynchronous client stands with its host.
enum class EConnectionState {
    Connecting, ///< looking for the host, or waiting for its first answer
    Connected,
    Waiting, ///< for a while, before the next attempt
    Stopped, ///< for good
};

/// What the host has said to the device's wish to act.
enum class EPermission {
    Unasked,    ///< nothing was asked, or it counts no more
    Pending,    ///< the operator is being asked
    Authorized, ///< and the client beats
    Refused,    ///< the operator said no, or the device is banned
    Taken,      ///< another device has the place; the client asks again
};

struct VAsyncStatus
{
    EConnectionState State = EConnectionState::Connecting;
    EPermission Permission = EPermission::Unasked;
    std::string Reason; ///< why there is no connection, for people; empty while there is one
};

/// What can be chosen about an asynchronous client.
struct VAsyncOptions
{
    std::string Host = "127.0.0.1";
    std::uint16_t Port = DefaultPort;

    /// How long a request may take from its sending to its reply, and how long it waits for a
    /// connection before that.
    std::chrono::milliseconds TimeLimit{5000};

    /// How long connecting may take, from the look-up of the name to the host's first answer.
    std::chrono::milliseconds ConnectLimit{5000};

    /// The longest frame that is accepted from the host, in bytes.
    std::uint32_t FrameLimit = 64U << 20U;

    /// How long to wait between attempts to connect.
    VBackOffOptions BackOff;

    /// Who asks for the authorization on each new connection; nobody does where it is empty.
    std::optional<VDeviceIdentity> Device;

    /// The time between two heartbeats. A host gives the place away after 3.5 seconds without one.
    std::chrono::milliseconds BeatInterval{1000};

    /// Beats also without an authorization, to notice a host that hangs.
    bool BeatsAlways = false;

    /// How long after the answer that the place is taken the host is asked again; 0 is never.
    std::chrono::milliseconds AskAgain{2000};

    /// Called after each change, on the client's thread.
    std::function<void(const VAsyncStatus&)> OnStatus;

    /// Called with the text of an exception that a function of the user's let out, on the client's
    /// thread, which goes on. Must not throw.
    std::function<void(const std::string&)> OnFunctionFailed;
};

} // namespace ControlStream
