#include "FakeHost/FakeHost.h"

#include "QuorixPluginControlStreamServer/ControlStreamServer/IClientConnection.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/Server.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/SocketASIO.h"

#include <boost/bind/bind.hpp>

#include <stdexcept>
#include <utility>

namespace FakeHost {

namespace {

using ControlStreamServer::IClientConnection;
using ControlStreamServer::VSocketASIO;

/// The listening socket, which tells the content of each device before the server gets it.
class VAnnouncingSocket : public ControlStreamServer::ISocket
{
public:
    VAnnouncingSocket(std::shared_ptr<VSocketASIO> listeningSocket, IFakeContent& fakeContent)
        : socket(std::move(listeningSocket)), content(fakeContent)
    {
    }

    void SetConnectionHandler(ConnectionHandler handler) override
    {
        // The content outlives the socket's thread.
        socket->SetConnectionHandler(boost::bind(&VAnnouncingSocket::Announce, &content,
                                                 std::move(handler), boost::placeholders::_1));
    }

    ~VAnnouncingSocket() noexcept(false) override = default;

private:
    static void Announce(IFakeContent* told, const ConnectionHandler& handler,
                         const std::shared_ptr<IClientConnection>& connection)
    {
        told->OnDevice();
        handler(connection);
    }

    const std::shared_ptr<VSocketASIO> socket;
    IFakeContent& content;
};

} // namespace

VFakeHost::VFakeHost(std::unique_ptr<IFakeContent> fakeContent, std::uint16_t wantedPort)
    : content(std::move(fakeContent))
{
    auto listening = std::make_shared<VSocketASIO>(wantedPort);
    port = listening->Port();
    if (port == 0) {
        throw std::runtime_error("port " + std::to_string(wantedPort) +
                                 " cannot be taken: another program has it, or it needs a "
                                 "privilege");
    }
    socket = std::make_shared<VAnnouncingSocket>(std::move(listening), *content);
    server = ControlStreamServer::VServer::Create(content->ControlSystem(), socket, nullptr, false);
}

VFakeHost::~VFakeHost()
{
    content->SayFarewell();
    server.reset();
    socket.reset();
}

} // namespace FakeHost
