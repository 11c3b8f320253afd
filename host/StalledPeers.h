#pragma once

#include <cstdint>
#include <string>

namespace QuorixHost {

/// Tells in one sentence or two which peers of the port have a full send queue, and so hold up
/// whoever writes to them. [any]
std::string DescribeStalledPeers(std::uint16_t port);

} // namespace QuorixHost
