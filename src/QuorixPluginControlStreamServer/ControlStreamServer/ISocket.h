#pragma once

#include <boost/function.hpp>

#include <memory>

namespace ControlStreamServer {

class IClientConnection;

/// A listening end that hands each new connection to one handler.
class ISocket
{
public:
    using ConnectionHandler = boost::function<void(std::shared_ptr<IClientConnection>)>;

    /// Replaces the handler, which then gets every connection on the socket's own thread. [any]
    virtual void SetConnectionHandler(ConnectionHandler handler) = 0;

    virtual ~ISocket() noexcept(false) {} // "close" may leave an implementation
};

} // namespace ControlStreamServer
