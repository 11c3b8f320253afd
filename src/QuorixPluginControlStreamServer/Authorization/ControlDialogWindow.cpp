#include "QuorixPluginControlStreamServer/Authorization/ControlDialogWindow.h"

#include "DPI/DPIUtils.h"
#include "QtQuickView/QuickWidget.h"

#include <QDialog>
#include <QVBoxLayout>

// In no namespace, and be it an unnamed one: the macro declares a global function.
static void InitialiseControlDialogs()
{
    Q_INIT_RESOURCE(ControlDialogs);
}

namespace ControlDialogWindow {

void SetUp(QDialog& dialog, int minimumWidth, int minimumHeight)
{
    dialog.setWindowTitle("Korva Control");
    dialog.setAttribute(Qt::WA_DeleteOnClose);
    dialog.setModal(true);

    Qt::WindowFlags flags = dialog.windowFlags() | Qt::CustomizeWindowHint;
    flags &= ~(Qt::WindowContextHelpButtonHint | Qt::WindowCloseButtonHint);
    dialog.setWindowFlags(flags);

    dialog.setMinimumSize(DPIUtils::Scale(minimumWidth), DPIUtils::Scale(minimumHeight));
}

void Fill(QDialog& dialog, VQuickWidget& view)
{
    view.setResizeMode(QQuickWidget::SizeRootObjectToView);

    auto* const layout = new QVBoxLayout(&dialog); // owned by the dialog
    layout->setContentsMargins(0, 0, 0, 0);
    layout->setSpacing(0);
    layout->addWidget(&view);
}

void InitialiseResources()
{
    InitialiseControlDialogs();
}

} // namespace ControlDialogWindow
