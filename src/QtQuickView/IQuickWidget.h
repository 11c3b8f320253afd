#pragma once

#include <QString>
#include <QVariant>
#include <QtPlugin>

/// A QML view in a widget, as those see it who know the widget only as a QObject and ask for this
/// interface with `qobject_cast`. Threads: [gui].
class IQuickWidget
{
public:
    virtual ~IQuickWidget() = default;

    /// Loads the file `relativePath` of the folder of QML sources, or the compiled-in one.
    virtual void SetSource(const QString& folder, const QString& relativePath) = 0;

    /// Sets a value that the QML reads as `persistentProperties[name]` and that a reload keeps.
    virtual void SetProperty(const QString& name, const QVariant& value) = 0;
};

Q_DECLARE_INTERFACE(IQuickWidget, "com.Korva.IQuickWidget")
