#pragma once

#include "QuorixPluginInterface/IPlugin.h"

#include <memory>
#include <vector>

class IControlSystem;
class VQuorixControlAuthorization;
class VQuorixControlAuthorizationGUI;

namespace ControlStreamServer {
class IServer;
class VSocketASIO;
} // namespace ControlStreamServer

namespace ControlSystem {
class ICommandProvider;
class IEventProvider;
} // namespace ControlSystem

/// The plug-in: the root of ownership of all that serves remote control devices.
///
/// Owns: the listening socket, the server and the providers; shares the host's dispatcher.
/// Threads: every operation [gui]. The order of calls is the host's matter and not checked.
/// Failure: an exception out of a step of Start leaves to the host. A port that cannot be taken is
/// none: the plug-in then starts as usual and no device can connect.
class VQuorixPluginControlStreamServer : public QuorixPluginInterface::IPlugin
{
public:
    VQuorixPluginControlStreamServer();

    /// Closes every device's connection and waits for the socket's thread.
    ~VQuorixPluginControlStreamServer() override;

    VQuorixPluginControlStreamServer(const VQuorixPluginControlStreamServer&) = delete;
    VQuorixPluginControlStreamServer& operator=(const VQuorixPluginControlStreamServer&) = delete;

    /// Takes the host's services, listens, and registers the providers. Without a dispatcher there
    /// is neither socket nor server. A device may connect before the providers are registered, and
    /// sees empty lists for that moment.
    ///
    /// @return always true
    /// Throws boost::system::system_error where the socket can be neither opened nor set up.
    bool Start(QuorixPluginInterface::IHost& host) override;

    /// Adds the plug-in's windows to the host's. @return always true
    bool InitialiseGUI(QuorixPluginInterface::IHost& host, IQuorixGUI& gui) override;

    /// Takes the providers out of the dispatcher and stops nothing else: devices stay connected,
    /// and others may connect, until the destructor.
    void Stop() override;

private:
    void BuildAuthorizationAndProviders(QuorixPluginInterface::IHost& host);
    void Listen();
    void RegisterProviders();
    void Advertise();

    // Released in reverse order, which is what ends the plug-in without a hang: the last reference
    // to the authorization goes with the command providers, while the server can still tell the
    // devices of it; the server closes every connection; and only then can the socket wait for its
    // thread, which a connection with a pending read would hold up.
    std::shared_ptr<ControlStreamServer::VSocketASIO> socket;
    std::shared_ptr<ControlStreamServer::IServer> server;
    std::vector<std::shared_ptr<ControlSystem::ICommandProvider>> commandProviders;
    std::vector<std::shared_ptr<ControlSystem::IEventProvider>> eventProviders;
    std::shared_ptr<IControlSystem> controlSystem;
    std::shared_ptr<VQuorixControlAuthorization> authorization;
    std::shared_ptr<VQuorixControlAuthorizationGUI> authorizationGUI;
};
