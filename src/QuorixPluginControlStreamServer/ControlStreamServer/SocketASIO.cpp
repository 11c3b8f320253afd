#include "QuorixPluginControlStreamServer/ControlStreamServer/SocketASIO.h"

#include "QuorixPluginControlStreamServer/ControlStreamServer/ClientConnectionASIO.h"
#include "notification/AwaitTurn.h"
#include "utils/Mutex.h"

#include <boost/asio/io_service.hpp>
#include <boost/asio/ip/tcp.hpp>

#include <utility>

namespace ControlStreamServer {

using boost::asio::ip::tcp;

class VSocketASIO::VAcceptor : public tcp::acceptor
{
public:
    using tcp::acceptor::acceptor;
};

/// What the completions of accepts hold in the place of the socket, which may be gone by then: an
/// accept that has already completed is not cancelled when the acceptor closes.
struct VSocketASIO::VState
{
    KVR::VMutex mutex; // also held to arm an accept and to close the acceptor, which would race
    ConnectionHandler connectionHandler KVR_GUARDED_BY(mutex);
    std::weak_ptr<VAcceptor> acceptor KVR_GUARDED_BY(mutex); // expired once the socket is going

    void OnAccept(const std::shared_ptr<tcp::socket>& socket);
};

VSocketASIO::VSocketASIO(std::uint16_t port)
    : state(std::make_shared<VState>()),
      postalService("VSocketASIO", 1, 0),
      acceptor(std::make_shared<VAcceptor>(postalService.GetIOService()))
{
    acceptor->open(tcp::v4());
    acceptor->set_option(tcp::acceptor::reuse_address(true));
    // Deliberate: a port that cannot be taken is no error. The plug-in starts normally, advertises
    // itself and never accepts; the host, not this object, tells its user.
    if (!TakePort(*acceptor, port)) {
        return;
    }
    listeningPort = acceptor->local_endpoint().port();
    {
        KVR::VMutexLock lock(state->mutex);
        state->acceptor = acceptor;
    }
    ArmAccept(state);
}

bool VSocketASIO::TakePort(VAcceptor& acceptor, std::uint16_t port)
{
    constexpr int systemMaximum = 0x7FFFFFFF;
    try {
        acceptor.bind(tcp::endpoint(tcp::v4(), port));
        acceptor.listen(systemMaximum);
        return true;
    } catch (const boost::system::system_error&) {
        return false; // nobody is told, as the constructor says
    }
}

void VSocketASIO::SetConnectionHandler(ConnectionHandler handler)
{
    KVR::VMutexLock lock(state->mutex);
    state->connectionHandler.swap(handler); // the old one goes after the lock
}

void VSocketASIO::ArmAccept(const std::shared_ptr<VState>& state)
{
    KVR::VMutexLock lock(state->mutex);
    const std::shared_ptr<VAcceptor> acceptor = state->acceptor.lock();
    if (!acceptor) {
        return;
    }
    const auto socket = std::make_shared<tcp::socket>(acceptor->get_executor());
    acceptor->async_accept(*socket, [state, socket](const boost::system::error_code& error) {
        // Deliberate: any error ends accepting for good, the cancellation of the destructor and a
        // lack of descriptors alike. Established connections go on.
        if (!error) {
            state->OnAccept(socket);
            ArmAccept(state);
        }
    });
}

void VSocketASIO::VState::OnAccept(const std::shared_ptr<tcp::socket>& socket)
{
    ConnectionHandler handler;
    {
        KVR::VMutexLock lock(mutex);
        if (acceptor.expired()) {
            return; // the accepted socket closes with its last reference
        }
        handler = connectionHandler;
    }
    const std::shared_ptr<IClientConnection> connection = VClientConnectionASIO::Create(socket);
    handler(connection); // called empty, it ends the thread: nobody would hear this device
}

bool VSocketASIO::AwaitThread(std::chrono::milliseconds limit)
{
    return KVR::AwaitTurn(postalService, limit);
}

VSocketASIO::~VSocketASIO() noexcept(false)
{
    KVR::VMutexLock lock(state->mutex);
    const std::shared_ptr<VAcceptor> closed = std::move(acceptor);
    closed->close();
}

} // namespace ControlStreamServer
