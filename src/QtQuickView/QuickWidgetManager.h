#pragma once

#include <QObject>
#include <QString>

class QQmlEngine;
class VQuickWidget;
class VQuickWidgetEventFilterDispatcher;

/// What all QML views of a process share: the engine and the event filters.
///
/// Owns: engine and dispatcher. Lives in a std::shared_ptr of which every view holds one, so that
/// it outlives them. Threads: [gui]. Failure: none of its own.
class VQuickWidgetManager : public QObject
{
    Q_OBJECT

public:
    /// @param sourceFolder   the QML sources on disk, only read where `reloadEnabled` is set
    /// @param reloadEnabled  whether a file of that folder wins over the compiled-in one, and views
    /// load again when told to. Such a manager has to be made before the process loads any QML: Qt
    /// decides then and for good whether it may show QML that it has kept from an earlier load.
    VQuickWidgetManager(const QString& sourceFolder, bool reloadEnabled);
    ~VQuickWidgetManager() override;

    /// The folder that views pass to `SetSource`.
    const QString& SourceFolder() const { return sourceFolder; }

    bool IsReloadEnabled() const { return ReloadEnabled; }
    QQmlEngine* Engine() const { return engine; }

    /// Connects a view, from its constructor: to the reload, where that is enabled, and to the
    /// event filters, which it gets whenever it has a new root item.
    void Register(VQuickWidget& widget);

signals:
    /// Emitted by whoever wants all views to load their QML again.
    void OnReloadQML();

private:
    const QString sourceFolder;
    const bool ReloadEnabled;
    QQmlEngine* const engine;                            // a child of this object
    VQuickWidgetEventFilterDispatcher* const dispatcher; // a child of this object
};
