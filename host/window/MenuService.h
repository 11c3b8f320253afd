#pragma once

#include "QuorixPluginInterface/IMenuService.h"

#include <QPointer>

class QMenu;
class QMenuBar;
class QWidget;

namespace QuorixHost {

/// Adds to a window's menu bar. Once the window has gone it does nothing. Threads: [gui].
/// Failure: what an item's function throws is logged.
class VMenuService : public IMenuService
{
public:
    explicit VMenuService(QMenuBar* menuBar);

    void AddAction(const std::vector<std::string>& path, boost::function<void()> function,
                   const std::vector<std::string>& shortcuts) override;

private:
    QMenu* FindOrAddMenu(const std::vector<std::string>& path);

    const QPointer<QMenuBar> menuBar;
};

} // namespace QuorixHost
