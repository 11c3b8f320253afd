#include "QtQuickView/QuickWidgetManager.h"

#include "QtQuickView/QuickWidget.h"
#include "QtQuickView/QuickWidgetEventFilterDispatcher.h"

#include <QQmlEngine>

VQuickWidgetManager::VQuickWidgetManager(const QString& sourceFolder, bool reloadEnabled)
    : sourceFolder(sourceFolder),
      ReloadEnabled(reloadEnabled),
      engine(new QQmlEngine(this)),
      dispatcher(new VQuickWidgetEventFilterDispatcher(this))
{
    // The engine looks first where it was told last: a module on disk wins, as a file there does.
    engine->addImportPath(QStringLiteral("qrc:/"));
    if (ReloadEnabled) {
        engine->addImportPath(sourceFolder);
        // Qt keeps QML compiled on disk and knows a changed file by its time alone: a second edit
        // within that time's few milliseconds, or a file copied with its old time, would be missed.
        qputenv("QML_DISABLE_DISK_CACHE", "1");
    }
}

VQuickWidgetManager::~VQuickWidgetManager() = default;

void VQuickWidgetManager::Register(VQuickWidget& widget)
{
    if (ReloadEnabled) {
        connect(this, &VQuickWidgetManager::OnReloadQML, &widget, &VQuickWidget::ReloadQML);
    }
    connect(&widget, &QQuickWidget::statusChanged, dispatcher,
            [this, &widget] { dispatcher->Install(widget); });
}
