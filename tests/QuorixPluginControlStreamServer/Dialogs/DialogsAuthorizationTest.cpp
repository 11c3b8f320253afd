#include "Dialogs/DialogsSupport.h"
#include "QuorixPluginControlStreamServer/Authorization/QuorixControlAuthorizationDialog.h"

#include "DPI/DPIUtils.h"

#include <QMetaMethod>
#include <QPointer>
#include <QSignalSpy>
#include <QTest>
#include <QVBoxLayout>
#include <QWindow>
#include <QtTest/qtestspontaneevent.h>

#include <thread>

using TestSupport::Click;
using TestSupport::ItemOf;
using TestSupport::OnceAsked;

namespace {

using VDialog = VQuorixControlAuthorizationDialog;

class AuthorizationDialog : public TestSupport::VDialogs
{
protected:
    /// Makes a dialog as it is made for a question; it is deleted when it closes.
    VDialog* Make(const QString& name = "Tablet", bool remember = true) const
    {
        return new VDialog(context, name, remember);
    }

    /// Makes a dialog, lets the operator do something with it and returns how it ended.
    int Ask(bool remember, std::function<void(QDialog&)> operatorsDoing) const
    {
        OnceAsked(std::move(operatorsDoing));
        return Make("Tablet", remember)->exec();
    }
};

/// Sends an event as the window system would.
void SendSpontaneously(QWidget& widget, QEvent& event)
{
    QSpontaneKeyEvent::setSpontaneous(&event);
    qApp->notify(&widget, &event); // sendEvent would make it an event of the program
}

void ExpectStaysOpen(QDialog& dialog)
{
    const QSignalSpy finished(&dialog, &QDialog::finished);

    QTest::keyClick(&dialog, Qt::Key_Escape);
    QTest::keyClick(&TestSupport::ViewOf(dialog), Qt::Key_Escape);
    QTest::keyClick(dialog.windowHandle(), Qt::Key_Escape);
    QCloseEvent closing;
    SendSpontaneously(dialog, closing);
    dialog.close();
    dialog.reject();

    EXPECT_FALSE(closing.isAccepted());
    EXPECT_TRUE(dialog.isVisible());
    EXPECT_EQ(0, finished.count());
}

} // namespace

TEST_F(AuthorizationDialog, HasItsTitleAndNoWayOutInTheTitleBar)
{
    const std::unique_ptr<VDialog> dialog(Make());

    EXPECT_EQ("Korva Control", dialog->windowTitle());
    EXPECT_TRUE(dialog->isModal());
    EXPECT_TRUE(dialog->testAttribute(Qt::WA_DeleteOnClose));
    const Qt::WindowFlags flags = dialog->windowFlags();
    EXPECT_TRUE(flags.testFlag(Qt::WindowTitleHint));
    EXPECT_TRUE(flags.testFlag(Qt::WindowSystemMenuHint));
    EXPECT_TRUE(flags.testFlag(Qt::CustomizeWindowHint));
    EXPECT_FALSE(flags.testFlag(Qt::WindowCloseButtonHint));
    EXPECT_FALSE(flags.testFlag(Qt::WindowContextHelpButtonHint));
}

TEST_F(AuthorizationDialog, IsAtLeastSoLarge)
{
    const std::unique_ptr<VDialog> dialog(Make());

    EXPECT_EQ(QSize(DPIUtils::Scale(450), DPIUtils::Scale(150)), dialog->minimumSize());
}

TEST_F(AuthorizationDialog, IsFilledByItsView)
{
    const std::unique_ptr<VDialog> dialog(Make());
    const auto* const layout = qobject_cast<QVBoxLayout*>(dialog->layout());
    const VQuickWidget& view = TestSupport::ViewOf(*dialog);

    ASSERT_NE(nullptr, layout);
    EXPECT_EQ(QMargins(), layout->contentsMargins());
    EXPECT_EQ(0, layout->spacing());
    EXPECT_EQ(0, layout->indexOf(const_cast<VQuickWidget*>(&view)));
    EXPECT_EQ(QQuickWidget::SizeRootObjectToView, view.resizeMode());
    EXPECT_EQ("AuthorizationDialog.qml", view.objectName());
    EXPECT_EQ(QUrl("qrc:/AuthorizationDialog.qml"), view.source());
}

