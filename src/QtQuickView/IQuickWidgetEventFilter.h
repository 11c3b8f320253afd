#pragma once

class QEvent;
class QObject;

/// One of the small filters through which the dispatcher passes every event of a view's items.
/// Threads: [gui]. Failure: a filter never throws.
class IQuickWidgetEventFilter
{
public:
    virtual ~IQuickWidgetEventFilter() = default;

    /// Tells that events of `item`, whose children may still be to come, will pass from now on.
    virtual void OnItemAdded(QObject* /*item*/) {}

    /// Looks at an event before `object` gets it. @return true if the event is consumed
    virtual bool Filter(QObject* object, QEvent* event) = 0;
};
