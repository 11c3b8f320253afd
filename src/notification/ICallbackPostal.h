#pragma once

#include "notification/ICallback.h"
#include "notification/IPostalService.h"

#include <memory>

namespace KVR {

/// A single callback whose function may be delivered by a postal service.
template <typename Sig>
class ICallbackPostal : public ICallback<Sig>
{
public:
    /// Stores a function for delivery on the given service; without one, on the caller's thread.
    virtual void SetOn(boost::function<Sig> function,
                       std::shared_ptr<IPostalService> postalService) = 0;

    /// Stores a function for delivery on the thread that calls the callback.
    virtual void SetDirect(boost::function<Sig> function) = 0;
};

} // namespace KVR
