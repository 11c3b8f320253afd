#pragma once

#include "ControlStreamClient/Client.h"
#include "korva-control/Output.h"

#include <chrono>
#include <cstdint>
#include <optional>
#include <string>

/// What the options before the command say.
struct VSessionOptions
{
    std::string Host = "127.0.0.1";
    bool IsHostGiven = false; ///< whether the user named the host
    std::uint16_t Port = ControlStream::DefaultPort;
    bool Json = false;
    std::optional<double> Timeout; ///< seconds, as given; empty where it was not
};

/// What the program's commands work with: the connection, made when it is first asked for, and
/// the output.
///
/// Threads: the main thread.
class VSession
{
public:
    explicit VSession(const VSessionOptions& sessionOptions);

    /// Returns the connected client, connecting it first where it is not.
    ControlStream::VClient& Connect();

    VOutput& Output() { return output; }

    const VSessionOptions& Options() const { return options; }

    /// Returns the host in a form that can be connected to, looking once for the host that
    /// advertises itself under a name which is no host's name.
    const std::string& HostAddress();

    /// How long a connection or a request may take.
    std::chrono::milliseconds TimeLimit() const;

    /// Whether the user set the time limit, which then bounds also what has none by itself.
    bool IsTimeLimitGiven() const { return options.Timeout.has_value(); }

    /// The host's name and port for people.
    std::string Peer() const;

private:
    const VSessionOptions options;
    std::string hostAddress; // empty until it was needed
    VOutput output;
    ControlStream::VClient client;
};
