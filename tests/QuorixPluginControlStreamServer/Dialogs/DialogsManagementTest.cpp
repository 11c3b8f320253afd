#include "Dialogs/DialogsSupport.h"
#include "QuorixPluginControlStreamServer/Authorization/QuorixControlManagementDialog.h"

#include "DPI/DPIUtils.h"

#include <QMetaMethod>
#include <QPointer>
#include <QVBoxLayout>
#include <QWindow>
#include <QtTest/qtestspontaneevent.h>

using TestSupport::Click;
using TestSupport::ItemOf;
using TestSupport::ItemsOf;

namespace {

using VDialog = VQuorixControlManagementDialog;

const VControlDevices twoDevices = {{"1", {true, "Alto"}}, {"2", {false, "Bass"}}};

class ManagementDialog : public TestSupport::VDialogs
{
protected:
    ManagementDialog() { authorization->SetDevices(twoDevices); }

    ~ManagementDialog() override { delete dialog; }

    /// Shows a dialog for the devices that are known now.
    VDialog& Open()
    {
        dialog = new VDialog(context, authorization);
        TestSupport::Show(*dialog);
        return *dialog;
    }

    /// Returns the row of a device, that has to be there.
    static QQuickItem& RowOf(const QWidget& opened, const QString& name)
    {
        for (QQuickItem* const row : ItemsOf(ItemOf(opened, "list"), "rect")) {
            if (ItemOf(*row, "label").property("text") == name) {
                return *row;
            }
        }
        throw std::runtime_error("no row " + name.toStdString());
    }

    /// Moves the mouse into the row of a device, which brings its button up, and presses that.
    static void Forget(const QWidget& opened, const QString& name)
    {
        QQuickItem& button = ItemOf(RowOf(opened, name), "forgetButton");
        QTest::mouseMove(&TestSupport::ViewOf(opened),
                         TestSupport::PlaceOf(button).center().toPoint());
        Click(opened, button);
    }

    static int RowCount(const QWidget& opened)
    {
        return ItemOf(opened, "list").property("count").toInt();
    }

    QPointer<VDialog> dialog;
};

/// Lets a widget go that deletes itself when it is closed.
bool IsGone(const QPointer<VDialog>& dialog)
{
    QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
    return dialog.isNull();
}

} // namespace

TEST_F(ManagementDialog, HasItsTitleAndNoWayOutInTheTitleBar)
{
    const VDialog& opened = Open();

    EXPECT_EQ("Korva Control", opened.windowTitle());
    EXPECT_TRUE(opened.isModal());
    EXPECT_TRUE(opened.testAttribute(Qt::WA_DeleteOnClose));
    const Qt::WindowFlags flags = opened.windowFlags();
    EXPECT_TRUE(flags.testFlag(Qt::WindowTitleHint));
    EXPECT_TRUE(flags.testFlag(Qt::WindowSystemMenuHint));
    EXPECT_TRUE(flags.testFlag(Qt::CustomizeWindowHint));
    EXPECT_FALSE(flags.testFlag(Qt::WindowCloseButtonHint));
    EXPECT_FALSE(flags.testFlag(Qt::WindowContextHelpButtonHint));
    EXPECT_EQ(QSize(DPIUtils::Scale(350), DPIUtils::Scale(350)), opened.minimumSize());
}

TEST_F(ManagementDialog, IsFilledByItsView)
{
    const VDialog& opened = Open();
    const auto* const layout = qobject_cast<QVBoxLayout*>(opened.layout());
    const VQuickWidget& view = TestSupport::ViewOf(opened);

    ASSERT_NE(nullptr, layout);
    EXPECT_EQ(QMargins(), layout->contentsMargins());
    EXPECT_EQ(0, layout->spacing());
    EXPECT_EQ(QQuickWidget::SizeRootObjectToView, view.resizeMode());
    EXPECT_EQ(QUrl("qrc:/ManagementDialog.qml"), view.source());
}

