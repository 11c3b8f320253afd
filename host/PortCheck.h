#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace QuorixHost {

/// Whether devices can reach the control stream, and if not, why and what to do about it.
struct VPortFinding
{
    bool answers = false;
    std::vector<std::string> advice; ///< lines for people; empty when it answers
};

/// Finds out whether this process listens on the port and a connection to it is accepted.
///
/// The plug-in is silent about a port that it could not get, and another program's listener would
/// accept a plain connection, so it is the listener's owner that is looked at. Takes up to two
/// seconds where packets are dropped. [any]
VPortFinding CheckPort(std::uint16_t port);

} // namespace QuorixHost
