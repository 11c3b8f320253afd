#include "QtQuickView/EnterLeaveEventFilter.h"

#include "utils/LogStatement.h"

#include <QCoreApplication>
#include <QCursor>
#include <QEnterEvent>
#include <QGuiApplication>
#include <QHoverEvent>
#include <QQuickWidget>

#include <vector>

namespace {

void SendHover(QQuickItem& item, QEvent::Type type, const QPointF& position)
{
    QHoverEvent hover(type, position, position, QGuiApplication::keyboardModifiers());
    QCoreApplication::sendEvent(&item, &hover);
}

} // namespace

bool VEnterLeaveEventFilter::Filter(QObject* object, QEvent* event)
{
    const QEvent::Type type = event->type();
    if (type != QEvent::Enter && type != QEvent::Leave) {
        return false;
    }
    if (type == QEvent::Enter) {
        KVR_LOG("Qt Korva", 6, "Enter event for item '%1%'.", object->objectName().toStdString());
    } else {
        KVR_LOG("Qt Korva", 6, "Leave event for item '%1%'.", object->objectName().toStdString());
    }

    auto* widget = qobject_cast<QQuickWidget*>(object);
    if (widget == nullptr || widget->rootObject() == nullptr) {
        return false;
    }
    if (type == QEvent::Enter) {
        OnEnter(*widget, *event);
    } else {
        OnLeave(*widget);
    }
    return false;
}

void VEnterLeaveEventFilter::OnEnter(QQuickWidget& widget, QEvent& event)
{
    if (const auto* enter = dynamic_cast<QEnterEvent*>(&event)) {
        EnterItems(*widget.rootObject(), enter->localPos());
    }
}

void VEnterLeaveEventFilter::OnLeave(QQuickWidget& widget)
{
    // Of all the items that the pointer may have been over, one is known to be told of its leaving.
    // Nothing else depends on where the pointer is by now, so the tree needs no walk to find it.
    QQuickItem* item = hoveredItem;
    hoveredItem.clear();
    if (item != nullptr) {
        const QPointF position = widget.mapFromGlobal(QCursor::pos());
        SendHover(*item, QEvent::HoverLeave, item->mapFromItem(nullptr, position));
    }
}

/// Enters the item, if the pointer is over it, and then its children in any case, since a child may
/// lie outside its parent. A handler may destroy any of them meanwhile.
void VEnterLeaveEventFilter::EnterItems(QQuickItem& item, const QPointF& position)
{
    const QPointer<QQuickItem> alive(&item);
    EnterItem(item, position);
    if (!alive) {
        return;
    }
    std::vector<QPointer<QQuickItem>> children;
    for (QQuickItem* child : item.childItems()) {
        children.emplace_back(child);
    }
    for (const QPointer<QQuickItem>& child : children) {
        if (child) {
            EnterItems(*child, position);
        }
    }
}

void VEnterLeaveEventFilter::EnterItem(QQuickItem& item, const QPointF& position)
{
    if (!item.acceptHoverEvents()) {
        return;
    }
    const QPointF itemPosition = item.mapFromItem(nullptr, position);
    if (item.contains(itemPosition)) {
        hoveredItem = &item;
        SendHover(item, QEvent::HoverEnter, itemPosition);
    }
}