TEST_F(ManagementDialog, OffersItsTwoSlotsToQml)
{
    const QMetaObject& meta = VDialog::staticMetaObject;

    EXPECT_EQ(QMetaMethod::Slot, meta.method(meta.indexOfMethod("OnOk()")).methodType());
    EXPECT_EQ(QMetaMethod::Slot, meta.method(meta.indexOfMethod("OnClose()")).methodType());
}

TEST_F(ManagementDialog, SpeaksInTheseWords)
{
    const VDialog& opened = Open();

    EXPECT_EQ("Known Control devices:", ItemOf(opened, "heading").property("text"));
    EXPECT_EQ("Reset", ItemOf(opened, "resetButton").property("text"));
    EXPECT_EQ("Ok", ItemOf(opened, "buttonOk").property("text"));
    EXPECT_EQ("Cancel", ItemOf(opened, "buttonCancel").property("text"));
    EXPECT_EQ("Forget", ItemOf(RowOf(opened, "Alto"), "forgetButton").property("text"));
}

TEST_F(ManagementDialog, ShowsWhoIsAllowedAndWhoIsBanned)
{
    const VDialog& opened = Open();

    QQuickItem& alto = RowOf(opened, "Alto");
    QQuickItem& bass = RowOf(opened, "Bass");

    EXPECT_TRUE(ItemOf(alto, "imageAllowed").isVisible());
    EXPECT_FALSE(ItemOf(alto, "imageBanned").isVisible());
    EXPECT_FALSE(ItemOf(bass, "imageAllowed").isVisible());
    EXPECT_TRUE(ItemOf(bass, "imageBanned").isVisible());
}

TEST_F(ManagementDialog, ShowsAFlagThatTheModelChanges)
{
    const VDialog& opened = Open();
    auto* const model = ItemOf(opened, "list").property("model").value<QAbstractItemModel*>();
    ASSERT_NE(nullptr, model);

    EXPECT_FALSE(model->setData(model->index(0, 0), false, 2));

    EXPECT_FALSE(ItemOf(RowOf(opened, "Alto"), "imageAllowed").isVisible());
    EXPECT_TRUE(ItemOf(RowOf(opened, "Alto"), "imageBanned").isVisible());
}

TEST_F(ManagementDialog, RendersNoMarkupInAName)
{
    authorization->SetDevices({{"1", {true, "<b>Alto</b>"}}});
    const VDialog& opened = Open();

    const QQuickItem& label = ItemOf(RowOf(opened, "<b>Alto</b>"), "label");

    EXPECT_EQ(0, label.property("textFormat").toInt()); // plain
}

TEST_F(ManagementDialog, ShowsTheButtonOfTheRowUnderTheMouse)
{
    const VDialog& opened = Open();
    const QQuickItem& alto = ItemOf(RowOf(opened, "Alto"), "forgetButton");
    const QQuickItem& bass = ItemOf(RowOf(opened, "Bass"), "forgetButton");
    EXPECT_EQ(0.0, alto.opacity());

    QTest::mouseMove(&TestSupport::ViewOf(opened),
                     TestSupport::PlaceOf(RowOf(opened, "Alto")).center().toPoint());
    EXPECT_TRUE(TestSupport::WaitFor([&] { return alto.opacity() == 1.0; }));
    EXPECT_EQ(0.0, bass.opacity());

    QTest::mouseMove(&TestSupport::ViewOf(opened), TestSupport::PlaceOf(alto).center().toPoint());
    QTest::mouseMove(&TestSupport::ViewOf(opened),
                     TestSupport::PlaceOf(RowOf(opened, "Bass")).center().toPoint());
    EXPECT_TRUE(
        TestSupport::WaitFor([&] { return alto.opacity() == 0.0 && bass.opacity() == 1.0; }));
}

TEST_F(ManagementDialog, KeepsTheButtonUpUnderTheMouse)
{
    const VDialog& opened = Open();
    const QQuickItem& alto = ItemOf(RowOf(opened, "Alto"), "forgetButton");

    QTest::mouseMove(&TestSupport::ViewOf(opened), TestSupport::PlaceOf(alto).center().toPoint());

    EXPECT_TRUE(TestSupport::WaitFor([&] { return alto.opacity() == 1.0; }));
}

