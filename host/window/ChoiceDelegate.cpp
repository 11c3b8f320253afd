#include "window/ChoiceDelegate.h"

#include <QComboBox>

namespace QuorixHost {

VChoiceDelegate::VChoiceDelegate(Choices choices, QObject* parent)
    : QStyledItemDelegate(parent), choices(std::move(choices))
{
}

QWidget* VChoiceDelegate::createEditor(QWidget* parent, const QStyleOptionViewItem& /*option*/,
                                       const QModelIndex& /*index*/) const
{
    auto* const editor = new QComboBox(parent); // the view owns it
    for (const auto& [number, name] : choices) {
        editor->addItem(name, number);
    }
    // A choice from the list is the whole edit.
    connect(editor, QOverload<int>::of(&QComboBox::activated), this, [this, editor] {
        auto* const delegate = const_cast<VChoiceDelegate*>(this);
        emit delegate->commitData(editor);
        emit delegate->closeEditor(editor);
    });
    return editor;
}

void VChoiceDelegate::setEditorData(QWidget* editor, const QModelIndex& index) const
{
    auto* const box = static_cast<QComboBox*>(editor);
    box->setCurrentIndex(box->findData(index.data(Qt::EditRole)));
}

void VChoiceDelegate::setModelData(QWidget* editor, QAbstractItemModel* model,
                                   const QModelIndex& index) const
{
    const QVariant chosen = static_cast<QComboBox*>(editor)->currentData();
    if (chosen.isValid()) { // nothing is, where the number is none of the choices
        model->setData(index, chosen, Qt::EditRole);
    }
}

} // namespace QuorixHost
