#include "QuorixPluginControlStreamServer/Authorization/QuorixControlManagementDialog.h"

#include "QtQuickView/QuickWidget.h"
#include "QtQuickView/QuickWidgetManager.h"
#include "QuorixPluginControlStreamServer/Authorization/ControlDialogWindow.h"
#include "QuorixPluginControlStreamServer/Authorization/QuorixControlAuthorization.h"
#include "QuorixPluginControlStreamServer/Authorization/QuorixManagementModel.h"

#include <QCloseEvent>
#include <QKeyEvent>
#include <QQmlContext>

#include <utility>

namespace {

constexpr int leastWidth = 350;
constexpr int leastHeight = 350;

} // namespace

VQuorixControlManagementDialog::VQuorixControlManagementDialog(
    const std::shared_ptr<VQuickWidgetManager>& manager,
    std::shared_ptr<VQuorixControlAuthorization> authorization, QWidget* parent)
    : QDialog(parent, Qt::WindowFlags(ControlDialogWindow::constructionFlags)),
      model(std::make_shared<VQuorixManagementModel>(authorization->GetDevices())),
      authorization(std::move(authorization))
{
    ControlDialogWindow::InitialiseResources();
    ControlDialogWindow::SetUp(*this, leastWidth, leastHeight);

    view = std::make_unique<VQuickWidget>(manager);
    view->QmlContext().setContextProperty("managementDialog", this);
    view->QmlContext().setContextProperty("managementModel", model.get());
    view->SetSource(manager->SourceFolder(), "ManagementDialog.qml");
    ControlDialogWindow::Fill(*this, *view);
}

VQuorixControlManagementDialog::~VQuorixControlManagementDialog() = default;

void VQuorixControlManagementDialog::OnOk()
{
    authorization->SetDevices(model->GetDevices());
    OnClose();
}

void VQuorixControlManagementDialog::OnClose()
{
    // A host may show the dialog inside a panel of its own, which then goes as a whole.
    QWidget* const shown = parentWidget() != nullptr ? parentWidget() : this;
    shown->close();
}

void VQuorixControlManagementDialog::keyPressEvent(QKeyEvent* event)
{
    if (event->matches(QKeySequence::Cancel)) {
        return; // taken, and nothing done
    }
    QDialog::keyPressEvent(event);
}

void VQuorixControlManagementDialog::closeEvent(QCloseEvent* event)
{
    if (event->spontaneous()) {
        event->ignore();
        return;
    }
    QDialog::closeEvent(event);
}
