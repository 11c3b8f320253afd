#pragma once

#include "QtQuickView/IQuickWidgetEventFilter.h"

#include <QMetaMethod>

#include <unordered_map>

class QKeyEvent;
class QQuickItem;
struct QMetaObject;

/// Keeps a key from the shortcuts of the window around a view if the item that has the focus
/// handles that very key in QML through `Keys`.
///
/// Threads: [gui]. Failure: a key whose signal was not found is simply never kept back.
class VShortcutOverrideEventFilter : public IQuickWidgetEventFilter
{
public:
    /// Learns the signals of `Keys` from the first item that uses them.
    void OnItemAdded(QObject* item) override;

    /// @return true, with the event accepted, if the key is to reach the QML as a key press
    bool Filter(QObject* object, QEvent* event) override;

protected:
    /// Finds the signal of each key in `keysMetaObject`, which must be that of QQuickKeysAttached.
    void BuildLookup(const QMetaObject& keysMetaObject);

private:
    bool HandlesKey(QQuickItem& item, const QMetaMethod& signal, int key) const;

    // The class is private to Qt: only a live instance gives its meta-object.
    const QMetaObject* KeysMetaObject = nullptr;
    std::unordered_map<int, QMetaMethod> lookup;
};
