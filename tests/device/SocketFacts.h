#pragma once

#include <cstdint>

/// Returns how many segments with data the kernel has received on a TCP socket, -1 where it does
/// not tell.
int DataSegmentsIn(int descriptor);

/// Returns the descriptor of this process that is connected to a port of the loopback interface,
/// -1 where there is none.
int SocketTo(std::uint16_t port);

/// Whether anybody in this network namespace is waiting for a connection to an IPv4 port.
bool IsConnectingTo(std::uint16_t port);
