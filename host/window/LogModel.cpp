#include "window/LogModel.h"

#include "window/ShownText.h"

#include <QColor>
#include <QDateTime>

#include <algorithm>

namespace QuorixHost {
namespace {

const char* const lineTitles[VLogModel::ColumnCount] = {"Time", "Level", "Category", "Text"};
const char* const levelTitles[VLogLevelModel::ColumnCount] = {"Category", "Level"};

constexpr int errorLevel = 2;
constexpr int warningLevel = 3;

QVariant Title(const char* const* titles, int count, int section, Qt::Orientation orientation,
               int role)
{
    const bool isTitle =
        orientation == Qt::Horizontal && role == Qt::DisplayRole && section >= 0 && section < count;
    return isTitle ? QVariant(QString(titles[section])) : QVariant();
}

/// Returns a colour that can be read on light and on dark.
QVariant ColourOfLevel(int level)
{
    if (level <= errorLevel) {
        return QColor(0xd6, 0x45, 0x41);
    }
    return level == warningLevel ? QVariant(QColor(0xc0, 0x7f, 0x12)) : QVariant();
}

QVariant TextOfLine(const VLogLine& line, int column)
{
    switch (column) {
    case VLogModel::ColumnTime:
        return QDateTime::fromMSecsSinceEpoch(line.Time).toString("HH:mm:ss.zzz");
    case VLogModel::ColumnLevel:
        return LogLevelName(line.Level);
    case VLogModel::ColumnCategory:
        return QString::fromStdString(line.Category);
    case VLogModel::ColumnText:
        return ShownLine(QString::fromStdString(line.Text));
    default:
        return QVariant();
    }
}

} // namespace

std::vector<std::pair<int, QString>> LogLevels()
{
    return {{2, "errors"}, {3, "warnings"}, {4, "information"}, {6, "tracing"}};
}

QString LogLevelName(int level)
{
    for (const auto& [number, name] : LogLevels()) {
        if (number == level) {
            return name;
        }
    }
    return QString::number(level);
}

VLogModel::VLogModel(VWindowLog& log, QObject* parent)
    : QAbstractTableModel(parent), log(log), signal([this] { Refresh(); })
{
    log.SetListener(signal.Waker());
    Refresh();
}

VLogModel::~VLogModel()
{
    log.SetListener(boost::function<void()>());
}

int VLogModel::rowCount(const QModelIndex& parent) const
{
    return parent.isValid() ? 0 : static_cast<int>(lines.size());
}

int VLogModel::columnCount(const QModelIndex& parent) const
{
    return parent.isValid() ? 0 : ColumnCount;
}

QVariant VLogModel::headerData(int section, Qt::Orientation orientation, int role) const
{
    return Title(lineTitles, ColumnCount, section, orientation, role);
}

QVariant VLogModel::data(const QModelIndex& index, int role) const
{
    if (!index.isValid() || index.row() >= rowCount()) {
        return QVariant();
    }
    const VLogLine& line = lines[static_cast<std::size_t>(index.row())];
    if (role == Qt::ForegroundRole) {
        return ColourOfLevel(line.Level);
    }
    return role == Qt::DisplayRole ? TextOfLine(line, index.column()) : QVariant();
}

void VLogModel::Refresh()
{
    const std::deque<VLogLine> added = log.TakeLines();
    if (added.empty()) {
        return;
    }
    const auto first = static_cast<int>(lines.size());
    beginInsertRows(QModelIndex(), first, first + static_cast<int>(added.size()) - 1);
    lines.insert(lines.end(), added.begin(), added.end());
    endInsertRows();

    if (lines.size() > VWindowLog::mostLines) {
        const auto surplus = static_cast<int>(lines.size() - VWindowLog::mostLines);
        beginRemoveRows(QModelIndex(), 0, surplus - 1);
        lines.erase(lines.begin(), lines.begin() + surplus);
        endRemoveRows();
    }
}

VLogLevelModel::VLogLevelModel(VWindowLog& log, QObject* parent)
    : QAbstractTableModel(parent), log(log)
{
    Refresh();
}

int VLogLevelModel::rowCount(const QModelIndex& parent) const
{
    return parent.isValid() ? 0 : static_cast<int>(categories.size());
}

int VLogLevelModel::columnCount(const QModelIndex& parent) const
{
    return parent.isValid() ? 0 : ColumnCount;
}

QVariant VLogLevelModel::headerData(int section, Qt::Orientation orientation, int role) const
{
    return Title(levelTitles, ColumnCount, section, orientation, role);
}

QVariant VLogLevelModel::data(const QModelIndex& index, int role) const
{
    if (!index.isValid() || index.row() >= rowCount()) {
        return QVariant();
    }
    const std::string& category = categories[static_cast<std::size_t>(index.row())];
    if (index.column() == ColumnCategory) {
        return role == Qt::DisplayRole ? QString::fromStdString(category) : QVariant();
    }
    const int level = log.GetCategory(category)->GetLevel();
    if (role == Qt::EditRole) {
        return level;
    }
    return role == Qt::DisplayRole ? QVariant(LogLevelName(level)) : QVariant();
}

Qt::ItemFlags VLogLevelModel::flags(const QModelIndex& index) const
{
    const Qt::ItemFlags itemFlags = QAbstractTableModel::flags(index);
    return index.column() == ColumnLevel ? itemFlags | Qt::ItemIsEditable : itemFlags;
}

bool VLogLevelModel::setData(const QModelIndex& index, const QVariant& value, int role)
{
    bool isNumber = false;
    const int level = value.toInt(&isNumber);
    if (!index.isValid() || index.row() >= rowCount() || role != Qt::EditRole ||
        index.column() != ColumnLevel || !isNumber) {
        return false;
    }
    DebugServices::SetLogLevel(categories[static_cast<std::size_t>(index.row())], level);
    emit dataChanged(index, index);
    return true;
}

void VLogLevelModel::Refresh()
{
    for (const std::string& name : log.CategoryNames()) {
        const auto place = std::lower_bound(categories.begin(), categories.end(), name);
        if (place == categories.end() || *place != name) {
            const auto row = static_cast<int>(place - categories.begin());
            beginInsertRows(QModelIndex(), row, row);
            categories.insert(place, name);
            endInsertRows();
        }
    }
}

} // namespace QuorixHost
