#pragma once

#include <QDialog>
#include <QString>

#include <memory>

class VQuickWidget;
class VQuickWidgetManager;

/// Puts one device's request before the operator.
///
/// It is left by its own buttons and by Cancel, with one of the codes 0 to 4 as its result; neither
/// Escape nor the window manager closes it. Owns: its view. Threads: [gui], but for the emission of
/// Cancel, [any]. Failure: a view that does not load stays empty, and Cancel is the way out.
class VQuorixControlAuthorizationDialog : public QDialog
{
    Q_OBJECT
    Q_PROPERTY(QString clientName READ ClientName CONSTANT)
    Q_PROPERTY(bool remember READ Remember WRITE SetRemember NOTIFY rememberChanged)

public:
    /// @param clientName  plain text
    /// @param remember    how the check box stands at first
    VQuorixControlAuthorizationDialog(const std::shared_ptr<VQuickWidgetManager>& manager,
                                      const QString& clientName, bool remember,
                                      QWidget* parent = nullptr);
    ~VQuorixControlAuthorizationDialog() override;

    QString ClientName() const { return clientName; }
    bool Remember() const { return remember; }
    void SetRemember(bool value);

    /// Does nothing: Escape comes this way.
    void reject() override;

signals:
    void Cancel();
    void rememberChanged(bool remember);

public slots:
    void OnAllow();
    void OnDeny();
    void OnCancel();

protected:
    void closeEvent(QCloseEvent* event) override;

private:
    const QString clientName;
    bool remember;
    std::unique_ptr<VQuickWidget> view; // its QML looks at the two above
};
