#include "QuorixPluginControlStreamServer/Authorization/ControlPanel.h"

#include "QtQuickView/QuickWidgetManager.h"
#include "QuorixPluginControlStreamServer/Authorization/QuorixControlAuthorization.h"
#include "QuorixPluginControlStreamServer/Authorization/QuorixControlManagementDialog.h"
#include "QuorixPluginInterface/IMenuService.h"
#include "QuorixPluginInterface/IPanelService.h"
#include "QuorixPluginInterface/IQuorixGUI.h"

#include <boost/bind/bind.hpp>

namespace {

constexpr char panelName[] = "Manage Control Authorizations";
constexpr char menuName[] = "Settings";
constexpr char menuItem[] = "Manage Control Authorizations...";

/// Makes the dialog for the devices that are known now, null where there is nothing to show it in
/// or nothing to show.
QWidget* MakeDialog(const std::shared_ptr<VQuickWidgetManager>& quickContext,
                    const std::weak_ptr<VQuorixControlAuthorization>& known)
{
    const std::shared_ptr<VQuorixControlAuthorization> authorization = known.lock();
    if (!quickContext || !authorization) {
        return nullptr;
    }
    return new VQuorixControlManagementDialog(quickContext, authorization);
}

void ShowDialog(const std::weak_ptr<IPanelService>& known,
                const boost::function<QWidget*()>& makeDialog)
{
    const std::shared_ptr<IPanelService> panelService = known.lock();
    if (!panelService) {
        return;
    }
    if (QWidget* const dialog = makeDialog()) {
        panelService->ShowPanel(panelName, dialog);
    }
}

} // namespace

void AddControlPanel(IQuorixGUI& gui,
                     const std::shared_ptr<VQuorixControlAuthorization>& authorization)
{
    const boost::function<QWidget*()> makeDialog =
        boost::bind(&MakeDialog, gui.GetQuickContext(),
                    std::weak_ptr<VQuorixControlAuthorization>(authorization));

    const std::shared_ptr<IPanelService> panelService = gui.GetPanelService();
    if (panelService) {
        panelService->RegisterPanel(panelName, makeDialog);
    }
    if (const std::shared_ptr<IMenuService> menuService = gui.GetMenuService()) {
        menuService->AddAction(
            {menuName, menuItem},
            boost::function<void()>(
                boost::bind(&ShowDialog, std::weak_ptr<IPanelService>(panelService), makeDialog)),
            {});
    }
}
