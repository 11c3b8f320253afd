#include "SegmentCount.h"

// A source of its own: the kernel's header tells more than that of the C library, and the two do
// not go together.
#include <linux/tcp.h>
#include <netinet/in.h>
#include <sys/socket.h>

#include <cerrno>
#include <system_error>

std::uint32_t DataSegmentsReceived(int descriptor)
{
    tcp_info information{};
    socklen_t size = sizeof information;
    if (::getsockopt(descriptor, IPPROTO_TCP, TCP_INFO, &information, &size) != 0) {
        throw std::system_error(errno, std::generic_category(), "TCP_INFO");
    }
    return information.tcpi_data_segs_in;
}
