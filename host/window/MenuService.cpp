#include "window/MenuService.h"

#include "utils/LogStatement.h"

#include <QAction>
#include <QMenu>
#include <QMenuBar>

#include <exception>
#include <utility>

namespace QuorixHost {
namespace {

/// Calls a function of the plug-in. No exception may pass through the event loop above.
void CallGuarded(const boost::function<void()>& function)
{
    try {
        function();
    } catch (const std::exception& exception) {
        KVR_LOG("Host", 2, "A menu item failed: %1%", exception.what());
    } catch (...) {
        KVR_LOG("Host", 2, "A menu item failed with an unknown exception");
    }
}

/// Returns the menu of that title below a menu bar or another menu, made where there is none.
template <typename TParent>
QMenu* FindOrAdd(TParent& parent, const QString& title)
{
    for (QAction* const action : parent.actions()) {
        if (action->menu() != nullptr && action->menu()->title() == title) {
            return action->menu();
        }
    }
    return parent.addMenu(title);
}

/// Returns a text as menus show it: an "&" of theirs marks a key.
QString MenuText(const std::string& text)
{
    return QString::fromStdString(text).replace("&", "&&");
}

} // namespace

VMenuService::VMenuService(QMenuBar* menuBar) : menuBar(menuBar) {}

void VMenuService::AddAction(const std::vector<std::string>& path, boost::function<void()> function,
                             const std::vector<std::string>& shortcuts)
{
    if (menuBar == nullptr || path.size() < 2) {
        KVR_LOG("Host", 2, "A menu item needs a window, a menu and a text");
        return;
    }
    QAction* const action = FindOrAddMenu(path)->addAction(MenuText(path.back()));
    QList<QKeySequence> sequences;
    for (const std::string& shortcut : shortcuts) {
        sequences.append(QKeySequence(QString::fromStdString(shortcut)));
    }
    action->setShortcuts(sequences);
    QObject::connect(action, &QAction::triggered, action,
                     [called = std::move(function)] { CallGuarded(called); });
}

QMenu* VMenuService::FindOrAddMenu(const std::vector<std::string>& path)
{
    QMenu* menu = FindOrAdd(*menuBar, MenuText(path.front()));
    for (std::size_t i = 1; i + 1 < path.size(); ++i) {
        menu = FindOrAdd(*menu, MenuText(path[i]));
    }
    return menu;
}

} // namespace QuorixHost
