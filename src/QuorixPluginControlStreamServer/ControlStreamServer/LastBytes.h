#pragma once

#include <chrono>

namespace ControlStreamServer {

/// How long a close waits, at most, for a device that takes what it is still owed.
constexpr std::chrono::milliseconds lastBytesLimit{1000};

/// Waits until the peer has acknowledged everything that was written to a TCP socket; meanwhile it
/// throws away what comes in.
///
/// A system that closes a socket with unread bytes resets the connection and forgets what it had
/// still to send, so that a device which is sending would not hear the last event. That the bytes
/// have been sent is not enough: a reset may overtake them, also on one machine with two cores.
/// Returns early where the peer has gone, and where it takes nothing for half a second, or for 50
/// ms within a second of another wait that ended so: many devices that do not read would add up to
/// a stop without end, and whoever is closed later had the time of the earlier waits as well. [any]
void AwaitLastBytes(int descriptor, std::chrono::milliseconds limit);

} // namespace ControlStreamServer
