#pragma once

#include "QuorixPluginControlStreamServer/ControlStreamServer/IServer.h"
#include "utils/Mutex.h"

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

class IControlSystem;

namespace ControlSystem {
class IParameters;
}

namespace KVR {
class IPostalService;
}

namespace ControlStreamServer {

class IClientConnection;
class IMessageParser;
class ISocket;

/// Offers each message of a device to the parsers, and sends each event to every device.
///
/// Nothing here knows of authorization: every connected device can run every command, and hears
/// every event.
///
/// Owns: the parser table, fixed once made. Connections are held weakly: a pending read owns them.
/// Threads: OnConnection [socket]; OnMessage [socket], or a thread of the postal service where one
/// was given; OnEvent [delivering]; destroyed on any.
/// Failure: a message that no parser takes is dropped without a reply; a dead device is noticed at
/// the next event or connection, never before. A device that does not read stalls OnEvent, and
/// through the mutex OnConnection, for as long as it lasts.
class VServer : public IServer, public std::enable_shared_from_this<VServer>
{
public:
    /// Makes the server, which takes over the handler of `socket` and hears the dispatcher's events
    /// from here on. [any]
    ///
    /// @param postalService      runs the parsers; with none they run on the thread that reads
    /// @param translateEntities  whether entities are decoded in every value of a request
    /// @return empty where `controlSystem` or `socket` is empty
    static std::shared_ptr<VServer>
    Create(const std::shared_ptr<IControlSystem>& controlSystem,
           const std::shared_ptr<ISocket>& socket,
           const std::shared_ptr<KVR::IPostalService>& postalService, bool translateEntities);

    VServer(const VServer&) = delete;
    VServer& operator=(const VServer&) = delete;

private:
    class VGate;

    VServer(const std::shared_ptr<IControlSystem>& controlSystem,
            const std::shared_ptr<ISocket>& socket,
            const std::shared_ptr<KVR::IPostalService>& postalService, bool translateEntities);
    ~VServer() override;
    void Destroy() { delete this; }

    static void Admit(const std::shared_ptr<VGate>& gate,
                      const std::shared_ptr<IClientConnection>& connection);

    void OnConnection(const std::shared_ptr<IClientConnection>& connection);
    void OnMessage(const std::shared_ptr<IClientConnection>& connection,
                   const std::wstring& message);
    void OnEvent(const std::wstring& name, const ControlSystem::IParameters& parameters);

    void RemoveDeadClients() KVR_REQUIRES(mutex);

    KVR::VMutex mutex; // lock order: this one, then a connection's own inside Send
    // Released in reverse order, the socket last.
    const std::shared_ptr<ISocket> socket;
    const std::shared_ptr<KVR::IPostalService> postalService;
    std::vector<std::weak_ptr<IClientConnection>> clients KVR_GUARDED_BY(mutex);
    const std::vector<std::shared_ptr<IMessageParser>> parsers;
    const std::shared_ptr<IControlSystem> controlSystem;
    std::uint64_t eventCallbackId = 0;
    const bool translateEntities;
    const std::shared_ptr<VGate> gate;
};

} // namespace ControlStreamServer
