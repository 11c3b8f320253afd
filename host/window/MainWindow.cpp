#include "window/MainWindow.h"

#include "ControlSystem.h"
#include "DPI/DPIUtils.h"
#include "Host.h"
#include "QuorixDataStore/DataStore.h"
#include "cameras/SimulatedCameras.h"
#include "io/Values.h"
#include "window/CameraModel.h"
#include "window/ChoiceDelegate.h"
#include "window/ConnectionModel.h"
#include "window/GreyscaleNames.h"
#include "window/LogModel.h"
#include "window/Palette.h"
#include "window/Question.h"

#include <QApplication>
#include <QCheckBox>
#include <QCloseEvent>
#include <QDialog>
#include <QDockWidget>
#include <QHeaderView>
#include <QLabel>
#include <QMenuBar>
#include <QSplitter>
#include <QStatusBar>
#include <QTableView>
#include <QTimer>
#include <QVBoxLayout>
#include <QWindow>

#include <utility>

namespace QuorixHost {
namespace {

constexpr int refusalShownMilliseconds = 8000;
constexpr int tickMilliseconds = 1000;
constexpr int mostRowsMeasured = 50; // for the width of a column, at each change
constexpr QSize firstSize(1360, 720);
constexpr int firstPanelWidth = 460;
constexpr int widestDeviceColumn = 280; // what is longer is told in full by its tool tip

/// Returns a view of a table, which scrolls where it does not fit.
QTableView* MakeTable(QAbstractItemModel* model, const char* name)
{
    auto* const table = new QTableView; // taken by whatever it is put into
    table->setObjectName(name);
    table->setModel(model);
    table->setAlternatingRowColors(true);
    table->setSelectionBehavior(QAbstractItemView::SelectRows);
    table->verticalHeader()->hide();
    table->horizontalHeader()->setStretchLastSection(true);
    table->horizontalHeader()->setHighlightSections(false);
    table->horizontalHeader()->setResizeContentsPrecision(mostRowsMeasured);
    return table;
}

QDockWidget* AddDock(QMainWindow& window, const char* title, QWidget* content,
                     Qt::DockWidgetArea area)
{
    auto* const dock = new QDockWidget(title, &window);
    dock->setObjectName(title);
    dock->setWidget(content);
    window.addDockWidget(area, dock);
    return dock;
}

} // namespace

VMainWindow::VMainWindow(VHost& host, boost::function<void()> requestStop)
    : host(host),
      requestStop(std::move(requestStop)),
      tapToSelect(host.Cameras().cameras->Find("System", "Gen6System")->Find("EnableTapToSelect")),
      cameras(new VCameraModel(host.Cameras(), this)),
      connections(new VConnectionModel(host.Cameras().store, host.Dispatcher(), this)),
      log(new VLogModel(VWindowLog::Installed(), this)),
      logLevels(new VLogLevelModel(VWindowLog::Installed(), this)),
      tapBox(new QCheckBox(tr("Tap to select"), this)),
      badge(new QLabel(tr("A device waits for an answer"), this)),
      storeWatch(host.Cameras().store, [this] { RefreshTapToSelect(); })
{
    setWindowTitle(QApplication::applicationName());
    setCentralWidget(MakeCameraPage());
    AddControlPanel();
    AddLogPanel();
    AddMenus();
    resize(firstSize);

    connect(cameras, &VCameraModel::EditRefused, this, [this](const QString& reason) {
        statusBar()->showMessage(reason, refusalShownMilliseconds);
    });
    auto* const timer = new QTimer(this);
    connect(timer, &QTimer::timeout, this, &VMainWindow::OnTick);
    timer->start(tickMilliseconds);
    qApp->installEventFilter(this);
    RefreshTapToSelect();
    ShowWaiting(FindQuestion() != nullptr);
}

VMainWindow::~VMainWindow() = default;

QWidget* VMainWindow::MakeCameraPage()
{
    QTableView* const table = MakeTable(cameras, "cameras");
    table->setItemDelegateForColumn(VCameraModel::ColumnGreyscale,
                                    new VChoiceDelegate(GreyscaleModes(), table));
    table->setEditTriggers(QAbstractItemView::DoubleClicked | QAbstractItemView::EditKeyPressed |
                           QAbstractItemView::AnyKeyPressed);
    QHeaderView* const header = table->horizontalHeader();
    header->setStretchLastSection(false);
    header->setSectionResizeMode(QHeaderView::ResizeToContents);
    header->setSectionResizeMode(VCameraModel::ColumnName, QHeaderView::Stretch);

    tapBox->setObjectName("tapToSelect");
    connect(tapBox, &QCheckBox::clicked, this,
            [this](bool checked) { tapToSelect->SetValue(MakeBoolValue(checked)); });

    auto* const page = new QWidget;
    auto* const layout = new QVBoxLayout(page);
    layout->addWidget(table);
    layout->addWidget(tapBox);
    return page;
}

void VMainWindow::AddControlPanel()
{
    badge->setObjectName("badge");
    badge->setStyleSheet("background: #e08a1e; color: #14171a; border-radius: 4px; padding: 4px;");

    QTableView* const table = MakeTable(connections, "connections");
    auto* const panel = new QWidget;
    auto* const layout = new QVBoxLayout(panel);
    layout->addWidget(badge);
    layout->addWidget(table);
    table->horizontalHeader()->setSectionResizeMode(QHeaderView::ResizeToContents);
    table->horizontalHeader()->setMaximumSectionSize(DPIUtils::Scale(widestDeviceColumn));
    QDockWidget* const dock = AddDock(*this, "Control", panel, Qt::RightDockWidgetArea);
    resizeDocks({dock}, {firstPanelWidth}, Qt::Horizontal);
}

void VMainWindow::AddLogPanel()
{
    QTableView* const lines = MakeTable(log, "log");
    connect(log, &QAbstractItemModel::rowsInserted, lines, &QTableView::scrollToBottom);
    lines->setWordWrap(false);

    QTableView* const levels = MakeTable(logLevels, "logLevels");
    levels->setItemDelegateForColumn(VLogLevelModel::ColumnLevel,
                                     new VChoiceDelegate(LogLevels(), levels));
    levels->setEditTriggers(QAbstractItemView::AllEditTriggers);

    auto* const splitter = new QSplitter;
    splitter->addWidget(lines);
    splitter->addWidget(levels);
    splitter->setStretchFactor(0, 3);
    splitter->setStretchFactor(1, 1);
    AddDock(*this, "Log", splitter, Qt::BottomDockWidgetArea);
}

void VMainWindow::AddMenus()
{
    QMenu* const program = menuBar()->addMenu(tr("Host"));
    program->addAction(tr("Quit"), this, [this] { requestStop(); });
    menuBar()->addMenu(tr("Settings"));

    QMenu* const view = menuBar()->addMenu(tr("View"));
    for (const QDockWidget* const dock : findChildren<QDockWidget*>()) {
        view->addAction(dock->toggleViewAction());
    }
    QAction* const dark = view->addAction(tr("Dark colours"));
    dark->setCheckable(true);
    dark->setChecked(IsDarkPalette());
    connect(dark, &QAction::toggled, this, &SetPalette);

    QMenu* const developer = menuBar()->addMenu(tr("Developer"));
    developer->addAction(tr("Reload QML"), this, &VMainWindow::ReloadRequested);
}

void VMainWindow::RefreshTapToSelect()
{
    tapBox->setChecked(ReadBool(tapToSelect->GetValue()));
}

void VMainWindow::OnTick()
{
    connections->RefreshAges();
    logLevels->Refresh();
    ShowWaiting(FindQuestion() != nullptr);
}

void VMainWindow::ShowWaiting(bool isWaiting)
{
    badge->setVisible(isWaiting);
}

void VMainWindow::BringAbove(const QWidget& dialog)
{
    // The plug-in's question has no parent, and a window manager might leave it behind this window.
    if (dialog.windowHandle() != nullptr) {
        dialog.windowHandle()->setTransientParent(windowHandle());
    }
    QApplication::alert(this);
}

void VMainWindow::closeEvent(QCloseEvent* event)
{
    event->ignore(); // the window goes when the host has stopped
    requestStop();
}

bool VMainWindow::eventFilter(QObject* object, QEvent* event)
{
    if (event->type() == QEvent::Show || event->type() == QEvent::Hide) {
        const auto* const dialog = qobject_cast<const QDialog*>(object);
        if (dialog != nullptr && IsQuestion(*dialog)) {
            const bool comes = event->type() == QEvent::Show;
            ShowWaiting(comes);
            if (comes) {
                BringAbove(*dialog);
            }
        }
    }
    return QMainWindow::eventFilter(object, event);
}

} // namespace QuorixHost