TEST_F(AuthorizationDialog, ShowsItselfToQmlAsItIs)
{
    const QMetaObject& meta = VDialog::staticMetaObject;
    std::vector<std::string> methods;
    for (int i = meta.methodOffset(); i < meta.methodCount(); ++i) {
        methods.push_back(meta.method(i).methodSignature().toStdString());
    }

    EXPECT_EQ((std::vector<std::string>{"Cancel()", "rememberChanged(bool)", "OnAllow()",
                                        "OnDeny()", "OnCancel()"}),
              methods);
    EXPECT_EQ(QMetaMethod::Signal, meta.method(meta.methodOffset()).methodType());
    EXPECT_EQ(QMetaMethod::Signal, meta.method(meta.methodOffset() + 1).methodType());
    const QMetaProperty clientName = meta.property(meta.indexOfProperty("clientName"));
    EXPECT_FALSE(clientName.isWritable());
    const QMetaProperty remember = meta.property(meta.indexOfProperty("remember"));
    EXPECT_TRUE(remember.isWritable());
    EXPECT_EQ("rememberChanged", remember.notifySignal().name());
}

TEST_F(AuthorizationDialog, AsksInTheseWords)
{
    const std::unique_ptr<VDialog> dialog(Make("Tablet"));

    EXPECT_EQ("Control on 'Tablet' is requesting a connection.",
              ItemOf(*dialog, "label").property("text"));
    EXPECT_EQ("Remember this choice for future connection attempts.",
              ItemOf(*dialog, "checkRemember").property("text"));
    EXPECT_EQ("Allow", ItemOf(*dialog, "buttonAllow").property("text"));
    EXPECT_EQ("Deny", ItemOf(*dialog, "buttonDeny").property("text"));
}

TEST_F(AuthorizationDialog, RendersNoMarkupInAName)
{
    const std::unique_ptr<VDialog> dialog(Make("<b>Tablet</b> <img src='file:///x.png'>"));

    const QQuickItem& label = ItemOf(*dialog, "label");

    EXPECT_EQ(0, label.property("textFormat").toInt()); // plain
    EXPECT_EQ("Control on '<b>Tablet</b> <img src='file:///x.png'>' is requesting a connection.",
              label.property("text"));
}

TEST_F(AuthorizationDialog, CutsANameThatNobodyWouldReadToItsEnd)
{
    const QString name(1000, 'a');
    const std::unique_ptr<VDialog> dialog(Make(name));

    const QQuickItem& label = ItemOf(*dialog, "label");

    EXPECT_EQ("Control on '" + name.left(500) + "' is requesting a connection.",
              label.property("text").toString());
    EXPECT_TRUE(label.clip());
    EXPECT_EQ(name, dialog->property("clientName").toString());
}

TEST_F(AuthorizationDialog, OpensItsCheckBoxAsItIsTold)
{
    const std::unique_ptr<VDialog> ticked(Make("Tablet", true));
    const std::unique_ptr<VDialog> unticked(Make("Tablet", false));

    EXPECT_TRUE(ItemOf(*ticked, "checkRemember").property("checked").toBool());
    EXPECT_FALSE(ItemOf(*unticked, "checkRemember").property("checked").toBool());
}

TEST_F(AuthorizationDialog, TellsOfTheFlagOnlyWhenItChanges)
{
    const std::unique_ptr<VDialog> dialog(Make("Tablet", true));
    const QSignalSpy changed(dialog.get(), &VDialog::rememberChanged);

    dialog->setProperty("remember", true);
    EXPECT_EQ(0, changed.count());
    dialog->setProperty("remember", false);

    ASSERT_EQ(1, changed.count());
    EXPECT_EQ(QVariant(false), changed[0][0]);
}

