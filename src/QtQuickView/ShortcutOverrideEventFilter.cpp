#include "QtQuickView/ShortcutOverrideEventFilter.h"

#include "QtQuickView/QmlKeysSignals.h"
#include "utils/LogStatement.h"

#include <QKeyEvent>
#include <QMetaEnum>
#include <QQuickItem>

#include <cstring>
#include <string>

namespace {

constexpr char keysClassName[] = "QQuickKeysAttached";

/// Makes the protected query of QObject callable for any object.
struct VSignalAccess : QObject
{
    static bool IsConnected(const QObject& object, const QMetaMethod& signal)
    {
        bool (QObject::*query)(const QMetaMethod&) const = &VSignalAccess::isSignalConnected;
        return (object.*query)(signal);
    }
};

std::string KeyName(int key)
{
    const char* name = QMetaEnum::fromType<Qt::Key>().valueToKey(key);
    return name != nullptr ? name : "unknown";
}

template <typename Predicate>
QObject* FindChild(const QObject& parent, Predicate predicate)
{
    for (QObject* child : parent.children()) {
        if (predicate(*child->metaObject())) {
            return child;
        }
    }
    return nullptr;
}

} // namespace

void VShortcutOverrideEventFilter::OnItemAdded(QObject* item)
{
    if (KeysMetaObject != nullptr) {
        return;
    }
    const QObject* keys = FindChild(*item, [](const QMetaObject& metaObject) {
        return std::strcmp(metaObject.className(), keysClassName) == 0;
    });
    if (keys != nullptr) {
        KeysMetaObject = keys->metaObject();
        BuildLookup(*KeysMetaObject);
    }
}

void VShortcutOverrideEventFilter::BuildLookup(const QMetaObject& keysMetaObject)
{
    if (std::strcmp(keysMetaObject.className(), keysClassName) != 0) {
        KVR_LOG("Qt Korva", 2,
                "Failed building Qml Keys signal lookup map, expected QMetaObject for type "
                "'QQuickKeysAttached' got '%1%'.",
                keysMetaObject.className());
        return;
    }
    for (const auto& [key, signature] : QmlKeysSignalMetaMethodLookup) {
        const QByteArray normalised = QMetaObject::normalizedSignature(signature);
        const int index = keysMetaObject.indexOfSignal(normalised);
        if (index < 0) {
            KVR_LOG("Qt Korva", 2,
                    "Failed building Qml Keys signal lookup map, could not find QMetaMethod for "
                    "signal '%1%'.",
                    signature);
            continue;
        }
        KVR_LOG("Qt Korva", 6,
                "Adding QMetaMethod for signal '%1%' to QmlKeysSignalMetaMethodLookup.", signature);
        lookup[key] = keysMetaObject.method(index);
    }
}

bool VShortcutOverrideEventFilter::Filter(QObject* object, QEvent* event)
{
    if (event->type() != QEvent::ShortcutOverride) {
        return false;
    }
    const auto* keyEvent = dynamic_cast<QKeyEvent*>(event);
    if (keyEvent == nullptr) {
        KVR_LOG("Qt Korva", 2, "VShortcutOverrideEventFilter::eventFilter dynamic_cast failed.");
        return false;
    }
    if (KeysMetaObject == nullptr) {
        return false;
    }
    const auto found = lookup.find(keyEvent->key());
    if (found == lookup.end()) {
        return false;
    }
    auto* item = qobject_cast<QQuickItem*>(object);
    if (item == nullptr) {
        KVR_LOG("Qt Korva", 6,
                "Skipping ShortcutOverride event filtering for non QQuickItem '%1%'.",
                object->objectName().toStdString());
        return false;
    }
    if (!HandlesKey(*item, found->second, keyEvent->key())) {
        return false;
    }
    // Qt looks at the acceptance and not at the result: without it the shortcut would still fire.
    event->accept();
    return true;
}

bool VShortcutOverrideEventFilter::HandlesKey(QQuickItem& item, const QMetaMethod& signal,
                                              int key) const
{
    const QObject* keys = FindChild(
        item, [this](const QMetaObject& metaObject) { return &metaObject == KeysMetaObject; });
    if (keys == nullptr) {
        KVR_LOG("Qt Korva", 6, "Could not find QQuickKeysAttached child for item '%1%'.",
                item.objectName().toStdString());
        return false;
    }
    if (!VSignalAccess::IsConnected(*keys, signal)) {
        KVR_LOG("Qt Korva", 6, "No signal connection for item '%1%', key '%2%'.",
                item.objectName().toStdString(), KeyName(key));
        return false;
    }
    KVR_LOG("Qt Korva", 6, "Intercepting ShortcutOverride event for item '%1%', key '%2%'.",
            item.objectName().toStdString(), KeyName(key));
    return true;
}
