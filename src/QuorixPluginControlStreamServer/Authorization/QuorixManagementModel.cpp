#include "QuorixPluginControlStreamServer/Authorization/QuorixManagementModel.h"

#include <algorithm>
#include <cstdint>

VQuorixManagementModel::VQuorixManagementModel(const VControlDevices& devices, QObject* parent)
    : QAbstractItemModel(parent)
{
    for (const auto& [id, record] : devices) {
        rows.push_back({id, record.Allowed, record.Name});
    }
    // Stable, so that devices of one name stay in the order of their ids.
    std::stable_sort(rows.begin(), rows.end(), [](const VRow& left, const VRow& right) {
        return QString::compare(QString::fromStdString(left.Name),
                                QString::fromStdString(right.Name), Qt::CaseInsensitive) < 0;
    });
}

VControlDevices VQuorixManagementModel::GetDevices() const
{
    VControlDevices devices;
    for (const VRow& row : rows) {
        devices[row.Id] = {row.Authorised, row.Name};
    }
    return devices;
}

QModelIndex VQuorixManagementModel::index(int row, int column, const QModelIndex& parent) const
{
    return hasIndex(row, column, parent) ? createIndex(row, column) : QModelIndex();
}

QModelIndex VQuorixManagementModel::parent(const QModelIndex& /*child*/) const
{
    return QModelIndex();
}

int VQuorixManagementModel::rowCount(const QModelIndex& parent) const
{
    return parent.isValid() ? 0 : static_cast<int>(rows.size());
}

int VQuorixManagementModel::columnCount(const QModelIndex& /*parent*/) const
{
    return 3;
}

QVariant VQuorixManagementModel::data(const QModelIndex& index, int role) const
{
    if (!HasRow(index)) {
        return QVariant();
    }
    const VRow& row = rows[static_cast<std::size_t>(index.row())];
    switch (role) {
    case RoleId:
        return QString::fromStdString(row.Id);
    case RoleName:
        return QString::fromStdString(row.Name);
    case RoleAuthorised:
        return row.Authorised;
    default:
        return QVariant();
    }
}

QHash<int, QByteArray> VQuorixManagementModel::roleNames() const
{
    return {{RoleId, "itemId"}, {RoleName, "itemName"}, {RoleAuthorised, "itemAuthorised"}};
}

bool VQuorixManagementModel::setData(const QModelIndex& index, const QVariant& value, int role)
{
    if (role == RoleAuthorised && HasRow(index)) {
        VRow& row = rows[static_cast<std::size_t>(index.row())];
        if (row.Authorised != value.toBool()) {
            row.Authorised = value.toBool();
            emit dataChanged(index, index, {RoleAuthorised});
        }
    }
    // Deliberate: false also after a change, as the views have always had it.
    return false;
}

bool VQuorixManagementModel::removeRows(int row, int count, const QModelIndex& parent)
{
    const std::int64_t end = std::int64_t{row} + count;
    if (!parent.isValid() && row >= 0 && count > 0 && end <= rowCount()) {
        beginRemoveRows(parent, row, static_cast<int>(end) - 1);
        rows.erase(rows.begin() + row, rows.begin() + end);
        endRemoveRows();
    }
    // Deliberate: false also after a removal, as in setData.
    return false;
}

void VQuorixManagementModel::forgetEverthing()
{
    removeRows(0, rowCount());
}

void VQuorixManagementModel::forgetItem(int index)
{
    removeRows(index, 1);
}

bool VQuorixManagementModel::HasRow(const QModelIndex& index) const
{
    return index.isValid() && index.row() >= 0 && index.row() < rowCount();
}
