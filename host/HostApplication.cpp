#include "HostApplication.h"

#include "CameraCommands.h"
#include "ConsoleCommands.h"
#include "ConsoleStream.h"
#include "ControlSystem.h"
#include "FileLimit.h"
#include "HostCommandProvider.h"
#include "HostFolders.h"
#include "LeftThreads.h"
#include "Plugin.h"
#include "PortCheck.h"
#include "QuorixPluginInterface/IPlugin.h"
#include "QuorixPreferences/Preferences.h"
#include "StalledPeers.h"
#include "cameras/SimulatedCameras.h"
#include "utils/LogStatement.h"

#include <QCoreApplication>

#include <exception>
#include <unistd.h>
#include <utility>

namespace QuorixHost {
namespace {

constexpr int startFailedExitCode = 1;

// The control stream's port, which the plug-in fixes.
constexpr std::uint16_t controlStreamPort = 803;

// How long an orderly stop may take before the log says what holds it up.
constexpr std::chrono::milliseconds stopPatience{5000};

// How long a thread that the plug-in left behind may take to end. One that never ends is harmless.
constexpr std::chrono::milliseconds leftThreadLimit{1000};

/// Finds or makes the host's folders. Where none was asked for, a host runs without any too.
///
/// @return null where the host has to do without; throws where the folder that was asked for
/// cannot be used
std::unique_ptr<VHostFolders> PrepareFolders(const std::string& wanted)
{
    if (!wanted.empty()) {
        return std::make_unique<VHostFolders>(wanted);
    }
    const std::string folder = DefaultDataFolder();
    try {
        if (!folder.empty()) {
            return std::make_unique<VHostFolders>(folder);
        }
        KVR_LOG("Host", 3, "There is no home folder: preferences are not kept");
    } catch (const std::exception& exception) {
        KVR_LOG("Host", 3, "Preferences are not kept: %1%", exception.what());
    }
    return nullptr;
}

} // namespace

VHostApplication::VHostApplication(VOptions options, const VMakeHostWindow& makeWindow)
    : options(std::move(options)),
      quit([this] { RequestEnd(); }),
      orderlyStop([this] { quit.Wake(); }, [] { return DescribeStalledPeers(controlStreamPort); },
                  stopPatience),
      host(this->options.cameras)
{
    if (makeWindow) {
        window = makeWindow(host, [this] { orderlyStop.Request(); });
    }
}

VHostApplication::~VHostApplication() = default;

int VHostApplication::Run()
{
    const std::set<pid_t> ownThreads = OwnThreads();
    RaiseFileLimit();
    const bool started = StartPlugin();
    if (started) {
        Serve();
        StopPlugin();
        if (folders != nullptr) {
            // After the plug-in has gone, which writes its lists then.
            SavePreferences(*host.GetStore(), *folders);
        }
    }
    window.reset();
    host.Close();
    if (!AwaitEndOfOtherThreads(ownThreads, leftThreadLimit)) {
        KVR_LOG("Host", 6, "The plug-in has left threads behind");
    }
    if (!started) {
        return startFailedExitCode;
    }
    KVR_LOG("Host", 4, "Stopped");
    return 0;
}

void VHostApplication::Serve()
{
    ReportPort();
    if (window) {
        window->Show();
    }
    if (options.console) {
        OpenConsole();
    }
    QCoreApplication::exec();
    consoleStream.reset();
}

void VHostApplication::RequestEnd()
{
    // The loop of an open dialog ends together with the outermost one, but without an answer.
    if (window) {
        window->EndDialogs();
    }
    QCoreApplication::quit();
}

bool VHostApplication::StartPlugin()
{
    try {
        // Before the plug-in is made, which reads its lists then.
        folders = PrepareFolders(options.dataFolder);
        if (folders != nullptr) {
            LoadPreferences(*host.GetStore(), *folders);
        }
        host.GetControlSystem()->AddCommandProvider(std::make_shared<VHostCommandProvider>(
            [cameras = host.Cameras().cameras] { return cameras->CameraNumbers(); }));

        const std::string path = options.plugin.empty() ? FindOwnPlugin() : options.plugin;
        plugin = std::make_unique<VPlugin>(path);
        KVR_LOG("Host", 4, "Loaded the plug-in %1%", path);
        if ((*plugin)->Start(host)) {
            StartPluginGUI();
            // Only what is reported from now on is heard of by the plug-in.
            host.Cameras().cameras->ReportDevices();
            return true;
        }
        KVR_LOG("Host", 2, "The plug-in %1% did not start", path);
    } catch (const std::exception& exception) {
        KVR_LOG("Host", 2, "Cannot start: %1%", exception.what());
    }
    plugin.reset();
    return false;
}

void VHostApplication::StartPluginGUI()
{
    if (window && !(*plugin)->InitialiseGUI(host, window->GUI())) {
        KVR_LOG("Host", 3, "The plug-in adds nothing to the window");
    }
}

void VHostApplication::ReportPort() const
{
    const VPortFinding finding = CheckPort(controlStreamPort);
    if (finding.answers) {
        KVR_LOG("Host", 4, "Devices can connect to TCP port %1%", controlStreamPort);
    }
    for (const std::string& line : finding.advice) {
        KVR_LOG("Host", 2, "%1%", line);
    }
}

void VHostApplication::OpenConsole()
{
    AddEventCommands(console, host.GetControlSystem());
    AddClockCommand(console);
    AddStopCommand(console, [this] {
        consoleStream->End();
        orderlyStop.Request();
    });
    AddCameraCommands(console, host.Cameras());
    AddCameraState(console, host.Cameras());
    if (window) {
        window->AddToConsole(console);
    }

    consoleStream = std::make_unique<VConsoleStream>(console, STDIN_FILENO, STDOUT_FILENO);
    consoleStream->WriteLine("ready");
}

void VHostApplication::StopPlugin()
{
    if (window) {
        window->ClosePanels(); // they hold what the plug-in must be the last to let go of
    }
    (*plugin)->Stop();
    plugin.reset();
}

} // namespace QuorixHost
