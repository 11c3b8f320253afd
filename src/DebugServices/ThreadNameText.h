#pragma once

namespace DebugServices {

/// Returns the calling thread's whole name for a signal handler: nothing is allocated or locked.
///
/// @return zero-terminated, null if `SetThreadName` was not called or the thread is ending
const char* ThreadNameText();

} // namespace DebugServices
