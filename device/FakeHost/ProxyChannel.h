#pragma once

#include "FakeHost/ByteProxy.h"

#include <chrono>
#include <deque>

namespace FakeHost {

/// One direction of a proxied connection: what has been read on one side and is to be written on
/// the other.
///
/// Owns: the bytes, neither socket. Threads: the proxy's.
class VProxyChannel
{
public:
    using Clock = std::chrono::steady_clock;

    /// Whether more may be read.
    bool WantsBytes() const { return !ended && heldBytes < HeldLimit; }

    /// Takes over bytes, with what is to become of them.
    void Put(VPassed&& passed, Clock::time_point now);

    /// The side that is read has ended.
    void End() { ended = true; }

    /// Writes what is due, as much as the socket takes.
    ///
    /// @return false where the connection is to be closed: as asked for, or since the other side
    ///         takes nothing any more
    bool Write(int socket, Clock::time_point now);

    bool HasDue(Clock::time_point now) const;

    /// When something becomes due; the last moment of all where nothing waits.
    Clock::time_point NextDue() const;

    /// Whether everything up to the end has been written.
    bool IsDone() const { return ended && pieces.empty(); }

private:
    static constexpr std::size_t HeldLimit = 256U << 10U;

    struct VPiece
    {
        VPassed Passed;
        std::size_t Written = 0;
        Clock::time_point Due;
    };

    std::deque<VPiece> pieces;
    std::size_t heldBytes = 0;
    bool ended = false;
};

} // namespace FakeHost
