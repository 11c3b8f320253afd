#pragma once

#include "QtQuickView/IQuickWidget.h"

#include <QPointer>
#include <QQmlComponent>
#include <QQmlContext>
#include <QQmlPropertyMap>
#include <QQuickWidget>
#include <QUrl>

#include <memory>

class VQuickWidgetManager;

/// A QML view in a widget that can load its QML again while the program runs.
///
/// Owns: the context of its QML, the values that outlive a reload, and the root item. Shares the
/// manager, which so outlives it.
/// Threads: [gui].
/// Failure: QML that does not compile leaves the view empty and its errors in the component, which
/// is a child of this widget. Nothing is thrown, and a later load may succeed.
class VQuickWidget : public QQuickWidget, public IQuickWidget
{
    Q_OBJECT
    Q_INTERFACES(IQuickWidget)

public:
    /// @param manager  not null
    explicit VQuickWidget(std::shared_ptr<VQuickWidgetManager> manager, QWidget* parent = nullptr);

    /// Ends the QML before what it refers to.
    ~VQuickWidget() override;

    void SetSource(const QString& folder, const QString& relativePath) override;
    void SetProperty(const QString& name, const QVariant& value) override;

    /// The context in which the QML runs: a dialog puts into it what its QML works with.
    QQmlContext& QmlContext() { return *Context; }

public slots:
    /// Loads the QML again, from the place that `SetSource` found, with the values that it had.
    void ReloadQML();

protected:
    bool event(QEvent* event) override;

private:
    void Load();
    void DropRoot();
    bool OfferShortcutOverride(QEvent* event);
    bool HandleWindowChange(QEvent* event);
    bool HandleScreenChange(QEvent* event);

    const std::shared_ptr<VQuickWidgetManager> manager; // first, so that it is released last
    const bool ReloadEnabled;
    std::unique_ptr<QQmlContext> Context;
    QUrl SourceUrl;
    QQmlPropertyMap PersistentProperties;
    QPointer<QQmlComponent> component; // a child; the base class destroys the one of its content
};
