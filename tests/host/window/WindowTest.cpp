#include "ControlSystem.h"
#include "DebugServices/Clock.h"
#include "QtQuickView/QuickWidget.h"
#include "QtQuickView/QuickWidgetManager.h"
#include "host/window/WindowSupport.h"
#include "utils/LogStatement.h"
#include "window/CameraModel.h"
#include "window/ConnectionModel.h"
#include "window/LogModel.h"

#include <QCheckBox>
#include <QComboBox>
#include <QDialog>
#include <QFile>
#include <QHeaderView>
#include <QLabel>
#include <QLineEdit>
#include <QQuickItem>
#include <QSignalSpy>
#include <QStatusBar>
#include <QTableView>
#include <QTemporaryDir>
#include <QWindow>

using QuorixHost::VCameraModel;
using QuorixHost::VConnectionModel;
using QuorixHost::VLogLevelModel;
using QuorixHost::VLogModel;
using TestSupport::MenuItem;

namespace {

class HostWindow : public TestSupport::VShownWindow
{
protected:
    /// Opens a cell for editing. @return its editor
    template <typename TEditor>
    TEditor& Edit(QTableView& table, int row, int column)
    {
        const QModelIndex cell = table.model()->index(row, column);
        table.setCurrentIndex(cell);
        table.edit(cell);
        auto* const editor = table.viewport()->findChild<TEditor*>();
        if (editor == nullptr) {
            throw std::runtime_error("the cell cannot be edited");
        }
        return *editor;
    }

    std::string Text(const QTableView& table, int row, int column)
    {
        return table.model()->index(row, column).data().toString().toStdString();
    }

    void Connect(const std::string& id, const std::string& name, bool connected = true)
    {
        Write({"Control", id, "Connected"}, MakeBoolValue(connected));
        Write({"Control", id, "Name"}, MakeStringValue(name));
    }

    void Beat()
    {
        host.GetControlSystem()->ExecuteCommand(
            L"System.Heartbeat", {}, [](const ControlSystem::IParameters&) {},
            [](ControlSystem::IResult) {});
    }
};

/// Looks like the plug-in's question: it is known by its properties.
class VQuestion : public QDialog
{
    Q_OBJECT
    Q_PROPERTY(QString clientName MEMBER clientName)
    Q_PROPERTY(bool remember MEMBER remember)

public:
    QString clientName = "Tablet";
    bool remember = true;
};

} // namespace

TEST_F(HostWindow, ShowsTheCamerasFromTheStart)
{
    const auto& table = Find<QTableView>("cameras");

    ASSERT_EQ(4, table.model()->rowCount());
    EXPECT_EQ("Camera 4", Text(table, 3, VCameraModel::ColumnName));
    KeepPicture("window-light");
}

TEST_F(HostWindow, GivesTheRoomThatIsLeftToTheNames)
{
    auto& table = Find<QTableView>("cameras");
    const QHeaderView& header = *table.horizontalHeader();

    // No column is wider than it need be but the names, which are cut where they are too long.
    EXPECT_EQ(header.sectionSizeHint(VCameraModel::ColumnSelected),
              header.sectionSize(VCameraModel::ColumnSelected));
    EXPECT_EQ(table.viewport()->width(), header.length());
    Write({"Device", "qx:1", "Settings", "Name"}, MakeStringValue(std::string(400, 'W')));
    EXPECT_TRUE(TestSupport::WaitFor(
        [&] { return Text(table, 0, VCameraModel::ColumnName) == std::string(400, 'W'); }));
    EXPECT_EQ(table.viewport()->width(), header.length());
    KeepPicture("window-long-name");
}

