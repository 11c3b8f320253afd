#include "korva-control/PortProbe.h"

#include "ControlStreamClient/Deadline.h"

#include <cerrno>

#include <arpa/inet.h>
#include <netinet/in.h>
#include <poll.h>
#include <sys/socket.h>
#include <unistd.h>

namespace {

/// Waits for the outcome of a connection that is being made. Returns its error number.
int AwaitConnection(int socket, const ControlStream::VDeadline& deadline)
{
    pollfd waiting{socket, POLLOUT, 0};
    int ready = 0;
    do {
        ready = poll(&waiting, 1, deadline.PollMilliseconds());
    } while ((ready < 0 && errno == EINTR) || (ready == 0 && !deadline.IsOver()));
    if (ready <= 0) {
        return ready == 0 ? ETIMEDOUT : errno;
    }
    int error = 0;
    socklen_t size = sizeof error;
    return getsockopt(socket, SOL_SOCKET, SO_ERROR, &error, &size) == 0 ? error : errno;
}

} // namespace

int ProbePort(const std::string& address, std::uint16_t port, std::chrono::milliseconds limit)
{
    const ControlStream::VDeadline deadline(limit);
    sockaddr_in peer{};
    peer.sin_family = AF_INET;
    peer.sin_port = htons(port);
    if (inet_pton(AF_INET, address.c_str(), &peer.sin_addr) != 1) {
        return EINVAL;
    }
    const int socket = ::socket(AF_INET, SOCK_STREAM | SOCK_NONBLOCK | SOCK_CLOEXEC, 0);
    if (socket < 0) {
        return errno;
    }
    int error = 0;
    if (connect(socket, reinterpret_cast<const sockaddr*>(&peer), sizeof peer) != 0) {
        error = errno == EINPROGRESS ? AwaitConnection(socket, deadline) : errno;
    }
    close(socket);
    return error;
}
