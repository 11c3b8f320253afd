#pragma once

#include "IHostWindow.h"
#include "QuorixPluginInterface/IQuorixGUI.h"

#include <memory>

class VQuickWidgetManager;

namespace QuorixHost {

class VMainWindow;
class VMenuService;
class VPanelService;

/// The host's window together with the services of it that the plug-in is given.
///
/// Owns: all of them. Threads: [gui]. Failure: none of its own.
class VHostWindow : public IHostWindow, public IQuorixGUI
{
public:
    /// The environment variable that names a folder of QML files. The views then load from there
    /// what they find, and load again at the developer's command.
    static constexpr char qmlFolderVariable[] = "QUORIX_QML_FOLDER";

    /// @param host         outlives this object
    /// @param requestStop  called when the operator wants the host to stop
    VHostWindow(VHost& host, const boost::function<void()>& requestStop);
    ~VHostWindow() override;

    IQuorixGUI& GUI() override { return *this; }
    void Show() override;
    void AddToConsole(VConsole& console) override;
    void EndDialogs() override;
    void ClosePanels() override;

    std::shared_ptr<VQuickWidgetManager> GetQuickContext() override;
    std::shared_ptr<IMenuService> GetMenuService() override;
    std::shared_ptr<IPanelService> GetPanelService() override;

    VMainWindow& Window() { return *window; }

private:
    // Released in reverse: the window, whose menu items are functions of the plug-in, goes first.
    const std::shared_ptr<VQuickWidgetManager> quickContext;
    std::shared_ptr<VMenuService> menuService;
    std::shared_ptr<VPanelService> panelService;
    const std::unique_ptr<VMainWindow> window;
};

/// As VMakeHostWindow tells.
std::unique_ptr<IHostWindow> MakeHostWindow(VHost& host,
                                            const boost::function<void()>& requestStop);

} // namespace QuorixHost
