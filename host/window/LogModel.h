#pragma once

#include "window/GuiSignal.h"
#include "window/WindowLog.h"

#include <QAbstractTableModel>

#include <deque>
#include <string>
#include <vector>

namespace QuorixHost {

/// The youngest lines of the process's log. Threads: [gui].
class VLogModel : public QAbstractTableModel
{
    Q_OBJECT

public:
    enum EColumn { ColumnTime, ColumnLevel, ColumnCategory, ColumnText, ColumnCount };

    explicit VLogModel(VWindowLog& log, QObject* parent = nullptr);
    ~VLogModel() override;

    int rowCount(const QModelIndex& parent = QModelIndex()) const override;
    int columnCount(const QModelIndex& parent = QModelIndex()) const override;
    QVariant headerData(int section, Qt::Orientation orientation, int role) const override;
    QVariant data(const QModelIndex& index, int role) const override;

    /// Takes over what the log has got since.
    void Refresh();

private:
    VWindowLog& log; // never destroyed
    std::deque<VLogLine> lines;
    const VGuiSignal signal;
};

/// The categories of the log with the level that each admits, which can be edited: a line of
/// another level is not even made. Threads: [gui].
class VLogLevelModel : public QAbstractTableModel
{
    Q_OBJECT

public:
    enum EColumn { ColumnCategory, ColumnLevel, ColumnCount };

    explicit VLogLevelModel(VWindowLog& log, QObject* parent = nullptr);

    int rowCount(const QModelIndex& parent = QModelIndex()) const override;
    int columnCount(const QModelIndex& parent = QModelIndex()) const override;
    QVariant headerData(int section, Qt::Orientation orientation, int role) const override;
    QVariant data(const QModelIndex& index, int role) const override;
    Qt::ItemFlags flags(const QModelIndex& index) const override;
    bool setData(const QModelIndex& index, const QVariant& value, int role) override;

    /// Takes over the categories that have come since.
    void Refresh();

private:
    VWindowLog& log; // never destroyed
    std::vector<std::string> categories;
};

/// Returns the levels in use with their names.
std::vector<std::pair<int, QString>> LogLevels();

/// Returns the name of a level; a number without one stands for itself.
QString LogLevelName(int level);

} // namespace QuorixHost
