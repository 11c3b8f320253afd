#pragma once

#include <chrono>
#include <set>
#include <sys/types.h>

namespace QuorixHost {

/// Returns the threads that this process has now; empty without /proc. [any]
std::set<pid_t> OwnThreads();

/// Waits until no other threads are left than these.
///
/// A plug-in may leave a thread behind that is about to end: the one that was handling a device's
/// message when the plug-in was destroyed. It is better off while the process is still whole.
///
/// @return false when some are left: at the end of the limit, or earlier where all of them only
/// wait for something that does not come, as the thread of a client library does that never ends
/// [any]
bool AwaitEndOfOtherThreads(const std::set<pid_t>& staying, std::chrono::milliseconds limit);

} // namespace QuorixHost
