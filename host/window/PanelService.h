#pragma once

#include "QuorixPluginInterface/IPanelService.h"

#include <QPointer>

#include <map>
#include <string>
#include <vector>

namespace QuorixHost {

/// Shows panels as windows above the host's own. Threads: [gui].
class VPanelService : public IPanelService
{
public:
    /// @param owner  the window above which panels come up
    explicit VPanelService(QWidget* owner);
    ~VPanelService() override;

    void RegisterPanel(const std::string& name, boost::function<QWidget*()> factory) override;

    /// Null is ignored: there is nothing to show any more.
    void ShowPanel(const std::string& name, QWidget* widget) override;

    /// Makes a registered panel and shows it. @return false where there is none, or none any more
    bool OpenPanel(const std::string& name);

    /// Destroys the panels that are still open.
    void CloseAll();

private:
    const QPointer<QWidget> owner;
    std::map<std::string, boost::function<QWidget*()>> factories;
    std::vector<QPointer<QWidget>> open; // some of them perhaps closed since
};

} // namespace QuorixHost
