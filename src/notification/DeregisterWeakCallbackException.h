#pragma once

#include <exception>

namespace KVR {

/// Thrown by a stored function whose target is gone, to say that its entry should go as well. It is
/// a signal and no error: `GuardedCall` ends it.
///
/// Default visibility, because host and plug-in throw and catch it across their border.
class __attribute__((visibility("default"))) VDeregisterWeakCallbackException
    : public std::exception
{
};

} // namespace KVR
