#include "QuorixPluginControlStreamServer/ControlStreamServer/LastBytes.h"

#include <array>
#include <atomic>
#include <cerrno>
#include <cstddef>
#include <utility>

#include <linux/sockios.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <sys/socket.h>

namespace ControlStreamServer {

namespace {

using std::chrono::steady_clock;

/// When a wait last ended with a device that took nothing.
std::atomic<steady_clock::time_point> lastInVain{steady_clock::time_point::min()};

/// Returns how long a device may take nothing. A network that has lost a segment needs some 200 ms.
std::chrono::milliseconds Patience(steady_clock::time_point now)
{
    constexpr std::chrono::milliseconds forTheFirst{500};
    constexpr std::chrono::milliseconds forTheNext{50};
    constexpr std::chrono::seconds together{1};
    return lastInVain.load() + together > now ? forTheNext : forTheFirst;
}

/// Returns how many bytes the peer has not acknowledged; an end of the stream counts as one.
int BytesOwed(int descriptor)
{
    int owed = 0;
    return ::ioctl(descriptor, SIOCOUTQ, &owed) == 0 ? owed : 0;
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
    // The system tells nobody of an acknowledgement, so it is asked again when bytes come, or soon.
    constexpr int soon = 2; // milliseconds
    constexpr int onlyTheEnd = 1;

    auto now = steady_clock::now();
    const std::chrono::milliseconds patience = Patience(now);
    const auto deadline = now + limit;
    auto lastTaken = now;
    int owed = BytesOwed(descriptor);
    while (owed > onlyTheEnd && now < deadline && now < lastTaken + patience) {
        pollfd poller{descriptor, POLLIN, 0};
        static_cast<void>(::poll(&poller, 1, soon));
        if (!ThrowAwayWhatCame(descriptor)) {
            return;
        }
        now = steady_clock::now();
        const int before = std::exchange(owed, BytesOwed(descriptor));
        if (owed < before) {
            lastTaken = now;
        }
    }
    if (owed > onlyTheEnd) {
        lastInVain = now;
    }
}

} // namespace ControlStreamServer
