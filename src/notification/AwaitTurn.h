#pragma once

#include <chrono>

namespace KVR {

class IPostalService;

/// Waits until a postal service of one thread has done what it was doing and what was posted
/// before: whoever was inside a function of it has left. Not for the service's own thread.
///
/// @param limit  a thread that has died, or is held up for good, is waited for no longer
/// @return false at the limit
bool AwaitTurn(IPostalService& service, std::chrono::milliseconds limit);

} // namespace KVR
