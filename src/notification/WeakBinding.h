#pragma once

#include "notification/DeregisterWeakCallbackException.h"

#include <memory>

namespace KVR {

/// Returns a strong reference to the target of a callback, or ends the call because it is gone.
///
/// Bound in the place of the object, it makes a binding weak: the object is locked when the call
/// begins and held for its length.
/// ```cpp
/// boost::bind(&VServer::OnEvent, boost::bind(&KVR::LockOrDeregister<VServer>, self), ...)
/// ```
/// @throw VDeregisterWeakCallbackException  if the target is gone
template <typename T>
std::shared_ptr<T> LockOrDeregister(const std::weak_ptr<T>& target)
{
    std::shared_ptr<T> locked = target.lock();
    if (!locked) {
        throw VDeregisterWeakCallbackException();
    }
    return locked;
}

} // namespace KVR
