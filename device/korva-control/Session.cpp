#include "korva-control/Session.h"

#include "ControlStreamClient/Discovery.h"

#include <cmath>

namespace {

constexpr double DefaultSeconds = 5;

} // namespace

VSession::VSession(const VSessionOptions& sessionOptions)
    : options(sessionOptions), output(sessionOptions.Json)
{
    client.SetTimeLimit(TimeLimit());
}

ControlStream::VClient& VSession::Connect()
{
    if (!client.IsConnected()) {
        client.Connect(HostAddress(), options.Port, TimeLimit());
    }
    return client;
}

const std::string& VSession::HostAddress()
{
    if (hostAddress.empty() && !options.Host.empty()) { // an empty name is refused by the client
        hostAddress = ControlStream::FindHost(options.Host, TimeLimit());
    }
    return hostAddress;
}

std::chrono::milliseconds VSession::TimeLimit() const
{
    const double seconds = options.Timeout.value_or(DefaultSeconds);
    return std::chrono::milliseconds(static_cast<std::int64_t>(std::ceil(seconds * 1000)));
}

std::string VSession::Peer() const
{
    return options.Host + ":" + std::to_string(options.Port);
}
