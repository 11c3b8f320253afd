#pragma once

#include "QtQuickView/IQuickWidgetEventFilter.h"

#include <QObject>

#include <memory>
#include <vector>

class QChildEvent;
class QQuickWidget;

/// The event filter of every item of every view, also of those that QML makes later. It passes each
/// event through its small filters, in their order, until one consumes it.
///
/// Owns: the filters, for its own life. Threads: [gui]. Failure: nothing is thrown; what goes wrong
/// is logged and the event goes on.
class VQuickWidgetEventFilterDispatcher : public QObject
{
    Q_OBJECT

public:
    explicit VQuickWidgetEventFilterDispatcher(QObject* parent = nullptr);
    ~VQuickWidgetEventFilterDispatcher() override;

    /// Puts the filters on a view that has a root item, and on all that is in it; may be repeated.
    /// A view without one is left alone.
    void Install(QQuickWidget& widget);

    bool eventFilter(QObject* object, QEvent* event) override;

protected:
    std::vector<std::unique_ptr<IQuickWidgetEventFilter>> filters;

private:
    void InstallTree(QObject& object);
    bool OnChildEvent(const QChildEvent& event);
};
