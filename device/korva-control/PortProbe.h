#pragma once

#include <chrono>
#include <cstdint>
#include <string>

/// Tries whether somebody listens, and closes at once.
///
/// @param address  an IPv4 address in dotted form
/// @return 0 where a connection was made, ETIMEDOUT where nothing came back within the limit, else
/// the system's error number, as ECONNREFUSED where nobody listens
int ProbePort(const std::string& address, std::uint16_t port, std::chrono::milliseconds limit);
