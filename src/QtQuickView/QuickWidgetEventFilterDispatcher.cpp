#include "QtQuickView/QuickWidgetEventFilterDispatcher.h"

#include "QtQuickView/EnterLeaveEventFilter.h"
#include "QtQuickView/ShortcutOverrideEventFilter.h"
#include "utils/LogStatement.h"

#include <QChildEvent>
#include <QQuickItem>
#include <QQuickWidget>

namespace {

bool IsChildEvent(const QEvent& event)
{
    return event.type() == QEvent::ChildAdded || event.type() == QEvent::ChildPolished ||
           event.type() == QEvent::ChildRemoved;
}

} // namespace

VQuickWidgetEventFilterDispatcher::VQuickWidgetEventFilterDispatcher(QObject* parent)
    : QObject(parent)
{
    filters.push_back(std::make_unique<VEnterLeaveEventFilter>());
    filters.push_back(std::make_unique<VShortcutOverrideEventFilter>());
}

VQuickWidgetEventFilterDispatcher::~VQuickWidgetEventFilterDispatcher() = default;

void VQuickWidgetEventFilterDispatcher::Install(QQuickWidget& widget)
{
    QQuickItem* root = widget.rootObject();
    if (root == nullptr) {
        return;
    }
    KVR_LOG("Qt Korva", 6,
            "Installing event filter for root QQuickItem '%1%' of VQuickWidget '%2%'.",
            root->objectName().toStdString(), widget.objectName().toStdString());
    InstallTree(*root);
    // A pointer that enters or leaves the view is an event of the widget, which no item ever sees.
    widget.installEventFilter(this);
}

void VQuickWidgetEventFilterDispatcher::InstallTree(QObject& object)
{
    for (const std::unique_ptr<IQuickWidgetEventFilter>& filter : filters) {
        filter->OnItemAdded(&object);
    }
    object.installEventFilter(this);
    for (QObject* child : object.children()) {
        InstallTree(*child);
    }
}

bool VQuickWidgetEventFilterDispatcher::eventFilter(QObject* object, QEvent* event)
{
    // The children of the widget itself are components and the like, and no items of its view.
    if (IsChildEvent(*event) && qobject_cast<QQuickWidget*>(object) == nullptr) {
        if (const auto* childEvent = dynamic_cast<QChildEvent*>(event)) {
            return OnChildEvent(*childEvent);
        }
        KVR_LOG("Qt Korva", 2,
                "VQuickWidgetEventFilterDispatcher::eventFilter dynamic_cast failed.");
    }
    for (const std::unique_ptr<IQuickWidgetEventFilter>& filter : filters) {
        if (filter->Filter(object, event)) {
            return true;
        }
    }
    return QObject::eventFilter(object, event);
}

bool VQuickWidgetEventFilterDispatcher::OnChildEvent(const QChildEvent& event)
{
    if (event.type() == QEvent::ChildAdded) {
        QObject* child = event.child();
        KVR_LOG("Qt Korva", 6, "Installing event filter for child item '%1%'.",
                child->objectName().toStdString());
        InstallTree(*child);
    }
    return false;
}
