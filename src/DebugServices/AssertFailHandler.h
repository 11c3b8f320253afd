#pragma once

#include "DebugServices/Export.h"

#include <boost/function.hpp>

namespace DebugServices {

/// What happens at a failed assertion: the expression, the source file and the line.
///
/// It may return, and the caller then goes on; it may throw, and the exception passes through
/// whoever called `CallAssertFailHandler`.
using AssertFailHandler = boost::function<void(const char* expression, const char* file, int line)>;

/// Reports a failed assertion to the handler in place. Without one the assertion is logged at level
/// 2 to "Assertion", whatever the level of that category, and the process is aborted.
///
/// @param expression, file  zero-terminated; null counts as empty
/// The handler runs on the calling thread, with no lock of this library held. [any]
KVR_DEBUG_SERVICES_EXPORT void CallAssertFailHandler(const char* expression, const char* file,
                                                     int line);

/// Puts a handler in place for the whole process.
///
/// @param handler  empty brings back logging and aborting
/// @return the handler so far, empty if it was logging and aborting. A call that already runs goes
/// on in the old handler. [any]
KVR_DEBUG_SERVICES_EXPORT AssertFailHandler SetAssertFailHandler(AssertFailHandler handler);

} // namespace DebugServices
