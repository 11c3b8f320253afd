#pragma once

#include "notification/IPostalService.h"

#include <memory>

// Named here without its header, which costs every source that includes it seconds of building.
// Whoever uses the service includes <boost/asio/io_service.hpp>.
namespace boost {
namespace asio {
class io_context;
typedef io_context io_service;
} // namespace asio
} // namespace boost

namespace KVR {

/// A postal service whose threads also complete socket operations and timers.
class IAsioPostalService : public IPostalService
{
public:
    /// Returns the I/O service that the threads run, the same one for the whole life of this
    /// object. It is not for its user to stop: threads of a started service would run it on. [any]
    virtual boost::asio::io_service& GetIOService() = 0;

    /// Returns the same I/O service to keep it alive; functions still queued go with the last
    /// reference and are not called. [any]
    virtual std::shared_ptr<boost::asio::io_service> GetIOServicePtr() = 0;
};

} // namespace KVR
