#pragma once

#include <cstdint>
#include <stdexcept>

#include <netinet/in.h>
#include <sys/socket.h>
#include <unistd.h>

/// A port on which a test's hosts listen one after the other: nobody else on the machine gets it in
/// between.
///
/// Owns: a socket that is bound to it and never listens. Threads: the test's.
class VReservedPort
{
public:
    VReservedPort() : holder(socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC, 0))
    {
        const int on = 1;
        sockaddr_in address{};
        address.sin_family = AF_INET;
        socklen_t size = sizeof address;
        auto* const generic = reinterpret_cast<sockaddr*>(&address);
        // With this option on both sides a host may listen beside a socket that does not.
        if (setsockopt(holder, SOL_SOCKET, SO_REUSEADDR, &on, sizeof on) != 0 ||
            bind(holder, generic, size) != 0 || getsockname(holder, generic, &size) != 0) {
            throw std::runtime_error("no port is free");
        }
        number = ntohs(address.sin_port);
    }

    ~VReservedPort() { close(holder); }

    VReservedPort(const VReservedPort&) = delete;
    VReservedPort& operator=(const VReservedPort&) = delete;

    std::uint16_t Number() const { return number; }

private:
    const int holder;
    std::uint16_t number = 0;
};
