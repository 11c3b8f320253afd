#include "Dialogs/DialogsSupport.h"
#include "QuorixDataStore/DataWriter.h"
#include "QuorixPluginControlStreamServer/Authorization/QuorixControlAuthorizationDialog.h"
#include "QuorixPluginControlStreamServer/Authorization/QuorixControlAuthorizationGUI.h"
#include "support/LogCapture.h"

#include <QPointer>

#include <atomic>
#include <thread>

using TestSupport::Click;
using TestSupport::ItemOf;
using TestSupport::OnceAsked;

namespace {

class AuthorizationGUI : public TestSupport::VDialogs
{
protected:
    std::shared_ptr<VQuorixControlAuthorizationGUI> MakeGUI() const
    {
        return KVR::MakeShared<VQuorixControlAuthorizationGUI>(context, authorization, store,
                                                               nullptr);
    }

    VDataValue Remembered() const
    {
        return Preference(ControlPreferences::RememberControlChoices());
    }

    void SetRemembered(bool remember)
    {
        VDataWriter writer(*store);
        writer.SetValue(VDataToken(ControlPreferences::RememberControlChoices()),
                        MakeBoolValue(remember));
    }
};

} // namespace

TEST_F(AuthorizationGUI, CreatesThePreferenceOfTheCheckBox)
{
    const auto gui = MakeGUI();

    EXPECT_EQ(MakeBoolValue(true), Remembered());
    EXPECT_EQ((VDataPath{"Preferences", "User", "RememberControlChoices"}),
              ControlPreferences::RememberControlChoices());
}

TEST_F(AuthorizationGUI, LeavesThePreferenceThatIsThere)
{
    SetRemembered(false);

    const auto gui = MakeGUI();

    EXPECT_EQ(MakeBoolValue(false), Remembered());
}

TEST_F(AuthorizationGUI, AsksInTheNameOfTheDevice)
{
    const auto gui = MakeGUI();
    OnceAsked([](QDialog& dialog) {
        EXPECT_EQ(QString::fromUtf8("T\u00e2blet"), dialog.property("clientName"));
        EXPECT_EQ(QVariant(true), dialog.property("remember"));
        EXPECT_EQ(nullptr, dialog.parentWidget());
        Click(dialog, "buttonAllow");
    });

    EXPECT_EQ(EAskOutcome::AllowedAndRemembered, gui->Ask("id", "T\u00e2blet"));
}

TEST_F(AuthorizationGUI, OpensTheCheckBoxAsTheLastDialogLeftIt)
{
    const auto gui = MakeGUI();

    OnceAsked([](QDialog& dialog) {
        Click(dialog, "checkRemember");
        Click(dialog, "buttonDeny");
    });
    EXPECT_EQ(EAskOutcome::DeniedOnce, gui->Ask("1", "Tablet"));
    EXPECT_EQ(MakeBoolValue(false), Remembered());

    OnceAsked([](QDialog& dialog) {
        EXPECT_FALSE(ItemOf(dialog, "checkRemember").property("checked").toBool());
        Click(dialog, "buttonAllow");
    });
    EXPECT_EQ(EAskOutcome::AllowedOnce, gui->Ask("2", "Tablet"));
}

TEST_F(AuthorizationGUI, RemembersTheCheckBoxAlsoOfACancelledDialog)
{
    const auto gui = MakeGUI();
    OnceAsked([&gui](QDialog& dialog) {
        Click(dialog, "checkRemember");
        gui->Cancel("another id");
    });

    EXPECT_EQ(EAskOutcome::Cancelled, gui->Ask("id", "Tablet"));

    EXPECT_EQ(MakeBoolValue(false), Remembered());
}

TEST_F(AuthorizationGUI, CancelsFromAnotherThread)
{
    const auto gui = MakeGUI();
    OnceAsked([&gui](QDialog& /*dialog*/) { std::thread([&gui] { gui->Cancel("id"); }).join(); });

    EXPECT_EQ(EAskOutcome::Cancelled, gui->Ask("id", "Tablet"));
}

