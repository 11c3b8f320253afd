#pragma once

#include <memory>

class IMenuService;
class IPanelService;
class VQuickWidgetManager;

/// The services of a host that has windows. Threads: the GUI thread.
class IQuorixGUI
{
public:
    virtual ~IQuorixGUI() = default;

    /// Returns what all Quick dialogs of the process share.
    virtual std::shared_ptr<VQuickWidgetManager> GetQuickContext() = 0;
    virtual std::shared_ptr<IMenuService> GetMenuService() = 0;
    virtual std::shared_ptr<IPanelService> GetPanelService() = 0;
};