TEST_F(HostWindow, ShowsNamesOfEveryKind)
{
    auto& table = Find<QTableView>("connections");
    const std::string rightToLeft =
        "\u05e9\u05dc\u05d8 \u05d1\u05de\u05d4 \u05e8\u05d0\u05e9\u05d9";
    Connect("id-1", rightToLeft, false);
    Connect("id-2", "one\ntwo", false);
    Connect("id-3", "", false);
    Connect("id-4", std::string(100000, 'W'), false);
    Connect("00000000-1111-2222-3333-444444444444", "Director's tablet");
    ASSERT_TRUE(TestSupport::WaitFor([&] { return table.model()->rowCount() == 5; }));
    ASSERT_TRUE(TestSupport::WaitFor(
        [&] { return Text(table, 0, VConnectionModel::ColumnName) == "Director's tablet"; }));
    KeepPicture("window-names");

    EXPECT_EQ(rightToLeft, Text(table, 1, VConnectionModel::ColumnName));
    EXPECT_EQ("one two", Text(table, 2, VConnectionModel::ColumnName));
    EXPECT_EQ("", Text(table, 3, VConnectionModel::ColumnName));
    EXPECT_LT(Text(table, 4, VConnectionModel::ColumnName).size(), 1000U);
    EXPECT_LT(table.columnWidth(VConnectionModel::ColumnName), table.viewport()->width());
    EXPECT_EQ("<p>00000000-1111-2222-3333-444444444444</p>",
              table.model()->index(0, VConnectionModel::ColumnId).data(Qt::ToolTipRole));
    EXPECT_FALSE(
        table.model()->index(3, VConnectionModel::ColumnName).data(Qt::ToolTipRole).isValid());
}

TEST_F(HostWindow, TakesWhatTheOperatorTypes)
{
    auto& table = Find<QTableView>("cameras");
    auto& editor = Edit<QLineEdit>(table, 0, VCameraModel::ColumnStrobe);

    editor.selectAll();
    QTest::keyClicks(&editor, "0.75");
    QTest::keyClick(&editor, Qt::Key_Return);

    EXPECT_TRUE(
        TestSupport::WaitFor([&] { return Text(table, 0, VCameraModel::ColumnStrobe) == "0.75"; }));
}

TEST_F(HostWindow, TellsTheOperatorWhatIsRefused)
{
    auto& editor = Edit<QLineEdit>(Find<QTableView>("cameras"), 3, VCameraModel::ColumnThreshold);

    editor.selectAll();
    QTest::keyClicks(&editor, "0.75");
    QTest::keyClick(&editor, Qt::Key_Return);

    EXPECT_TRUE(TestSupport::WaitFor([&] {
        return Window().statusBar()->currentMessage() ==
               "Device.qx:4.Settings.Threshold refuses to be changed";
    }));
}

TEST_F(HostWindow, OffersTheGreyscaleModesByName)
{
    auto& table = Find<QTableView>("cameras");
    auto& editor = Edit<QComboBox>(table, 0, VCameraModel::ColumnGreyscale);
    EXPECT_EQ(6, editor.count());
    EXPECT_EQ("None", editor.currentText());

    editor.setCurrentText("Edges");
    emit editor.activated(editor.currentIndex());

    EXPECT_TRUE(TestSupport::WaitFor(
        [&] { return Text(table, 0, VCameraModel::ColumnGreyscale) == "Edges"; }));
}

TEST_F(HostWindow, SelectsACameraByAClick)
{
    auto& table = Find<QTableView>("cameras");
    const QModelIndex cell = table.model()->index(1, VCameraModel::ColumnSelected);
    table.scrollTo(cell);
    const QRect place = table.visualRect(cell);

    QTest::mouseClick(table.viewport(), Qt::LeftButton, {},
                      place.topLeft() + QPoint(8, place.height() / 2));

    EXPECT_TRUE(TestSupport::WaitFor([&] { return cell.data(Qt::CheckStateRole) == Qt::Checked; }));
}

