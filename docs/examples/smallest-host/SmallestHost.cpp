// The smallest complete host: every service that the control stream plug-in asks for, and no more.
//
//     smallest-host PLUGIN
//
// It shows an empty window with the plug-in's menu item, asks its user about devices, and ends at
// the first line of its standard input, or when its window is closed.

#include "QtQuickView/QuickWidgetManager.h"
#include "QuorixDataStore/DataStore.h"
#include "QuorixPluginControlStreamServer/ControlSystem/ICommandProvider.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IControlSystem.h"
#include "QuorixPluginControlStreamServer/ControlSystem/IEventProvider.h"
#include "QuorixPluginInterface/IHost.h"
#include "QuorixPluginInterface/IMenuService.h"
#include "QuorixPluginInterface/IPanelService.h"
#include "QuorixPluginInterface/IPlugin.h"
#include "QuorixPluginInterface/IQuorixGUI.h"
#include "notification/GuardedCall.h"
#include "notification/IPostalService.h"
#include "notification/MultiCallbackPostal.h"
#include "qml/QmlModules.h"
#include "utils/LogStatement.h"
#include "utils/Mutex.h"

#include <QAction>
#include <QApplication>
#include <QDialog>
#include <QMainWindow>
#include <QMenuBar>
#include <QPointer>
#include <QQuickWindow>
#include <QSocketNotifier>

#include <algorithm>
#include <deque>
#include <dlfcn.h>
#include <iostream>
#include <memory>
#include <unistd.h>
#include <utility>
#include <vector>

namespace {

/// Joins commands and events to whoever provides and hears them. Called on any thread.
class VDispatcher : public IControlSystem
{
public:
    void AddCommandProvider(std::shared_ptr<ControlSystem::ICommandProvider> provider) override
    {
        const KVR::VMutexLock lock(mutex);
        commandProviders.push_back(std::move(provider));
    }

    void RemoveCommandProvider(std::shared_ptr<ControlSystem::ICommandProvider> provider) override
    {
        const KVR::VMutexLock lock(mutex);
        const auto end = commandProviders.end();
        commandProviders.erase(std::remove(commandProviders.begin(), end, provider), end);
    }

    std::vector<std::wstring> GetCommandList(int /*reserved*/) override
    {
        std::vector<std::wstring> names;
        for (const auto& provider : CommandProviders()) {
            provider->GetCommandNames(names);
        }
        return names;
    }

    ControlSystem::ICommandInformation GetCommandInformation(const std::wstring& name) override
    {
        const auto provider = FindCommandProvider(name);
        return provider ? provider->GetCommandInformation(name)
                        : ControlSystem::ICommandInformation();
    }

    // One of the two functions has to be called, on any thread, now or later.
    void ExecuteCommand(const std::wstring& name, const ControlSystem::IParameters& input,
                        boost::function<void(const ControlSystem::IParameters&)> success,
                        boost::function<void(ControlSystem::IResult)> failure) override
    {
        ControlSystem::IResult result;
        result.Code = 2; // unknown
        ControlSystem::IParameters reply;
        if (const auto provider = FindCommandProvider(name)) {
            result = provider->ExecuteCommand(name, input, reply);
        }
        if (result.Code == 1) {
            success(reply);
        } else {
            failure(result);
        }
    }

    void AddEventProvider(std::shared_ptr<ControlSystem::IEventProvider> provider) override
    {
        const KVR::VMutexLock lock(mutex);
        eventProviders.push_back(std::move(provider));
    }

    void RemoveEventProvider(std::shared_ptr<ControlSystem::IEventProvider> provider) override
    {
        const KVR::VMutexLock lock(mutex);
        const auto end = eventProviders.end();
        eventProviders.erase(std::remove(eventProviders.begin(), end, provider), end);
    }

    std::vector<std::wstring> GetEventList(int /*reserved*/) override
    {
        std::vector<std::wstring> names;
        for (const auto& provider : EventProviders()) {
            provider->GetEventNames(names);
        }
        return names;
    }

    ControlSystem::IEventInformation GetEventInformation(const std::wstring& name) override
    {
        for (const auto& provider : EventProviders()) {
            std::vector<std::wstring> names;
            provider->GetEventNames(names);
            if (std::find(names.begin(), names.end(), name) != names.end()) {
                return provider->GetEventInformation();
            }
        }
        return ControlSystem::IEventInformation();
    }

    EventNotification& GetEventNotification() override { return eventNotification; }

