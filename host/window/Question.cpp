#include "window/Question.h"

#include <QApplication>
#include <QDialog>
#include <QMouseEvent>
#include <QPointer>
#include <QQuickItem>
#include <QQuickWidget>

#include <algorithm>
#include <vector>

namespace QuorixHost {
namespace {

void SendMouse(QWidget& widget, QEvent::Type type, const QPoint& place, Qt::MouseButtons held)
{
    QMouseEvent event(type, place, widget.mapToGlobal(place), Qt::LeftButton, held, {});
    QApplication::sendEvent(&widget, &event);
}

} // namespace

bool IsQuestion(const QDialog& dialog)
{
    const QMetaObject& meta = *dialog.metaObject();
    return meta.indexOfProperty("clientName") >= 0 && meta.indexOfProperty("remember") >= 0;
}

QDialog* FindQuestion()
{
    for (QWidget* const widget : QApplication::topLevelWidgets()) {
        auto* const dialog = qobject_cast<QDialog*>(widget);
        if (dialog != nullptr && dialog->isVisible() && IsQuestion(*dialog)) {
            return dialog;
        }
    }
    return nullptr;
}

bool PressItem(QDialog& dialog, const QString& name)
{
    const QPointer<QQuickWidget> view = dialog.findChild<QQuickWidget*>();
    if (view == nullptr || view->rootObject() == nullptr) {
        return false;
    }
    auto* const item = view->rootObject()->findChild<QQuickItem*>(name);
    if (item == nullptr || !item->isVisible() || !item->isEnabled()) {
        return false;
    }
    const QPointF centre(item->width() / 2, item->height() / 2);
    const QPoint place = item->mapToScene(centre).toPoint();
    SendMouse(*view, QEvent::MouseButtonPress, place, Qt::LeftButton);
    if (view != nullptr) {
        SendMouse(*view, QEvent::MouseButtonRelease, place, Qt::NoButton);
    }
    return true;
}

void EndOpenDialogs()
{
    std::vector<QPointer<QDialog>> dialogs;
    for (QWidget* const widget : QApplication::topLevelWidgets()) {
        auto* const dialog = qobject_cast<QDialog*>(widget);
        if (dialog != nullptr && dialog->isVisible()) {
            dialogs.emplace_back(dialog);
        }
    }
    for (const QPointer<QDialog>& dialog : dialogs) {
        if (dialog != nullptr) { // one of them may take another with it
            dialog->done(QDialog::Rejected);
        }
    }
}

} // namespace QuorixHost
