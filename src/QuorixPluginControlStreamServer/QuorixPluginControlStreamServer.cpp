#include "QuorixPluginControlStreamServer/QuorixPluginControlStreamServer.h"

#include "NSDBonjour/BonjourRegistrar.h"
#include "QuorixPluginControlStreamServer/Authorization/ControlPanel.h"
#include "QuorixPluginControlStreamServer/Authorization/QuorixControlAuthorization.h"
#include "QuorixPluginControlStreamServer/Authorization/QuorixControlAuthorizationGUI.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/Server.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/SocketASIO.h"
#include "QuorixPluginControlStreamServer/ControlSystem/CommandProviderAuthorization.h"
#include "QuorixPluginControlStreamServer/ControlSystem/CommandProviderCameraSettings.h"
#include "QuorixPluginControlStreamServer/ControlSystem/EventProviderAuthorized.h"
#include "QuorixPluginControlStreamServer/ControlSystem/EventProviderCameraSelection.h"
#include "QuorixPluginControlStreamServer/ControlSystem/EventProviderCameraSettings.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IControlSystem.h"
#include "QuorixPluginInterface/IHost.h"
#include "QuorixPluginInterface/IQuorixGUI.h"
#include "notification/MakeShared.h"

#include <boost/asio/ip/host_name.hpp>

#include <QCoreApplication>
#include <QThread>

#include <chrono>
#include <cstdint>

namespace {

// Devices know this port; there is no setting for it.
constexpr std::uint16_t controlStreamPort = 803;

// Commands end at once, but a device that does not read its reply holds up the socket's thread for
// as long as it likes.
constexpr std::chrono::milliseconds commandPatience{2000};

} // namespace

VQuorixPluginControlStreamServer::VQuorixPluginControlStreamServer() = default;

VQuorixPluginControlStreamServer::~VQuorixPluginControlStreamServer()
{
    // A command or a check that is running holds the authorization, whose end would then come with
    // theirs: too late to reach the devices, once the server has gone.
    const bool idle = socket && socket->AwaitThread(commandPatience);
    if (authorization) {
        authorization->EndHeartbeatCheck();
    }

    authorizationGUI.reset();
    authorization.reset();
    controlSystem.reset();
    eventProviders.clear();
    commandProviders.clear();
    server.reset();
    // A message that has come since holds the server, which holds the socket: the port would stay
    // taken for a moment, and a host that starts the plug-in again would find nobody listening.
    if (idle) {
        (void)socket->AwaitThread(commandPatience);
    }
}

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
    const std::shared_ptr<IDataStore> store = host.GetStore();
    const std::shared_ptr<ICameraSettingsSource> settings = host.GetCameraSettingsSource();
    const std::shared_ptr<ICameraSelectionSource> selection = host.GetCameraSelectionSource();
    authorization = KVR::MakeShared<VQuorixControlAuthorization>(host.GetPostalService(), store);

    commandProviders.push_back(std::make_shared<VCommandProviderAuthorization>(authorization));
    commandProviders.push_back(
        std::make_shared<VCommandProviderCameraSettings>(selection, settings));
    eventProviders.push_back(
        std::make_shared<VEventProviderAuthorized>(controlSystem, authorization));
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
    auto* thread = new QThread;
    auto* registrar = new VBonjourRegistrar;
    registrar->moveToThread(thread);
    qRegisterMetaType<VNSDService>("VNSDService");
    QObject::connect(thread, &QThread::finished, thread, &QThread::deleteLater);
    QObject::connect(registrar, &VBonjourRegistrar::error, thread, &QThread::quit);
    QObject::connect(registrar, &VBonjourRegistrar::serviceRegistered, thread, &QThread::quit);
    thread->start(QThread::InheritPriority);
    const QString name = QCoreApplication::applicationName() + QStringLiteral(" on ") +
                         QString::fromStdString(boost::asio::ip::host_name());
    emit registrar->Register(name);
    // Deliberate: neither is kept. The thread ends and deletes itself at the first outcome; the
    // registrar is never deleted, as its end would withdraw the advertisement.
}

bool VQuorixPluginControlStreamServer::InitialiseGUI(QuorixPluginInterface::IHost& host,
                                                     IQuorixGUI& gui)
{
    authorizationGUI = KVR::MakeShared<VQuorixControlAuthorizationGUI>(
        gui.GetQuickContext(), authorization, host.GetStore(), nullptr);
    AddControlPanel(gui, authorization);
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
