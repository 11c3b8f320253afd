#include "QuorixPluginControlStreamServer/Authorization/QuorixControlAuthorizationDialog.h"

#include "QtQuickView/QuickWidget.h"
#include "QtQuickView/QuickWidgetManager.h"
#include "QuorixPluginControlStreamServer/Authorization/ControlDialogWindow.h"
#include "QuorixPluginControlStreamServer/Authorization/IQuorixControlAuthorizationGUI.h"

#include <QCloseEvent>
#include <QQmlContext>

namespace {

constexpr int leastWidth = 450;
constexpr int leastHeight = 150;

} // namespace

VQuorixControlAuthorizationDialog::VQuorixControlAuthorizationDialog(
    const std::shared_ptr<VQuickWidgetManager>& manager, const QString& clientName, bool remember,
    QWidget* parent)
    : QDialog(parent, Qt::WindowFlags(ControlDialogWindow::constructionFlags)),
      clientName(clientName),
      remember(remember)
{
    ControlDialogWindow::InitialiseResources();
    ControlDialogWindow::SetUp(*this, leastWidth, leastHeight);

    view = std::make_unique<VQuickWidget>(manager);
    view->QmlContext().setContextProperty("authorizationDialog", this);
    view->SetSource(manager->SourceFolder(), "AuthorizationDialog.qml");
    ControlDialogWindow::Fill(*this, *view);

    connect(this, &VQuorixControlAuthorizationDialog::Cancel, this,
            &VQuorixControlAuthorizationDialog::OnCancel);
}

VQuorixControlAuthorizationDialog::~VQuorixControlAuthorizationDialog()
{
    // Its loop was ended from outside, as when the application quits: whoever waits for the answer
    // hears of the end while the dialog is still whole.
    if (isVisible()) {
        QDialog::done(static_cast<int>(EAskOutcome::Cancelled));
    }
}

void VQuorixControlAuthorizationDialog::SetRemember(bool value)
{
    if (remember != value) {
        remember = value;
        emit rememberChanged(remember);
    }
}

void VQuorixControlAuthorizationDialog::reject() {}

void VQuorixControlAuthorizationDialog::OnAllow()
{
    done(static_cast<int>(remember ? EAskOutcome::AllowedAndRemembered : EAskOutcome::AllowedOnce));
}

void VQuorixControlAuthorizationDialog::OnDeny()
{
    done(static_cast<int>(remember ? EAskOutcome::DeniedAndRemembered : EAskOutcome::DeniedOnce));
}

void VQuorixControlAuthorizationDialog::OnCancel()
{
    done(static_cast<int>(EAskOutcome::Cancelled));
}

void VQuorixControlAuthorizationDialog::closeEvent(QCloseEvent* event)
{
    // Neither the window manager (a spontaneous event) nor close(), which comes to reject().
    event->ignore();
}