TEST_F(ManagementDialog, ChangesNothingByForgetAndCancel)
{
    const VDialog& opened = Open();

    Forget(opened, "Alto");
    EXPECT_EQ(1, RowCount(opened));
    Click(opened, "buttonCancel");

    EXPECT_TRUE(IsGone(dialog));
    EXPECT_EQ(twoDevices, authorization->GetDevices());
}

TEST_F(ManagementDialog, ForgetsADeviceByForgetAndOk)
{
    const VDialog& opened = Open();

    Forget(opened, "Alto");
    EXPECT_EQ(twoDevices, authorization->GetDevices());
    Click(opened, "buttonOk");

    EXPECT_TRUE(IsGone(dialog));
    EXPECT_EQ((VControlDevices{{"2", {false, "Bass"}}}), authorization->GetDevices());
}

TEST_F(ManagementDialog, ForgetsEverythingByResetAndOk)
{
    const VDialog& opened = Open();

    Click(opened, "resetButton");
    EXPECT_EQ(0, RowCount(opened));
    Click(opened, "buttonOk");

    EXPECT_TRUE(authorization->GetDevices().empty());
    dialog.clear(); // what is left of it lets go of the authorization
    QCoreApplication::sendPostedEvents(nullptr, QEvent::DeferredDelete);
    authorization.reset();
    EXPECT_EQ(MakeStringValue(""), Preference(ControlPreferences::AllowedControls()));
    EXPECT_EQ(MakeStringValue(""), Preference(ControlPreferences::BannedControls()));
}

TEST_F(ManagementDialog, IsWorkedByTheKeyboardAlone)
{
    const VDialog& opened = Open();
    VQuickWidget& view = TestSupport::ViewOf(opened);

    for (const char* const stop : {"resetButton", "list", "buttonOk", "buttonCancel"}) {
        QTest::keyClick(&view, Qt::Key_Tab);
        EXPECT_TRUE(ItemOf(opened, stop).hasActiveFocus()) << stop;
    }
    for (const char* const stop : {"buttonOk", "list", "resetButton"}) {
        QTest::keyClick(&view, Qt::Key_Backtab);
        EXPECT_TRUE(ItemOf(opened, stop).hasActiveFocus()) << stop;
    }
}

TEST_F(ManagementDialog, MarksTheRowThatTheKeyboardWouldForget)
{
    const VDialog& opened = Open();
    VQuickWidget& view = TestSupport::ViewOf(opened);
    const QQuickItem& alto = ItemOf(RowOf(opened, "Alto"), "keyboardFocus");
    const QQuickItem& bass = ItemOf(RowOf(opened, "Bass"), "keyboardFocus");
    EXPECT_FALSE(alto.isVisible());

    ItemOf(opened, "list").forceActiveFocus();
    EXPECT_TRUE(alto.isVisible());
    EXPECT_FALSE(bass.isVisible());
    QTest::keyClick(&view, Qt::Key_Down);
    EXPECT_FALSE(alto.isVisible());
    EXPECT_TRUE(bass.isVisible());

    // Only the mouse brings the button itself up.
    EXPECT_EQ(0.0, ItemOf(RowOf(opened, "Bass"), "forgetButton").opacity());
}

TEST_F(ManagementDialog, ForgetsByTheKeyboardToo)
{
    for (const Qt::Key key : {Qt::Key_Space, Qt::Key_Return, Qt::Key_Enter, Qt::Key_Delete}) {
        authorization->SetDevices(twoDevices);
        const VDialog& opened = Open();
        VQuickWidget& view = TestSupport::ViewOf(opened);
        ItemOf(opened, "list").forceActiveFocus();

        QTest::keyClick(&view, Qt::Key_Down);
        QTest::keyClick(&view, key);
        EXPECT_EQ(1, RowCount(opened));
        EXPECT_TRUE(TestSupport::WaitFor(
            [&] { return ItemOf(RowOf(opened, "Alto"), "keyboardFocus").isVisible(); }));
        Click(opened, "buttonOk");

        EXPECT_TRUE(IsGone(dialog));
        EXPECT_EQ((VControlDevices{{"1", {true, "Alto"}}}), authorization->GetDevices());
    }
}

