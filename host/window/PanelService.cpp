#include "window/PanelService.h"

#include <QWidget>

#include <algorithm>
#include <utility>

namespace QuorixHost {

VPanelService::VPanelService(QWidget* owner) : owner(owner) {}

VPanelService::~VPanelService()
{
    CloseAll();
}

void VPanelService::RegisterPanel(const std::string& name, boost::function<QWidget*()> factory)
{
    factories[name] = std::move(factory);
}

void VPanelService::ShowPanel(const std::string& name, QWidget* widget)
{
    if (widget == nullptr) {
        return;
    }
    open.erase(std::remove(open.begin(), open.end(), nullptr), open.end());
    open.emplace_back(widget);

    widget->setObjectName(QString::fromStdString(name));
    widget->setAttribute(Qt::WA_DeleteOnClose);
    widget->show();
    if (owner != nullptr) {
        const QPoint centre = owner->mapToGlobal(owner->rect().center());
        widget->move(centre - widget->rect().center());
    }
    widget->raise();
    widget->activateWindow();
}

bool VPanelService::OpenPanel(const std::string& name)
{
    const auto found = factories.find(name);
    QWidget* const widget = found != factories.end() ? found->second() : nullptr;
    ShowPanel(name, widget);
    return widget != nullptr;
}

void VPanelService::CloseAll()
{
    for (const QPointer<QWidget>& widget : std::exchange(open, {})) {
        delete widget;
    }
}

} // namespace QuorixHost
