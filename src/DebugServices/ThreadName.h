#pragma once

#include "DebugServices/Export.h"

#include <string>

namespace DebugServices {

/// Names the calling thread for debuggers, logs and crash reports.
///
/// The kernel keeps the first 15 bytes, this library the whole name, since names such as "Control
/// Heartbeat Monitor0" are told apart by their end only.
///
/// @param name  zero-terminated; null counts as empty [any]
KVR_DEBUG_SERVICES_EXPORT void SetThreadName(const char* name);

/// Returns the whole name of the calling thread, or what the kernel calls it if `SetThreadName` was
/// never called on it. [any]
KVR_DEBUG_SERVICES_EXPORT std::string GetThreadName();

} // namespace DebugServices
