#pragma once

#include <cstdint>
#include <stdexcept>

#include <netinet/in.h>
#include <sys/socket.h>
#include <unistd.h>

/// A listener whose queue of connections is full, so that the kernel answers no further one.
class VFullListener
{
public:
    /// @param ipv4      an IPv4 address of the loopback network
    /// @param freePort  where to listen; 0 lets the system choose
    explicit VFullListener(std::uint32_t ipv4, std::uint16_t freePort = 0)
    {
        sockaddr_in address{};
        address.sin_family = AF_INET;
        address.sin_port = htons(freePort);
        address.sin_addr.s_addr = htonl(ipv4);
        socklen_t size = sizeof address;
        if (::bind(listener, reinterpret_cast<sockaddr*>(&address), size) != 0 ||
            ::listen(listener, 0) != 0 ||
            ::getsockname(listener, reinterpret_cast<sockaddr*>(&address), &size) != 0 ||
            ::connect(waiting, reinterpret_cast<sockaddr*>(&address), size) != 0) {
            throw std::runtime_error("no listener");
        }
        port = ntohs(address.sin_port);
    }

    ~VFullListener()
    {
        ::close(waiting);
        ::close(listener);
    }

    VFullListener(const VFullListener&) = delete;
    VFullListener& operator=(const VFullListener&) = delete;

    std::uint16_t Port() const { return port; }

private:
    const int listener = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    const int waiting = ::socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0);
    std::uint16_t port = 0;
};