TEST_F(ManagementDialog, ForgetsOneDeviceForAKeyThatIsHeld)
{
    const VDialog& opened = Open();
    ItemOf(opened, "list").forceActiveFocus();
    QTest::keyPress(&TestSupport::ViewOf(opened), Qt::Key_Delete);

    QKeyEvent repeated(QEvent::KeyPress, Qt::Key_Delete, Qt::NoModifier, QString(), true);
    QCoreApplication::sendEvent(&TestSupport::ViewOf(opened), &repeated);

    EXPECT_EQ(1, RowCount(opened));
}

TEST_F(ManagementDialog, LeavesTheListWithItsLastRow)
{
    const VDialog& opened = Open();
    VQuickWidget& view = TestSupport::ViewOf(opened);
    ItemOf(opened, "list").forceActiveFocus();
    for (int i = 0; i < 3; ++i) {
        QTest::keyClick(&view, Qt::Key_Space);
    }

    EXPECT_EQ(0, RowCount(opened));
    EXPECT_TRUE(opened.isVisible());
    EXPECT_TRUE(ItemOf(opened, "resetButton").hasActiveFocus());
}

TEST_F(ManagementDialog, CutsANameThatNobodyWouldReadToItsEnd)
{
    const std::string name(1000, 'a');
    authorization->SetDevices({{"1", {true, name}}});
    const VDialog& opened = Open();

    const QQuickItem& label =
        ItemOf(RowOf(opened, QString::fromStdString(name).left(500)), "label");

    EXPECT_TRUE(label.clip());
    Click(opened, "buttonOk");
    EXPECT_EQ((VControlDevices{{"1", {true, name}}}), authorization->GetDevices());
}

TEST_F(ManagementDialog, IgnoresAClickOnARowThatIsOnItsWayOut)
{
    const VDialog& opened = Open();
    QQuickItem& alto = ItemOf(RowOf(opened, "Alto"), "forgetButton");

    Forget(opened, "Alto");
    Click(opened, alto);

    EXPECT_EQ(1, RowCount(opened));
}

TEST_F(ManagementDialog, HandsOverWhatItWasOpenedWithAtOk)
{
    const VDialog& opened = Open();
    authorization->SetDevices({{"3", {true, "Cello"}}});

    Click(opened, "buttonOk");

    EXPECT_EQ(twoDevices, authorization->GetDevices());
}

TEST_F(ManagementDialog, IsNotLeftByEscapeOrTheWindowManager)
{
    VDialog& opened = Open();

    QTest::keyClick(&opened, Qt::Key_Escape);
    QTest::keyClick(&TestSupport::ViewOf(opened), Qt::Key_Escape);
    QTest::keyClick(opened.windowHandle(), Qt::Key_Escape);
    QCloseEvent closing;
    QSpontaneKeyEvent::setSpontaneous(&closing);
    qApp->notify(&opened, &closing); // sendEvent would make it an event of the program

    EXPECT_FALSE(closing.isAccepted());
    EXPECT_TRUE(opened.isVisible());
}

TEST_F(ManagementDialog, ClosesThePanelThatItWasPutInto)
{
    QWidget panel;
    QVBoxLayout layout(&panel);
    auto* const inside = new VDialog(context, authorization, &panel);
    inside->setAttribute(Qt::WA_DeleteOnClose, false);
    panel.show();
    inside->show();

    Click(*inside, "buttonCancel");

    EXPECT_FALSE(panel.isVisible());
}

TEST_F(ManagementDialog, KeepsTheAuthorizationWhileItIsOpen)
{
    const std::weak_ptr<VQuorixControlAuthorization> kept = authorization;
    const VDialog& opened = Open();
    authorization.reset();
    EXPECT_FALSE(kept.expired());

    Click(opened, "buttonOk");

    EXPECT_TRUE(IsGone(dialog));
    EXPECT_TRUE(kept.expired());
}
