#pragma once

#include <QDialog>

#include <memory>

class VQuickWidget;
class VQuickWidgetManager;
class VQuorixControlAuthorization;
class VQuorixManagementModel;

/// Lets the operator review the known devices; what he removes takes effect at "Ok".
///
/// Owns: its view; shares the model with it, and keeps the authorization alive while it is open.
/// Threads: [gui]. Failure: a view that does not load stays empty.
class VQuorixControlManagementDialog : public QDialog
{
    Q_OBJECT

public:
    /// Takes the devices that are known now.
    VQuorixControlManagementDialog(const std::shared_ptr<VQuickWidgetManager>& manager,
                                   std::shared_ptr<VQuorixControlAuthorization> authorization,
                                   QWidget* parent = nullptr);
    ~VQuorixControlManagementDialog() override;

public slots:
    /// Hands over what is left of the devices, and closes.
    void OnOk();

    /// Closes and changes nothing.
    void OnClose();

protected:
    /// Ignores Escape: the dialog is left by its own buttons.
    void keyPressEvent(QKeyEvent* event) override;

    /// Ignores the window manager.
    void closeEvent(QCloseEvent* event) override;

private:
    const std::shared_ptr<VQuorixManagementModel> model;
    const std::shared_ptr<VQuorixControlAuthorization> authorization;
    std::unique_ptr<VQuickWidget> view; // its QML looks at the model
};
