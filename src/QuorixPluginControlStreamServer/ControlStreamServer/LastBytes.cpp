#include "QuorixPluginControlStreamServer/ControlStreamServer/LastBytes.h"

#include <array>
#include <cerrno>
#include <cstddef>
#include <utility>

#include <linux/sockios.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <sys/socket.h>

namespace ControlStreamServer {

namespace {

int BytesNotSent(int descriptor)
{
    int unsent = 0;
    return ::ioctl(descriptor, SIOCOUTQNSD, &unsent) == 0 ? unsent : 0;
}

/// @return false where the peer has ended the stream or the connection is broken
bool ThrowAwayWhatCame(int descriptor)
{
    std::array<char, std::size_t{16} * 1024> ignored;
    const ssize_t count = ::recv(descriptor, ignored.data(), ignored.size(), MSG_DONTWAIT);
    return count > 0 || (count < 0 && (errno == EAGAIN || errno == EINTR));
}

} // namespace

void AwaitLastBytes(int descriptor, std::chrono::milliseconds limit)
{
    using std::chrono::steady_clock;
    // The system tells nobody when it has sent a byte, so it is asked again when some come, or
    // soon.
    constexpr int soon = 2; // milliseconds
    constexpr std::chrono::milliseconds patience{50};

    auto now = steady_clock::now();
    const auto deadline = now + limit;
    auto lastTaken = now;
    int unsent = BytesNotSent(descriptor);
    while (unsent > 0 && now < deadline && now < lastTaken + patience) {
        pollfd poller{descriptor, POLLIN, 0};
        static_cast<void>(::poll(&poller, 1, soon));
        if (!ThrowAwayWhatCame(descriptor)) {
            return;
        }
        now = steady_clock::now();
        const int before = std::exchange(unsent, BytesNotSent(descriptor));
        if (unsent < before) {
            lastTaken = now;
        }
    }
}

} // namespace ControlStreamServer
