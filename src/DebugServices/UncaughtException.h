#pragma once

#include "DebugServices/Export.h"

namespace DebugServices {

/// Logs at level 2 that the exception being handled ends this thread, with the thread's name and
/// the exception's text. To be called in a `catch (...)` around a thread's whole work.
///
/// @param category  name of the log category, zero-terminated; null counts as empty [any]
KVR_DEBUG_SERVICES_EXPORT void ReportUncaughtException(const char* category) noexcept;

} // namespace DebugServices
