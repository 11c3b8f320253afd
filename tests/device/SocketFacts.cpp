#include "device/SocketFacts.h"

// The kernel's own header knows more counters than the C library's, and excludes it in one source.
#include <linux/tcp.h>

#include <cstddef>

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