TEST_F(AuthorizationGUI, CancelsNothingBeforeAndAfterADialog)
{
    const auto gui = MakeGUI();
    gui->Cancel("id");
    OnceAsked([](QDialog& dialog) { Click(dialog, "buttonAllow"); });

    EXPECT_EQ(EAskOutcome::AllowedAndRemembered, gui->Ask("id", "Tablet"));

    gui->Cancel("id");
}

TEST_F(AuthorizationGUI, CancelsWithoutAPauseWhileDialogsComeAndGo)
{
    const auto gui = MakeGUI();
    std::atomic<bool> done{false};
    std::thread device([&] {
        while (!done) {
            gui->Cancel("id");
        }
    });

    for (int i = 0; i < 10; ++i) {
        EXPECT_EQ(EAskOutcome::Cancelled, gui->Ask("id", "Tablet"));
    }
    done = true;
    device.join();
}

TEST_F(AuthorizationGUI, CountsADialogThatIsTakenDownByTheHostAsCancelled)
{
    const auto gui = MakeGUI();
    OnceAsked([](QDialog& dialog) { dialog.done(0); });

    EXPECT_EQ(EAskOutcome::Cancelled, gui->Ask("id", "Tablet"));
}

TEST_F(AuthorizationGUI, SurvivesTheEndOfTheLoopWithoutAnAnswer)
{
    const auto gui = MakeGUI();
    QPointer<QDialog> asked;
    EAskOutcome outcome = EAskOutcome::AllowedOnce;
    QTimer::singleShot(0, qApp, [&] {
        outcome = gui->Ask("id", "Tablet");
        gui->Cancel("id"); // of a dialog that has gone
    });
    OnceAsked([&](QDialog& dialog) {
        asked = &dialog;
        Click(dialog, "checkRemember");
        QCoreApplication::quit();
    });

    QApplication::exec();

    EXPECT_EQ(EAskOutcome::Cancelled, outcome);
    EXPECT_TRUE(asked.isNull());
    EXPECT_EQ(MakeBoolValue(false), Remembered());
}

TEST_F(AuthorizationGUI, IsKnownToTheAuthorizationAndNotKeptByIt)
{
    std::weak_ptr<VQuorixControlAuthorizationGUI> gone;
    {
        const auto gui = MakeGUI();
        gone = gui;
        EXPECT_EQ(EAuthorizeAnswer::Pending, authorization->Authorize("id", "<b>Tablet</b>"));
        OnceAsked([](QDialog& dialog) {
            EXPECT_EQ("Tablet", dialog.property("clientName"));
            Click(dialog, "buttonAllow");
        });
        EXPECT_EQ(1U, posts->Deliver());
    }

    EXPECT_TRUE(gone.expired());
    EXPECT_EQ((VControlDevices{{"id", {true, "Tablet"}}}), authorization->GetDevices());
}

TEST_F(AuthorizationGUI, IsCancelledByTheDeviceThroughTheAuthorization)
{
    const auto gui = MakeGUI();
    authorization->Authorize("id", "Tablet");
    OnceAsked([this](QDialog& /*dialog*/) {
        std::thread([this] { authorization->CancelAuthorize("another id"); }).join();
    });

    posts->Deliver();

    EXPECT_FALSE(authorization->IsRequestPending());
    EXPECT_TRUE(authorization->GetDevices().empty());
}

TEST_F(AuthorizationGUI, AsksNobodyWithoutAQuickContext)
{
    const TestSupport::VLogCapture log;
    const auto gui =
        KVR::MakeShared<VQuorixControlAuthorizationGUI>(nullptr, authorization, store, nullptr);

    EXPECT_EQ(EAskOutcome::Cancelled, gui->Ask("id", "Tablet"));

    EXPECT_EQ(1U, log.Messages().size());
}

TEST_F(AuthorizationGUI, AsksWithoutAStore)
{
    const auto gui =
        KVR::MakeShared<VQuorixControlAuthorizationGUI>(context, nullptr, nullptr, nullptr);
    OnceAsked([](QDialog& dialog) { Click(dialog, "buttonDeny"); });

    EXPECT_EQ(EAskOutcome::DeniedAndRemembered, gui->Ask("id", "Tablet"));
}
