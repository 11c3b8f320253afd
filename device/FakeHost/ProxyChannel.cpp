#include "FakeHost/ProxyChannel.h"

#include <algorithm>
#include <cerrno>
#include <utility>

#include <sys/socket.h>

namespace FakeHost {

void VProxyChannel::Put(VPassed&& passed, Clock::time_point now)
{
    VPiece piece;
    piece.Due = now + passed.Wait;
    piece.Passed = std::move(passed);
    heldBytes += piece.Passed.Bytes.size();
    pieces.push_back(std::move(piece));
}

bool VProxyChannel::Write(int socket, Clock::time_point now)
{
    while (HasDue(now)) {
        VPiece& piece = pieces.front();
        const std::string& bytes = piece.Passed.Bytes;
        while (piece.Written < bytes.size()) {
            const ssize_t count = send(socket, bytes.data() + piece.Written,
                                       bytes.size() - piece.Written, MSG_NOSIGNAL | MSG_DONTWAIT);
            if (count < 0) {
                return errno == EAGAIN || errno == EINTR;
            }
            piece.Written += static_cast<std::size_t>(count);
        }
        heldBytes -= bytes.size();
        if (piece.Passed.Close) {
            return false;
        }
        pieces.pop_front();
    }
    return true;
}

bool VProxyChannel::HasDue(Clock::time_point now) const
{
    return !pieces.empty() && pieces.front().Due <= now;
}

VProxyChannel::Clock::time_point VProxyChannel::NextDue() const
{
    return pieces.empty() ? Clock::time_point::max() : pieces.front().Due;
}

} // namespace FakeHost
