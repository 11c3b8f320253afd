#pragma once

#include "notification/IMultiCallback.h"
#include "notification/IPostalService.h"

#include <memory>

namespace KVR {

/// A list of functions, each of which may be delivered by a postal service.
template <typename Sig>
class IMultiCallbackPostal : public IMultiCallback<Sig>
{
public:
    /// Adds a function for delivery on the given service; without one, on the caller's thread.
    ///
    /// @return a handle as of `Add`
    virtual std::uint64_t AddOn(boost::function<Sig> function,
                                std::shared_ptr<IPostalService> postalService) = 0;

    /// Adds a function for delivery on the thread that calls the list. @return a handle as of `Add`
    virtual std::uint64_t AddDirect(boost::function<Sig> function) = 0;
};

} // namespace KVR
