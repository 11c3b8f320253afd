#include "FakeHost/FakeHost.h"

#include "QuorixPluginControlStreamServer/ControlStreamServer/IClientConnection.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/Server.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/SocketASIO.h"

#include <boost/bind/bind.hpp>

#include <chrono>
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
        // The content outlives the listening.
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

// A device that does not read its reply holds up the thread for as long as it likes.
constexpr std::chrono::milliseconds commandPatience{2000};

} // namespace

VFakeHost::VFakeHost(std::unique_ptr<IFakeContent> fakeContent, std::uint16_t wantedPort)
    : content(std::move(fakeContent))
{
    listening = std::make_shared<VSocketASIO>(wantedPort);
    port = listening->Port();
    if (port == 0) {
        throw std::runtime_error("port " + std::to_string(wantedPort) +
                                 " cannot be taken: another program has it, or it needs a "
                                 "privilege");
    }
    server = ControlStreamServer::VServer::Create(
        content->ControlSystem(), std::make_shared<VAnnouncingSocket>(listening, *content), nullptr,
        false);
}

VFakeHost::~VFakeHost()
{
    const bool idle = listening->AwaitThread(commandPatience);
    content->SayFarewell();
    server.reset();
    // A message that has come since holds the server and with it the port, which the next host may
    // want at once.
    if (idle) {
        static_cast<void>(listening->AwaitThread(commandPatience));
    }
}

} // namespace FakeHost
