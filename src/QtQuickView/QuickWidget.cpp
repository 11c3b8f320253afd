#include "QtQuickView/QuickWidget.h"

#include "QtQuickView/QuickWidgetManager.h"

#include <QCoreApplication>
#include <QEvent>
#include <QFileInfo>
#include <QQmlEngine>
#include <QQuickItem>
#include <QQuickWindow>

#include <utility>

// Qt keeps these two to itself and may number them anew.
static_assert(QEvent::WindowChangeInternal == 215);
static_assert(QEvent::ScreenChangeInternal == 216);

VQuickWidget::VQuickWidget(std::shared_ptr<VQuickWidgetManager> quickManager, QWidget* parent)
    : QQuickWidget(quickManager->Engine(), parent),
      manager(std::move(quickManager)),
      ReloadEnabled(manager->IsReloadEnabled()),
      Context(std::make_unique<QQmlContext>(manager->Engine()->rootContext()))
{
    Context->setContextProperty(QStringLiteral("persistentProperties"), &PersistentProperties);
    setFocusPolicy(Qt::StrongFocus);
    setAttribute(Qt::WA_OpaquePaintEvent);
    setAttribute(Qt::WA_AlwaysStackOnTop);
    manager->Register(*this);
}

VQuickWidget::~VQuickWidget()
{
    // Bindings of a living root would be evaluated against what is already gone.
    DropRoot();
    Context.reset();
}

void VQuickWidget::SetProperty(const QString& name, const QVariant& value)
{
    if (PersistentProperties.value(name) == value) {
        return;
    }
    PersistentProperties.insert(name, value);
    // The map announces only what QML writes.
    emit PersistentProperties.valueChanged(name, value);
}

void VQuickWidget::SetSource(const QString& folder, const QString& relativePath)
{
    SourceUrl.clear();
    if (ReloadEnabled) {
        const QFileInfo file(folder + QLatin1Char('/') + relativePath);
        if (file.isFile()) {
            SourceUrl = QUrl::fromLocalFile(file.absoluteFilePath());
        }
    }
    if (SourceUrl.isEmpty()) {
        SourceUrl = QUrl(QStringLiteral("qrc:/") + relativePath);
    }
    setObjectName(relativePath);
    Load();
}

void VQuickWidget::ReloadQML()
{
    Load();
}

void VQuickWidget::Load()
{
    DropRoot();
    QQmlEngine* qmlEngine = manager->Engine();
    qmlEngine->clearComponentCache();
    component = new QQmlComponent(qmlEngine, SourceUrl, this);
    QObject* object = component->create(Context.get());
    if (auto* item = qobject_cast<QQuickItem*>(object)) {
        setContent(SourceUrl, component, item);
    } else {
        delete object; // a view can show items only
    }
}

void VQuickWidget::DropRoot()
{
    setSource(QUrl());
    delete component; // of a load that failed; with content the base class has done it
}

bool VQuickWidget::event(QEvent* event)
{
    switch (static_cast<int>(event->type())) {
    case QEvent::ShortcutOverride:
        return OfferShortcutOverride(event) || QQuickWidget::event(event);
    case QEvent::WindowChangeInternal:
        return HandleWindowChange(event);
    case QEvent::ScreenChangeInternal:
        return HandleScreenChange(event);
    default:
        return QQuickWidget::event(event);
    }
}

/// Lets the focused item keep a key from the shortcuts of the window around this view.
bool VQuickWidget::OfferShortcutOverride(QEvent* event)
{
    QObject* focusObject = quickWindow()->focusObject();
    // Not the object's own event(), which would pass by the filters that know the keys.
    return focusObject != nullptr && QCoreApplication::sendEvent(focusObject, event);
}

/// Has the scene graph made anew for the new window instead of being kept with the old one's state.
bool VQuickWidget::HandleWindowChange(QEvent* event)
{
    const bool isPersistent = quickWindow()->isPersistentSceneGraph();
    quickWindow()->setPersistentSceneGraph(false);
    const bool result = QQuickWidget::event(event);
    quickWindow()->setPersistentSceneGraph(isPersistent);
    return result;
}

bool VQuickWidget::HandleScreenChange(QEvent* event)
{
    QEvent windowChange(QEvent::WindowChangeInternal);
    HandleWindowChange(&windowChange);
    return QQuickWidget::event(event);
}
