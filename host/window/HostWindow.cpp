#include "window/HostWindow.h"

#include "QtQuickView/QuickWidgetManager.h"
#include "qml/QmlModules.h"
#include "window/MainWindow.h"
#include "window/MenuService.h"
#include "window/PanelService.h"
#include "window/Question.h"
#include "window/WindowConsole.h"

#include <QMenuBar>

namespace QuorixHost {
namespace {

std::shared_ptr<VQuickWidgetManager> MakeQuickContext()
{
    InitialiseQmlModules();
    const QString folder = qEnvironmentVariable(VHostWindow::qmlFolderVariable);
    return std::make_shared<VQuickWidgetManager>(folder, !folder.isEmpty());
}

} // namespace

VHostWindow::VHostWindow(VHost& host, const boost::function<void()>& requestStop)
    : quickContext(MakeQuickContext()), window(std::make_unique<VMainWindow>(host, requestStop))
{
    menuService = std::make_shared<VMenuService>(window->menuBar());
    panelService = std::make_shared<VPanelService>(window.get());
    QObject::connect(window.get(), &VMainWindow::ReloadRequested, quickContext.get(),
                     &VQuickWidgetManager::OnReloadQML);
}

VHostWindow::~VHostWindow() = default;

void VHostWindow::Show()
{
    window->show();
}

void VHostWindow::AddToConsole(VConsole& console)
{
    AddWindowCommands(console);
}

void VHostWindow::EndDialogs()
{
    EndOpenDialogs();
}

void VHostWindow::ClosePanels()
{
    panelService->CloseAll();
}

std::shared_ptr<VQuickWidgetManager> VHostWindow::GetQuickContext()
{
    return quickContext;
}

std::shared_ptr<IMenuService> VHostWindow::GetMenuService()
{
    return menuService;
}

std::shared_ptr<IPanelService> VHostWindow::GetPanelService()
{
    return panelService;
}

std::unique_ptr<IHostWindow> MakeHostWindow(VHost& host, const boost::function<void()>& requestStop)
{
    return std::make_unique<VHostWindow>(host, requestStop);
}

} // namespace QuorixHost
