#include "QmlFolder.h"

#include "support/LogCapture.h"

#include <gmock/gmock.h>

#include <QAction>
#include <QApplication>
#include <QMainWindow>
#include <QTest>

using testing::Contains;

namespace {

/// A window of a host with one shortcut, around a view whose QML has the focus.
class VHostWindow
{
public:
    VHostWindow(Qt::Key shortcut, const QByteArray& qml)
    {
        action.setShortcut(shortcut);
        QObject::connect(&action, &QAction::triggered, &action, [this] { ++fired; });
        window.addAction(&action);
        view = new VQuickWidget(folder.Manager());
        window.setCentralWidget(view);
        folder.Show(*view, qml);
        window.show();
        window.activateWindow();
        view->setFocus();
        QCoreApplication::processEvents();
        EXPECT_TRUE(view->hasFocus());
    }

    VQuickWidget& View() { return *view; }

    /// Presses and releases a key as the windowing system does, at the window.
    void Press(Qt::Key key) { QTest::keyClick(window.windowHandle(), key); }

    int Handled() const { return view->rootObject()->property("handled").toInt(); }
    int Fired() const { return fired; }
    const VQmlFolder& Folder() const { return folder; }

private:
    VQmlFolder folder;
    QMainWindow window;
    QAction action;
    VQuickWidget* view = nullptr; // the window's
    int fired = 0;
};

const QByteArray escapeHandler =
    "Item { focus: true; property int handled: 0; Keys.onEscapePressed: handled += 1 }";
const QByteArray noHandler = "Item { focus: true; property int handled: 0 }";

} // namespace

TEST(KeysOnWindow, AHandlerKeepsItsKeyFromTheHostsShortcut)
{
    VHostWindow window(Qt::Key_Escape, escapeHandler);

    window.Press(Qt::Key_Escape);

    EXPECT_EQ(1, window.Handled());
    EXPECT_EQ(0, window.Fired());
}

TEST(KeysOnWindow, WithoutAHandlerTheHostsShortcutFires)
{
    VHostWindow window(Qt::Key_Escape, noHandler);

    window.Press(Qt::Key_Escape);

    EXPECT_EQ(0, window.Handled());
    EXPECT_EQ(1, window.Fired());
}

TEST(KeysOnWindow, AHandlerOfAnotherKeyDoesNotKeepThisOne)
{
    VHostWindow window(Qt::Key_Tab, escapeHandler);

    window.Press(Qt::Key_Tab);

    EXPECT_EQ(1, window.Fired());
}

TEST(KeysOnWindow, AnItemWithoutKeysIsTracedAndConsumesNothing)
{
    VHostWindow window(Qt::Key_Escape,
                       "FocusScope { property int handled: 0; Keys.onTabPressed: {}\n"
                       "  Item { objectName: 'plain'; focus: true } }");
    const TestSupport::VLogLevel level("Qt Korva", 6);
    const TestSupport::VLogCapture log;
    window.View().rootObject()->setFocus(true);

    window.Press(Qt::Key_Escape);

    EXPECT_EQ(1, window.Fired());
    EXPECT_THAT(log.Texts("Qt Korva"),
                Contains("Could not find QQuickKeysAttached child for item 'plain'."));
}

TEST(KeysOnWindow, AFunctionKeyIsNeverKeptBack)
{
    VHostWindow window(Qt::Key_F1, "Item { focus: true; property int handled: 0\n"
                                   "  Keys.onPressed: handled += 1; Keys.onEscapePressed: {} }");

    window.Press(Qt::Key_F1);

    EXPECT_EQ(0, window.Handled());
    EXPECT_EQ(1, window.Fired());
}

TEST(KeysOnWindow, AKeyWithoutAShortcutReachesTheQml)
{
    VHostWindow window(Qt::Key_F1, escapeHandler);

    window.Press(Qt::Key_Escape);
    window.Press(Qt::Key_Escape);

    EXPECT_EQ(2, window.Handled());
    EXPECT_EQ(0, window.Fired());
}

TEST(KeysOnWindow, AnItemThatTheQmlMakesLaterKeepsItsKeyToo)
{
    VHostWindow window(Qt::Key_Escape,
                       "FocusScope { id: root; focus: true; property int handled: 0\n"
                       "  Component { id: late; Item { focus: true\n"
                       "    Keys.onEscapePressed: root.handled += 1 } }\n"
                       "  function make() { late.createObject(root).forceActiveFocus() } }");
    window.Press(Qt::Key_Escape);
    ASSERT_EQ(1, window.Fired());

    QMetaObject::invokeMethod(window.View().rootObject(), "make");
    window.Press(Qt::Key_Escape);

    EXPECT_EQ(1, window.Handled());
    EXPECT_EQ(1, window.Fired());
}

TEST(KeysOnWindow, AfterAReloadTheNewItemKeepsItsKey)
{
    VHostWindow window(Qt::Key_Escape, noHandler);
    window.Folder().Write("View.qml", "import QtQuick 2.0\n" + escapeHandler);
    window.View().ReloadQML();

    window.Press(Qt::Key_Escape);

    EXPECT_EQ(1, window.Handled());
    EXPECT_EQ(0, window.Fired());
}

TEST(KeysOnWindow, AnEmptyViewLeavesEveryKeyToTheHost)
{
    VHostWindow window(Qt::Key_Escape, "Item { this is no QML }");

    window.Press(Qt::Key_Escape);

    EXPECT_EQ(1, window.Fired());
}