TEST_F(HostWindow, SwitchesTapToSelect)
{
    auto& box = Find<QCheckBox>("tapToSelect");
    const VDataPath path("System.Gen6System.Settings.EnableTapToSelect");
    EXPECT_FALSE(box.isChecked());

    QTest::mouseClick(&box, Qt::LeftButton, {}, QPoint(8, box.height() / 2));
    {
        const VDataReader reader(*host.Cameras().store);
        EXPECT_TRUE(ReadBool(reader.GetValue(VDataToken(path))));
    }

    Write(path, MakeBoolValue(false)); // as a device does
    EXPECT_TRUE(TestSupport::WaitFor([&] { return !box.isChecked(); }));
}

TEST_F(HostWindow, ShowsWhoIsConnectedSinceWhenAndHowFresh)
{
    auto& table = Find<QTableView>("connections");
    Connect("id-1", "Tablet");
    ASSERT_TRUE(TestSupport::WaitFor([&] { return table.model()->rowCount() == 1; }));
    ASSERT_TRUE(TestSupport::WaitFor(
        [&] { return Text(table, 0, VConnectionModel::ColumnName) == "Tablet"; }));
    const std::string since = Text(table, 0, VConnectionModel::ColumnSince);

    EXPECT_EQ("id-1", Text(table, 0, VConnectionModel::ColumnId));
    EXPECT_EQ("connected", Text(table, 0, VConnectionModel::ColumnState));
    EXPECT_EQ(8U, since.size());
    EXPECT_EQ("0 s ago", Text(table, 0, VConnectionModel::ColumnBeat));
    DebugServices::AdvanceClock(2100);
    EXPECT_EQ("2 s ago", Text(table, 0, VConnectionModel::ColumnBeat));
    Beat();
    EXPECT_EQ("0 s ago", Text(table, 0, VConnectionModel::ColumnBeat));
    EXPECT_EQ(since, Text(table, 0, VConnectionModel::ColumnSince));
    KeepPicture("window-connected");
}

TEST_F(HostWindow, ShowsADeviceThatHasGone)
{
    auto& table = Find<QTableView>("connections");
    Connect("id-1", "Tablet");
    Connect("id-1", "Tablet", false);

    EXPECT_TRUE(TestSupport::WaitFor([&] {
        return table.model()->rowCount() == 1 &&
               Text(table, 0, VConnectionModel::ColumnState) == "gone";
    }));
    EXPECT_EQ("", Text(table, 0, VConnectionModel::ColumnSince));
    EXPECT_EQ("", Text(table, 0, VConnectionModel::ColumnBeat));
}

TEST_F(HostWindow, CountsBeatsForTheDeviceThatCameLast)
{
    auto& table = Find<QTableView>("connections");
    Connect("id-1", "Tablet");
    ASSERT_TRUE(TestSupport::WaitFor([&] { return table.model()->rowCount() == 1; }));
    DebugServices::AdvanceClock(1000);
    Connect("id-0", "Phone");
    ASSERT_TRUE(TestSupport::WaitFor([&] { return table.model()->rowCount() == 2; }));

    Beat();

    EXPECT_EQ("0 s ago", Text(table, 0, VConnectionModel::ColumnBeat));
    EXPECT_EQ("", Text(table, 1, VConnectionModel::ColumnBeat));
}

TEST_F(HostWindow, BearsABadgeWhileADeviceWaits)
{
    const auto& badge = Find<QLabel>("badge");
    EXPECT_FALSE(badge.isVisible());

    VQuestion question;
    question.show();
    EXPECT_TRUE(badge.isVisible());
    EXPECT_EQ("A device waits for an answer", badge.text());
    EXPECT_EQ(Window().windowHandle(), question.windowHandle()->transientParent());
    KeepPicture("window-waiting");
    question.done(0);

    EXPECT_FALSE(badge.isVisible());
}

TEST_F(HostWindow, BearsNoBadgeForOtherDialogs)
{
    QDialog other;
    other.show();

    EXPECT_FALSE(Find<QLabel>("badge").isVisible());
}

TEST_F(HostWindow, AsksForAnOrderlyStopInsteadOfClosing)
{
    Window().close();
    EXPECT_TRUE(Window().isVisible());
    EXPECT_EQ(1, stopRequests);

    MenuItem(Window(), "Host", "Quit").trigger();
    EXPECT_EQ(2, stopRequests);
}

