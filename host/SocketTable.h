#pragma once

#include <cstdint>
#include <iosfwd>
#include <map>
#include <string>
#include <vector>

namespace QuorixHost {

/// One TCP socket of this network, as the system's table shows it.
struct VSocketRow
{
    std::string localAddress;
    std::uint16_t localPort = 0;
    std::string remoteAddress;
    std::uint16_t remotePort = 0;
    unsigned state = 0;
    std::uint32_t sendQueue = 0;    ///< bytes that the peer has not taken
    std::uint32_t receiveQueue = 0; ///< bytes that the owner has not read
    unsigned userId = 0;
    std::uint64_t inode = 0; ///< 0 where no process holds the socket any more
};

constexpr unsigned socketStateListening = 10;

/// Reads a table in the form of /proc/net/tcp or /proc/net/tcp6; lines of another form are skipped.
std::vector<VSocketRow> ReadSocketTable(std::istream& table);

/// Returns all TCP sockets of this process's network, IPv4 before IPv6; empty without /proc. [any]
std::vector<VSocketRow> ReadSocketTables();

/// Returns this process's own sockets: descriptors by inode. [any]
std::map<std::uint64_t, int> OwnSockets();

/// Names the processes that hold a socket, as in "process 4711 (nginx)". Those of other users can
/// be seen by root only.
///
/// @return empty when none can be found [any]
std::string DescribeHolder(std::uint64_t inode);

} // namespace QuorixHost
