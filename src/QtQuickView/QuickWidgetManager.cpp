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
