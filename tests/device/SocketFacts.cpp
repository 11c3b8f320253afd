#include "device/SocketFacts.h"

// The kernel's own header knows more counters than the C library's, and excludes it in one source.
#include <linux/tcp.h>

#include <cstddef>
#include <cstdio>
#include <fstream>
#include <string>

#include <netinet/in.h>
#include <sys/socket.h>

int DataSegmentsIn(int descriptor)
{
    tcp_info information{};
    socklen_t size = sizeof information;
    if (getsockopt(descriptor, IPPROTO_TCP, TCP_INFO, &information, &size) != 0 ||
        size < offsetof(tcp_info, tcpi_data_segs_in) + sizeof information.tcpi_data_segs_in) {
        return -1;
    }
    return static_cast<int>(information.tcpi_data_segs_in);
}

int SocketTo(std::uint16_t port)
{
    for (int descriptor = 0; descriptor < 1024; ++descriptor) {
        sockaddr_in address{};
        socklen_t size = sizeof address;
        if (getpeername(descriptor, reinterpret_cast<sockaddr*>(&address), &size) == 0 &&
            address.sin_family == AF_INET && address.sin_port == htons(port)) {
            return descriptor;
        }
    }
    return -1;
}

bool IsConnectingTo(std::uint16_t port)
{
    // Each line has the remote address in hexadecimal, its port behind a colon, and the state.
    constexpr const char* connecting = "02";
    char wanted[16];
    std::snprintf(wanted, sizeof wanted, ":%04X %s ", static_cast<unsigned>(port), connecting);
    std::ifstream table("/proc/self/net/tcp");
    for (std::string line; std::getline(table, line);) {
        if (line.find(wanted) != std::string::npos) {
            return true;
        }
    }
    return false;
}