TEST_F(HostWindow, TurnsDarkAndLight)
{
    QAction& dark = MenuItem(Window(), "View", "Dark colours");

    dark.trigger();
    EXPECT_TRUE(QuorixHost::IsDarkPalette());
    KeepPicture("window-dark");
    dark.trigger();

    EXPECT_FALSE(QuorixHost::IsDarkPalette());
}

TEST_F(HostWindow, ShowsTheLogAsItIsWritten)
{
    auto& table = Find<QTableView>("log");

    KVR_LOG("WindowTest", 3, "A line of two\nlines and %1%", "more");

    const auto last = [&](int column) {
        return Text(table, table.model()->rowCount() - 1, column);
    };
    EXPECT_TRUE(TestSupport::WaitFor(
        [&] { return last(VLogModel::ColumnText) == "A line of two lines and more"; }));
    EXPECT_EQ("WindowTest", last(VLogModel::ColumnCategory));
    EXPECT_EQ("warnings", last(VLogModel::ColumnLevel));
}

TEST_F(HostWindow, SetsTheLevelOfACategory)
{
    auto& table = Find<QTableView>("logLevels");
    KVR::ILogCategory* const category = KVR::GlobalLog().GetCategory("WindowTest.Levels");
    auto* const model = static_cast<VLogLevelModel*>(table.model());
    model->Refresh();
    const QModelIndexList found =
        model->match(model->index(0, 0), Qt::DisplayRole, "WindowTest.Levels", 1, Qt::MatchExactly);
    ASSERT_EQ(1, found.size());

    auto& editor = Edit<QComboBox>(table, found[0].row(), VLogLevelModel::ColumnLevel);
    EXPECT_EQ("information", editor.currentText());
    editor.setCurrentText("tracing");
    emit editor.activated(editor.currentIndex());

    EXPECT_EQ(6, category->GetLevel());
    EXPECT_EQ("tracing", Text(table, found[0].row(), VLogLevelModel::ColumnLevel));
}

TEST_F(HostWindow, KeepsTheYoungestLinesOfALongLog)
{
    auto& table = Find<QTableView>("log");
    for (std::size_t i = 0; i < QuorixHost::VWindowLog::mostLines + 10; ++i) {
        QuorixHost::VWindowLog::Installed().Log(std::to_string(i), nullptr, 4, nullptr, 0);
    }

    EXPECT_TRUE(TestSupport::WaitFor([&] {
        return Text(table, table.model()->rowCount() - 1, VLogModel::ColumnText) ==
               std::to_string(QuorixHost::VWindowLog::mostLines + 9);
    }));
    EXPECT_EQ(static_cast<int>(QuorixHost::VWindowLog::mostLines), table.model()->rowCount());
}

TEST(HostWindowReload, LoadsQmlAgainFromTheDevelopersFolder)
{
    const QTemporaryDir folder;
    const auto write = [&](const char* width) {
        QFile file(folder.filePath("View.qml"));
        ASSERT_TRUE(file.open(QFile::WriteOnly));
        file.write(QByteArray("import QtQuick 2.0\nItem { implicitWidth: ") + width + " }\n");
    };
    qputenv(QuorixHost::VHostWindow::qmlFolderVariable, folder.path().toUtf8());
    QuorixHost::VHost host{0};
    QuorixHost::VHostWindow window(host, [] {});
    qunsetenv(QuorixHost::VHostWindow::qmlFolderVariable);
    VQuickWidget view(window.GetQuickContext());
    write("100");
    view.SetSource(window.GetQuickContext()->SourceFolder(), "View.qml");
    ASSERT_NE(nullptr, view.rootObject());
    EXPECT_EQ(100, view.rootObject()->implicitWidth());

    write("200");
    MenuItem(window.Window(), "Developer", "Reload QML").trigger();

    EXPECT_EQ(200, view.rootObject()->implicitWidth());
}

#include "WindowTest.moc"
