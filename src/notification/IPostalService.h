#pragma once

#include <boost/function.hpp>

#include <cstdint>

namespace KVR {

/// Runs functions later on a thread of its own.
///
/// Whoever holds a service hands over a function and goes on.
class IPostalService
{
public:
    /// Queues a function, which a thread of the service calls through `GuardedCall`. Also from a
    /// function of the same service it runs later, never nested.
    ///
    /// @param token  travels with the queued function and is read by nobody; every caller passes 0
    /// [any]
    virtual void Post(boost::function<void()> function, std::uintptr_t token) = 0;

    virtual ~IPostalService() = default;
};

} // namespace KVR