    ControlSystem::IResult FireEvent(const std::wstring& name,
                                     const ControlSystem::IParameters& parameters) override
    {
        eventNotification(name, parameters);
        ControlSystem::IResult result;
        result.Code = 1;
        return result;
    }

private:
    using CommandProviderList = std::vector<std::shared_ptr<ControlSystem::ICommandProvider>>;
    using EventProviderList = std::vector<std::shared_ptr<ControlSystem::IEventProvider>>;

    // Copies, since a provider is called with no lock held.
    CommandProviderList CommandProviders()
    {
        const KVR::VMutexLock lock(mutex);
        return commandProviders;
    }

    EventProviderList EventProviders()
    {
        const KVR::VMutexLock lock(mutex);
        return eventProviders;
    }

    std::shared_ptr<ControlSystem::ICommandProvider> FindCommandProvider(const std::wstring& name)
    {
        for (const auto& provider : CommandProviders()) {
            std::vector<std::wstring> names;
            provider->GetCommandNames(names);
            if (std::find(names.begin(), names.end(), name) != names.end()) {
                return provider;
            }
        }
        return nullptr;
    }

    KVR::VMutex mutex;
    CommandProviderList commandProviders KVR_GUARDED_BY(mutex);
    EventProviderList eventProviders KVR_GUARDED_BY(mutex);
    NotificationSystem::VMultiCallbackPostal<void(const std::wstring&,
                                                  const ControlSystem::IParameters&)>
        eventNotification;
};

/// Delivers what any thread posts on the GUI thread: in order, and never inside another delivery,
/// also where one spins an event loop of its own as an open dialog does.
class VPostalService : public QObject, public KVR::IPostalService
{
public:
    void Post(boost::function<void()> function, std::uintptr_t /*token*/) override
    {
        const KVR::VMutexLock lock(mutex);
        waiting.push_back(std::move(function));
        QMetaObject::invokeMethod(
            this, [this] { Deliver(); }, Qt::QueuedConnection);
    }

private:
    void Deliver()
    {
        if (delivering) {
            return; // the delivery outside goes on with the queue
        }
        delivering = true;
        boost::function<void()> function;
        while (TakeFirst(function)) {
            try {
                KVR::GuardedCall(function); // its target may have gone
            } catch (const std::exception& exception) {
                KVR_LOG("SmallestHost", 2, "A posted function failed: %1%", exception.what());
            }
        }
        delivering = false;
    }

    bool TakeFirst(boost::function<void()>& function)
    {
        const KVR::VMutexLock lock(mutex);
        if (waiting.empty()) {
            return false;
        }
        function = std::move(waiting.front());
        waiting.pop_front();
        return true;
    }

    KVR::VMutex mutex;
    std::deque<boost::function<void()>> waiting KVR_GUARDED_BY(mutex);
    bool delivering = false;
};

/// The services that the plug-in works with. This host has no cameras, so their sources are empty.
class VHost : public QuorixPluginInterface::IHost
{
public:
    std::shared_ptr<IDataStore> GetStore() override { return store; }
    std::shared_ptr<ICameraSettingsSource> GetCameraSettingsSource() override { return nullptr; }
    std::shared_ptr<KVR::IPostalService> GetPostalService() override { return postalService; }
    std::shared_ptr<ICameraSelectionSource> GetCameraSelectionSource() override { return nullptr; }
    std::shared_ptr<IControlSystem> GetControlSystem() override { return dispatcher; }

private:
    const std::shared_ptr<VDataStore> store = std::make_shared<VDataStore>();
    const std::shared_ptr<VPostalService> postalService = std::make_shared<VPostalService>();
    const std::shared_ptr<VDispatcher> dispatcher = std::make_shared<VDispatcher>();
};

class VMenus : public IMenuService
{
public:
    explicit VMenus(QMainWindow& window) : window(window) {}

    void AddAction(const std::vector<std::string>& path, boost::function<void()> function,
                   const std::vector<std::string>& /*shortcuts*/) override
    {
        QMenu* const menu = window.menuBar()->addMenu(QString::fromStdString(path.front()));
        QAction* const action = menu->addAction(QString::fromStdString(path.back()));
        QObject::connect(action, &QAction::triggered, action, [function] { function(); });
    }

private:
    QMainWindow& window;
};

class VPanels : public IPanelService
{
public:
    // A greater host would offer the registered panels to its user; the menu item is enough here.
    void RegisterPanel(const std::string& /*name*/,
                       boost::function<QWidget*()> /*factory*/) override
    {
    }

