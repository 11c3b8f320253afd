#pragma once

#include "support/RawClient.h"

#include <arpa/inet.h>
#include <cerrno>
#include <cstdint>
#include <netinet/in.h>
#include <sys/socket.h>
#include <system_error>
#include <unistd.h>
#include <utility>

namespace TestSupport {

/// Returns the port of a socket's own end.
inline std::uint16_t LocalPort(int descriptor)
{
    sockaddr_in address = {};
    socklen_t size = sizeof address;
    getsockname(descriptor, reinterpret_cast<sockaddr*>(&address), &size);
    return ntohs(address.sin_port);
}

/// A TCP listener of a test on the loopback interface.
class VTestListener
{
public:
    enum EMode { listening, bindOnly };

    /// @param port  0 takes any free one
    explicit VTestListener(EMode mode = listening, std::uint16_t port = 0)
        : descriptor(::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0))
    {
        sockaddr_in address = {};
        address.sin_family = AF_INET;
        address.sin_addr.s_addr = htonl(INADDR_LOOPBACK);
        address.sin_port = htons(port);
        // The next listener on the port does not meet what lingers of this one's connections. Two
        // bound sockets with this option coexist, so one that only holds the port has it not.
        const int reuse = mode == listening ? 1 : 0;
        ::setsockopt(descriptor, SOL_SOCKET, SO_REUSEADDR, &reuse, sizeof reuse);
        if (::bind(descriptor, reinterpret_cast<const sockaddr*>(&address), sizeof address) != 0 ||
            (mode == listening && ::listen(descriptor, SOMAXCONN) != 0)) {
            const int error = errno;
            Close();
            throw std::system_error(error, std::generic_category(), "listen");
        }
        this->port = LocalPort(descriptor);
    }

    ~VTestListener() { Close(); }

    VTestListener(const VTestListener&) = delete;
    VTestListener& operator=(const VTestListener&) = delete;

    int Descriptor() const { return descriptor; }
    std::uint16_t Port() const { return port; }

    /// Waits for a connection. @return its descriptor, the caller's to close
    int Accept() { return ::accept4(descriptor, nullptr, nullptr, SOCK_CLOEXEC); }

    void Close()
    {
        if (descriptor >= 0) {
            ::close(std::exchange(descriptor, -1));
        }
    }

private:
    int descriptor;
    std::uint16_t port = 0;
};

} // namespace TestSupport
