#pragma once

#include <QStyledItemDelegate>

#include <utility>
#include <vector>

namespace QuorixHost {

/// Edits a number by a list of names. Threads: [gui].
class VChoiceDelegate : public QStyledItemDelegate
{
    Q_OBJECT

public:
    using Choices = std::vector<std::pair<int, QString>>;

    explicit VChoiceDelegate(Choices choices, QObject* parent = nullptr);

    QWidget* createEditor(QWidget* parent, const QStyleOptionViewItem& option,
                          const QModelIndex& index) const override;
    void setEditorData(QWidget* editor, const QModelIndex& index) const override;
    void setModelData(QWidget* editor, QAbstractItemModel* model,
                      const QModelIndex& index) const override;

private:
    const Choices choices;
};

} // namespace QuorixHost
