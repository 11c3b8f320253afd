#pragma once

#include <string>
#include <vector>

namespace ControlStream {

/// A network interface that is up.
struct VNetworkInterface
{
    std::string Name;
    std::vector<std::string> Addresses; ///< IPv4 before IPv6, may be none
};

/// Returns the machine's interfaces that are up, in the system's order; none where the system does
/// not tell. [any]
std::vector<VNetworkInterface> ListNetworkInterfaces();

} // namespace ControlStream
