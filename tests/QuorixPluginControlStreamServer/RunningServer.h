#pragma once

#include "QuorixPluginControlStreamServer/ControlStreamServer/Server.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/SocketASIO.h"
#include "notification/AsioPostalService.h"
#include "support/FakeControlSystem.h"
#include "support/RawClient.h"

#include <memory>
#include <ostream>
#include <string>

/// In which of its ways the server is run.
struct VServerMode
{
    const char* Name = "AsThePlugInSetsIt";
    bool TranslateEntities = false;
    bool OwnPostalService = false;
};

inline void PrintTo(const VServerMode& mode, std::ostream* out)
{
    *out << mode.Name;
}

/// A server on a free port, its dispatcher, and the devices' way to it.
class VRunningServer
{
public:
    explicit VRunningServer(const VServerMode& mode = {})
    {
        if (mode.OwnPostalService) {
            PostalService =
                std::make_shared<NotificationSystem::VAsioPostalService>("Parsers", 1, 0);
        }
        Server = ControlStreamServer::VServer::Create(Dispatcher, Socket, PostalService,
                                                      mode.TranslateEntities);
    }

    ~VRunningServer() { Stop(); }

    VRunningServer(const VRunningServer&) = delete;
    VRunningServer& operator=(const VRunningServer&) = delete;

    /// Releases in the order in which the plug-in does.
    void Stop()
    {
        Server.reset();
        Socket.reset();
    }

    /// Returns a device that the server has taken among its clients: it has had an answer.
    TestSupport::VRawClient Connect()
    {
        TestSupport::VRawClient client(Socket->Port());
        Fence(client);
        return client;
    }

    /// Returns once the server has handled all that this device sent before, and whatever came in
    /// from others before that. Twice, since what the first request finds in the same round of
    /// events may be handled behind it.
    static void Fence(TestSupport::VRawClient& client)
    {
        client.Request("<ServerInformation/>");
        client.Request("<ServerInformation/>");
    }

    /// Publishes an event with one parameter.
    void Fire(const std::wstring& name, const std::wstring& value = L"1")
    {
        ControlSystem::IParameters parameters;
        parameters.Set(L"P", value);
        Dispatcher->FireEvent(name, parameters);
    }

    const std::shared_ptr<TestSupport::VFakeControlSystem> Dispatcher =
        std::make_shared<TestSupport::VFakeControlSystem>();
    std::shared_ptr<KVR::IPostalService> PostalService; // stops last: the parsers run on it
    std::shared_ptr<ControlStreamServer::VSocketASIO> Socket =
        std::make_shared<ControlStreamServer::VSocketASIO>(0);
    std::shared_ptr<ControlStreamServer::VServer> Server;
};