    void ShowPanel(const std::string& /*name*/, QWidget* widget) override
    {
        panels.emplace_back(widget);
        widget->show();
    }

    /// A panel holds the plug-in's objects, so it goes before the plug-in does.
    void CloseAll()
    {
        for (const QPointer<QWidget>& panel : panels) {
            delete panel;
        }
    }

private:
    std::vector<QPointer<QWidget>> panels; // null where it has been closed
};

class VGui : public IQuorixGUI
{
public:
    explicit VGui(QMainWindow& window) : menus(std::make_shared<VMenus>(window)) {}

    std::shared_ptr<VQuickWidgetManager> GetQuickContext() override { return quickContext; }
    std::shared_ptr<IMenuService> GetMenuService() override { return menus; }
    std::shared_ptr<IPanelService> GetPanelService() override { return Panels; }

    const std::shared_ptr<VPanels> Panels = std::make_shared<VPanels>();

private:
    const std::shared_ptr<VQuickWidgetManager> quickContext =
        std::make_shared<VQuickWidgetManager>(QString(), false);
    const std::shared_ptr<VMenus> menus;
};

/// The plug-in's two functions. Its library is never unloaded: threads that it made may outlive it.
class VPlugin
{
public:
    explicit VPlugin(const char* path)
    {
        void* const library = dlopen(path, RTLD_NOW | RTLD_LOCAL);
        if (library == nullptr) {
            throw std::runtime_error(dlerror());
        }
        const auto create =
            reinterpret_cast<QuorixPluginInterface::IPlugin* (*)()>(dlsym(library, "CreatePlugin"));
        destroy = reinterpret_cast<void (*)(QuorixPluginInterface::IPlugin*)>(
            dlsym(library, "DestroyPlugin"));
        if (create == nullptr || destroy == nullptr) {
            throw std::runtime_error("this library is no plug-in");
        }
        object = create();
        if (object->GetInterfaceVersion() != QuorixPluginInterface::IPlugin::interfaceVersion) {
            throw std::runtime_error("the plug-in has another interface");
        }
    }
    ~VPlugin() { destroy(object); }

    VPlugin(const VPlugin&) = delete;
    VPlugin& operator=(const VPlugin&) = delete;

    QuorixPluginInterface::IPlugin* operator->() const { return object; }

private:
    QuorixPluginInterface::IPlugin* object = nullptr;
    void (*destroy)(QuorixPluginInterface::IPlugin*) = nullptr;
};

/// Ends a question that is still open, so that the step which waits for its answer goes on.
void EndOpenDialogs()
{
    for (QWidget* const widget : QApplication::topLevelWidgets()) {
        auto* const dialog = qobject_cast<QDialog*>(widget);
        if (dialog != nullptr && dialog->isVisible()) {
            dialog->done(0);
        }
    }
}

int Run(const char* pluginPath)
{
    QuorixHost::InitialiseQmlModules(); // Korva.Theme and QuorixQML
    VHost host;
    QMainWindow window;
    VGui gui(window);

    VPlugin plugin(pluginPath);
    plugin->Start(host);
    plugin->InitialiseGUI(host, gui);
    // A host with cameras reports each of them here: the plug-in learns of no others.

    QSocketNotifier input(STDIN_FILENO, QSocketNotifier::Read);
    const auto stop = [] {
        EndOpenDialogs();
        QApplication::quit();
    };
    QObject::connect(&input, &QSocketNotifier::activated, &input, stop);
    QObject::connect(qApp, &QApplication::lastWindowClosed, &input, stop);
    window.show();
    std::cout << "ready" << std::endl;
    QApplication::exec();

    input.setEnabled(false);
    gui.Panels->CloseAll();
    plugin->Stop();
    return 0; // the plug-in goes first of all, then what it was given
}

} // namespace

int main(int argumentCount, char** arguments)
{
    QApplication application(argumentCount, arguments);
    QApplication::setApplicationName("SmallestHost"); // devices see it as the server's name
    QApplication::setQuitOnLastWindowClosed(false);
    if (QGuiApplication::platformName() == "offscreen") {
        QQuickWindow::setSceneGraphBackend(QSGRendererInterface::Software);
    }
    if (argumentCount != 2) {
        std::cerr << "usage: smallest-host PLUGIN\n";
        return 2;
    }
    try {
        return Run(arguments[1]);
    } catch (const std::exception& exception) {
        std::cerr << "smallest-host: " << exception.what() << '\n';
        return 1;
    }
}
