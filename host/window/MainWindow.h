#pragma once

#include "window/StoreWatch.h"

#include <QMainWindow>

#include <memory>

class QCheckBox;
class QLabel;

namespace QuorixHost {

class VCameraModel;
class VConnectionModel;
class VHost;
class VLogLevelModel;
class VLogModel;
class VSimulatedParameter;

/// What the operator sees of the host: the cameras, who controls it, and its log.
///
/// Owns: the widgets and their models, as children. Threads: [gui].
class VMainWindow : public QMainWindow
{
    Q_OBJECT

public:
    /// @param host         outlives the window
    /// @param requestStop  called instead of closing, so that the host stops in order
    VMainWindow(VHost& host, boost::function<void()> requestStop);
    ~VMainWindow() override;

    /// Marks the operator's window while a device waits for his answer.
    void ShowWaiting(bool isWaiting);

signals:
    /// The developer wants the Quick views to load their QML again.
    void ReloadRequested();

protected:
    void closeEvent(QCloseEvent* event) override;

    /// Notices the plug-in's question as it comes and goes.
    bool eventFilter(QObject* object, QEvent* event) override;

private:
    QWidget* MakeCameraPage();
    void AddControlPanel();
    void AddLogPanel();
    void AddMenus();
    void RefreshTapToSelect();
    void OnTick();
    void BringAbove(const QWidget& dialog);

    VHost& host;
    const boost::function<void()> requestStop;
    const std::shared_ptr<VSimulatedParameter> tapToSelect;
    VCameraModel* const cameras;
    VConnectionModel* const connections;
    VLogModel* const log;
    VLogLevelModel* const logLevels;
    QCheckBox* const tapBox;
    QLabel* const badge;
    const VStoreWatch storeWatch;
};

} // namespace QuorixHost
