#include "QuorixPluginControlStreamServer/ControlStreamServer/Server.h"

#include "QuorixPluginControlStreamServer/ControlStreamServer/EventMessage.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/IClientConnection.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/ISocket.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserCommandInformation.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserCommandList.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserEventInformation.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserEventList.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserExecuteCommand.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/MessageParserServerInformation.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IControlSystem.h"
#include "notification/WeakBinding.h"

#include <boost/bind/bind.hpp>

#include <algorithm>

namespace ControlStreamServer {

namespace {

std::vector<std::shared_ptr<IMessageParser>>
MakeParsers(const std::shared_ptr<IControlSystem>& controlSystem)
{
    // The order in which a message is offered.
    return {
        std::make_shared<VMessageParserExecuteCommand>(controlSystem),
        std::make_shared<VMessageParserServerInformation>(),
        std::make_shared<VMessageParserCommandList>(controlSystem),
        std::make_shared<VMessageParserCommandInformation>(controlSystem),
        std::make_shared<VMessageParserEventInformation>(controlSystem),
        std::make_shared<VMessageParserEventList>(controlSystem),
    };
}

} // namespace

/// Stands between the socket, which keeps its handler until it is destroyed itself, and the server,
/// which dies first.
///
/// Threads: Open by whoever creates the server, Enter [socket].
class VServer::VGate
{
public:
    void Open(const std::shared_ptr<VServer>& owned)
    {
        KVR::VMutexLock lock(mutex);
        server = owned;
        open = true;
    }

    /// Returns the server, or empty once it is dying.
    ///
    /// Throws std::bad_weak_ptr in the moment between the handler and the owner: a connection that
    /// comes in there ends the socket's thread.
    std::shared_ptr<VServer> Enter()
    {
        KVR::VMutexLock lock(mutex);
        if (!open) {
            throw std::bad_weak_ptr();
        }
        return server.lock();
    }

private:
    KVR::VMutex mutex;
    std::weak_ptr<VServer> server KVR_GUARDED_BY(mutex); // its expiry shuts the gate
    bool open KVR_GUARDED_BY(mutex) = false;
};

std::shared_ptr<VServer> VServer::Create(const std::shared_ptr<IControlSystem>& controlSystem,
                                         const std::shared_ptr<ISocket>& socket,
                                         const std::shared_ptr<KVR::IPostalService>& postalService,
                                         bool translateEntities)
{
    if (!controlSystem || !socket) {
        return nullptr;
    }
    std::shared_ptr<VServer> server(
        new VServer(controlSystem, socket, postalService, translateEntities),
        [](VServer* destroyed) { destroyed->Destroy(); });
    server->gate->Open(server);
    const std::weak_ptr<VServer> self = server;
    server->eventCallbackId = controlSystem->GetEventNotification().Add(
        boost::bind(&VServer::OnEvent, boost::bind(&KVR::LockOrDeregister<VServer>, self),
                    boost::placeholders::_1, boost::placeholders::_2));
    return server;
}

VServer::VServer(const std::shared_ptr<IControlSystem>& controlSystem,
                 const std::shared_ptr<ISocket>& socket,
                 const std::shared_ptr<KVR::IPostalService>& postalService, bool translateEntities)
    : socket(socket),
      postalService(postalService),
      parsers(MakeParsers(controlSystem)),
      controlSystem(controlSystem),
      translateEntities(translateEntities),
      gate(std::make_shared<VGate>())
{
    socket->SetConnectionHandler(boost::bind(&VServer::Admit, gate, boost::placeholders::_1));
}

VServer::~VServer()
{
    controlSystem->GetEventNotification().Remove(eventCallbackId);
    // Without the mutex: a message or an event on its way holds a reference, so there is none.
    for (const std::weak_ptr<IClientConnection>& client : clients) {
        if (const std::shared_ptr<IClientConnection> connection = client.lock()) {
            connection->Close();
        }
    }
}

void VServer::Admit(const std::shared_ptr<VGate>& gate,
                    const std::shared_ptr<IClientConnection>& connection)
{
    // Let go of last, since that may destroy the server, here on the socket's thread.
    const std::shared_ptr<VServer> server = gate->Enter();
    if (server) {
        server->OnConnection(connection);
    } else {
        connection->Close(); // its read is pending, and the socket would wait for it
    }
}

void VServer::OnConnection(const std::shared_ptr<IClientConnection>& connection)
{
    const std::weak_ptr<VServer> self = shared_from_this();
    KVR::VMutexLock lock(mutex);
    RemoveDeadClients();
    clients.push_back(connection);
    connection->GetMessageCallback().SetOn(
        boost::bind(&VServer::OnMessage, boost::bind(&KVR::LockOrDeregister<VServer>, self),
                    boost::placeholders::_1, boost::placeholders::_2),
        postalService);
}

void VServer::RemoveDeadClients()
{
    clients.erase(std::remove_if(clients.begin(), clients.end(),
                                 [](const auto& client) { return client.expired(); }),
                  clients.end());
}

void VServer::OnMessage(const std::shared_ptr<IClientConnection>& connection,
                        const std::wstring& message)
{
    for (const std::shared_ptr<IMessageParser>& parser : parsers) {
        // A fresh copy for each, since a parser may overwrite its own.
        if (parser->Parse(connection, message, translateEntities)) {
            return;
        }
    }
    // Deliberate: what nobody takes is dropped without a word. Devices check what they send.
}

void VServer::OnEvent(const std::wstring& name, const ControlSystem::IParameters& parameters)
{
    const std::wstring text = BuildEventMessage(name, parameters);
    KVR::VMutexLock lock(mutex);
    // Deliberate: the mutex is held while the devices are written to. That keeps the events in one
    // order for all of them; the price is that a device that does not read stalls all the others.
    for (auto client = clients.begin(); client != clients.end();) {
        if (const std::shared_ptr<IClientConnection> connection = client->lock()) {
            connection->Send(text);
            ++client;
        } else {
            client = clients.erase(client);
        }
    }
}

} // namespace ControlStreamServer
