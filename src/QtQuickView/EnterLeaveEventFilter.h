#pragma once

#include "QtQuickView/IQuickWidgetEventFilter.h"

#include <QPointF>
#include <QPointer>
#include <QQuickItem>

class QQuickWidget;

/// Gives the items of a view the hover events of a pointer that comes from outside or goes there:
/// the view sees those as a widget's Enter and Leave, of which its items learn nothing.
///
/// Threads: [gui]. Consumes no event.
class VEnterLeaveEventFilter : public IQuickWidgetEventFilter
{
public:
    bool Filter(QObject* object, QEvent* event) override;

private:
    void OnEnter(QQuickWidget& widget, QEvent& event);
    void OnLeave(QQuickWidget& widget);
    void EnterItems(QQuickItem& item, const QPointF& position);
    void EnterItem(QQuickItem& item, const QPointF& position);

    // Deliberate: only the item that was entered last, though every item below the pointer is
    // entered. The others hear of the pointer's leaving from the scene itself or not at all.
    QPointer<QQuickItem> hoveredItem;
};
