#pragma once

#include "notification/DeregisterWeakCallbackException.h"

#include <boost/function.hpp>

#include <utility>

namespace KVR {

/// Calls a stored function. Every stored function runs through this call.
///
/// @return false if the function's target is gone, so that its entry should go too
/// @throw boost::bad_function_call  if the function is empty; any exception of the function other
/// than `VDeregisterWeakCallbackException` passes through
template <typename Sig, typename... Args>
bool GuardedCall(const boost::function<Sig>& function, Args&&... arguments)
{
    try {
        function(std::forward<Args>(arguments)...);
    } catch (const VDeregisterWeakCallbackException&) {
        return false;
    }
    return true;
}

} // namespace KVR