TEST_F(AuthorizationDialog, EndsWithTheCodeOfItsButtonAndCheckBox)
{
    EXPECT_EQ(1, Ask(false, [](QDialog& dialog) { Click(dialog, "buttonAllow"); }));
    EXPECT_EQ(2, Ask(false, [](QDialog& dialog) { Click(dialog, "buttonDeny"); }));
    EXPECT_EQ(3, Ask(true, [](QDialog& dialog) { Click(dialog, "buttonAllow"); }));
    EXPECT_EQ(4, Ask(true, [](QDialog& dialog) { Click(dialog, "buttonDeny"); }));
}

TEST_F(AuthorizationDialog, TakesEachClickOnTheCheckBox)
{
    EXPECT_EQ(3, Ask(false, [](QDialog& dialog) {
                  Click(dialog, "checkRemember");
                  EXPECT_TRUE(dialog.property("remember").toBool());
                  Click(dialog, "buttonAllow");
              }));
    EXPECT_EQ(2, Ask(true, [](QDialog& dialog) {
                  Click(dialog, "checkRemember");
                  EXPECT_FALSE(dialog.property("remember").toBool());
                  Click(dialog, "buttonDeny");
              }));
}

TEST_F(AuthorizationDialog, EndsWithNothingWhenItIsCancelled)
{
    for (const bool remember : {false, true}) {
        EXPECT_EQ(
            0, Ask(remember, [](QDialog& dialog) { emit static_cast<VDialog&>(dialog).Cancel(); }));
    }
}

TEST_F(AuthorizationDialog, IsCancelledFromAnotherThread)
{
    EXPECT_EQ(0, Ask(true, [](QDialog& dialog) {
                  std::thread([&dialog] { emit static_cast<VDialog&>(dialog).Cancel(); }).join();
                  EXPECT_TRUE(dialog.isVisible()); // until its loop turns
              }));
}

TEST_F(AuthorizationDialog, IsOnlyLeftByItsOwnButtons)
{
    EXPECT_EQ(1, Ask(false, [](QDialog& dialog) {
                  ExpectStaysOpen(dialog);
                  Click(dialog, "buttonAllow");
              }));
}

TEST_F(AuthorizationDialog, IsAnsweredByTheKeyboardToo)
{
    EXPECT_EQ(4, Ask(false, [](QDialog& dialog) {
                  VQuickWidget& view = TestSupport::ViewOf(dialog);
                  ItemOf(dialog, "checkRemember").forceActiveFocus();
                  QTest::keyClick(&view, Qt::Key_Space);
                  ItemOf(dialog, "buttonDeny").forceActiveFocus();
                  QTest::keyClick(&view, Qt::Key_Space);
              }));
    EXPECT_EQ(1, Ask(false, [](QDialog& dialog) {
                  ItemOf(dialog, "buttonAllow").forceActiveFocus();
                  QTest::keyClick(&TestSupport::ViewOf(dialog), Qt::Key_Return);
              }));
}

TEST_F(AuthorizationDialog, TakesNoKeyForAnAnswerBeforeAButtonHasTheFocus)
{
    EXPECT_EQ(2, Ask(false, [](QDialog& dialog) {
                  const QSignalSpy finished(&dialog, &QDialog::finished);
                  for (const Qt::Key key : {Qt::Key_Space, Qt::Key_Return, Qt::Key_Enter}) {
                      QTest::keyClick(&TestSupport::ViewOf(dialog), key);
                      QTest::keyClick(&dialog, key);
                  }
                  EXPECT_EQ(0, finished.count());
                  Click(dialog, "buttonDeny");
              }));
}

TEST_F(AuthorizationDialog, IsGoneWhenItHasEnded)
{
    QPointer<VDialog> dialog = Make();
    OnceAsked([](QDialog& asked) { Click(asked, "buttonAllow"); });

    dialog->exec();

    EXPECT_TRUE(dialog.isNull());
}

TEST_F(AuthorizationDialog, TellsOfItsEndAlsoWhenItIsDeletedOpen)
{
    VDialog* const dialog = Make();
    int outcome = -1;
    QObject::connect(dialog, &QDialog::finished, [&outcome](int code) { outcome = code; });
    TestSupport::Show(*dialog);

    delete dialog;

    EXPECT_EQ(0, outcome);
}
