#include "QuorixPluginControlStreamServer/QuorixPluginControlStreamServer.h"

#include "QuorixPluginControlStreamServer/ControlStreamServer/Server.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/SocketASIO.h"
#include "QuorixPluginControlStreamServer/ControlSystem/CommandProviderCameraSettings.h"
#include "QuorixPluginControlStreamServer/ControlSystem/EventProviderCameraSelection.h"
#include "QuorixPluginControlStreamServer/ControlSystem/EventProviderCameraSettings.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IControlSystem.h"
#include "QuorixPluginInterface/IHost.h"
#include "notification/MakeShared.h"

#include <cstdint>

namespace {

// Devices know this port; there is no setting for it.
constexpr std::uint16_t controlStreamPort = 803;

} // namespace

VQuorixPluginControlStreamServer::VQuorixPluginControlStreamServer() = default;

VQuorixPluginControlStreamServer::~VQuorixPluginControlStreamServer() = default;

bool VQuorixPluginControlStreamServer::Start(QuorixPluginInterface::IHost& host)
{
    controlSystem = host.GetControlSystem();
    BuildAuthorizationAndProviders(host);
    if (controlSystem) {
        Listen();
        RegisterProviders();
    }
    Advertise();
    return true;
}

void VQuorixPluginControlStreamServer::BuildAuthorizationAndProviders(
    QuorixPluginInterface::IHost& host)
{
    const std::shared_ptr<ICameraSettingsSource> settings = host.GetCameraSettingsSource();
    const std::shared_ptr<ICameraSelectionSource> selection = host.GetCameraSelectionSource();

    commandProviders.push_back(
        std::make_shared<VCommandProviderCameraSettings>(selection, settings));
    eventProviders.push_back(
        KVR::MakeShared<VEventProviderCameraSelection>(controlSystem.get(), selection));
    eventProviders.push_back(
        KVR::MakeShared<VEventProviderCameraSettings>(controlSystem.get(), settings));
}

void VQuorixPluginControlStreamServer::Listen()
{
    socket = std::make_shared<ControlStreamServer::VSocketASIO>(controlStreamPort);
    // No postal service: messages are handled on the socket's thread. Entities stay as they are.
    server = ControlStreamServer::VServer::Create(controlSystem, socket, nullptr, false);
}

void VQuorixPluginControlStreamServer::RegisterProviders()
{
    for (const auto& provider : commandProviders) {
        controlSystem->AddCommandProvider(provider);
    }
    for (const auto& provider : eventProviders) {
        controlSystem->AddEventProvider(provider);
    }
}

void VQuorixPluginControlStreamServer::Advertise()
{
    // Devices find the host by its address: nothing is announced on the network.
}

bool VQuorixPluginControlStreamServer::InitialiseGUI(QuorixPluginInterface::IHost& /*host*/,
                                                     IQuorixGUI& /*gui*/)
{
    return true;
}

void VQuorixPluginControlStreamServer::Stop()
{
    if (!controlSystem) {
        return;
    }
    for (const auto& provider : commandProviders) {
        controlSystem->RemoveCommandProvider(provider);
    }
    for (const auto& provider : eventProviders) {
        controlSystem->RemoveEventProvider(provider);
    }
}
