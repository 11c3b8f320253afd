#include "PortCheck.h"

#include "SocketTable.h"

#include <arpa/inet.h>
#include <cerrno>
#include <cstring>
#include <netinet/in.h>
#include <optional>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

namespace QuorixHost {
namespace {

constexpr int connectMilliseconds = 2000;

/// A TCP socket that is closed at the end of its scope.
class VProbe
{
public:
    VProbe() : descriptor(socket(AF_INET, SOCK_STREAM | SOCK_CLOEXEC | SOCK_NONBLOCK, 0)) {}
    ~VProbe()
    {
        if (descriptor >= 0) {
            close(descriptor);
        }
    }
    VProbe(const VProbe&) = delete;
    VProbe& operator=(const VProbe&) = delete;

    /// @return 0, or what the system says against binding as the plug-in does
    int Bind(std::uint16_t port) const
    {
        const int yes = 1;
        setsockopt(descriptor, SOL_SOCKET, SO_REUSEADDR, &yes, sizeof yes);
        const sockaddr_in address = Address(INADDR_ANY, port);
        const auto* const generic = reinterpret_cast<const sockaddr*>(&address);
        return bind(descriptor, generic, sizeof address) == 0 ? 0 : errno;
    }

    /// @return 0, or what the system says against a connection
    int Connect(std::uint16_t port) const
    {
        const sockaddr_in address = Address(INADDR_LOOPBACK, port);
        const auto* const generic = reinterpret_cast<const sockaddr*>(&address);
        if (connect(descriptor, generic, sizeof address) == 0) {
            return 0;
        }
        if (errno != EINPROGRESS) {
            return errno;
        }
        pollfd writable = {descriptor, POLLOUT, 0};
        if (poll(&writable, 1, connectMilliseconds) != 1) {
            return ETIMEDOUT;
        }
        int error = 0;
        socklen_t size = sizeof error;
        getsockopt(descriptor, SOL_SOCKET, SO_ERROR, &error, &size);
        return error;
    }

private:
    static sockaddr_in Address(std::uint32_t host, std::uint16_t port)
    {
        sockaddr_in address = {};
        address.sin_family = AF_INET;
        address.sin_addr.s_addr = htonl(host);
        address.sin_port = htons(port);
        return address;
    }

    int descriptor;
};

struct VListeners
{
    bool own = false;
    std::optional<VSocketRow> foreign;
};

VListeners FindListeners(std::uint16_t port)
{
    VListeners listeners;
    const auto own = OwnSockets();
    for (const VSocketRow& row : ReadSocketTables()) {
        if (row.localPort != port || row.state != socketStateListening) {
            continue;
        }
        if (own.count(row.inode) != 0) {
            listeners.own = true;
        } else if (!listeners.foreign) {
            listeners.foreign = row;
        }
    }
    return listeners;
}

std::string PortText(std::uint16_t port)
{
    return "TCP port " + std::to_string(port);
}

std::vector<std::string> AdviseOnHolder(std::uint16_t port, const VSocketRow& listener)
{
    std::string holder = DescribeHolder(listener.inode);
    if (holder.empty()) {
        holder = "a process of user " + std::to_string(listener.userId) +
                 ", which only root can name (ss -ltnp)";
    }
    return {PortText(port) + " is taken: " + holder + " listens on " + listener.localAddress +
                ". No device can connect to this host.",
            "End that program and start this host again."};
}

std::vector<std::string> AdviseOnPrivilege(std::uint16_t port)
{
    const std::string number = std::to_string(port);
    return {
        "This user may not listen on " + PortText(port) +
            ". No device can connect to this host. Any of these helps:",
        "  sudo sysctl -w net.ipv4.ip_unprivileged_port_start=" + number,
        "  sudo setcap cap_net_bind_service=+ep PATH-OF/quorix-host   (again after each build)",
        "  unshare -Urn sh -c 'ip link set lo up && exec quorix-host'   (a network of its own)"};
}

/// Finds out why the plug-in does not listen, by trying what it tried.
std::vector<std::string> AdviseOnSilence(std::uint16_t port,
                                         const std::optional<VSocketRow>& foreign)
{
    switch (const int error = VProbe().Bind(port)) {
    case 0:
        return {"The plug-in does not listen on " + PortText(port) +
                ", although the port is free. No device can connect to this host."};
    case EACCES:
    case EPERM:
        return AdviseOnPrivilege(port);
    case EADDRINUSE:
        if (foreign) {
            return AdviseOnHolder(port, *foreign);
        }
        return {PortText(port) + " is taken by a program that does not listen on it. No device can "
                                 "connect to this host.",
                "Find it with: ss -tanp"};
    default:
        return {PortText(port) + " cannot be bound: " + std::strerror(error) +
                ". No device can connect to this host."};
    }
}

} // namespace

VPortFinding CheckPort(std::uint16_t port)
{
    const VListeners listeners = FindListeners(port);
    if (!listeners.own) {
        return {false, AdviseOnSilence(port, listeners.foreign)};
    }
    if (const int error = VProbe().Connect(port)) {
        return {
            false,
            {"The plug-in listens on " + PortText(port) +
                 ", but a connection to 127.0.0.1 "
                 "fails: " +
                 std::strerror(error) + ".",
             "Is the loopback interface up (ip link set lo up), and does a firewall allow it?"}};
    }
    return {true, {}};
}

} // namespace QuorixHost
