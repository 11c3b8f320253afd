#pragma once

#include "QuorixPluginControlStreamServer/Authorization/ControlDeviceRecord.h"

#include <QAbstractItemModel>

#include <string>
#include <vector>

/// The known devices as a flat list that the operator may cut down, before it is handed back.
///
/// Owns: its rows, a copy. Threads: [gui]. Failure: an index or role that there is not is answered
/// by an empty value and changes nothing.
class VQuorixManagementModel : public QAbstractItemModel
{
    Q_OBJECT

public:
    /// What a row is asked for, and its name in QML.
    enum ERole {
        RoleId = 0,        ///< "itemId", a text
        RoleName = 1,      ///< "itemName", a text
        RoleAuthorised = 2 ///< "itemAuthorised", a flag
    };

    /// Makes one row of each record, sorted once by name without regard to case.
    explicit VQuorixManagementModel(const VControlDevices& devices, QObject* parent = nullptr);

    /// Returns the rows that are left, in the form in which they came.
    VControlDevices GetDevices() const;

    QModelIndex index(int row, int column,
                      const QModelIndex& parent = QModelIndex()) const override;
    QModelIndex parent(const QModelIndex& child) const override;
    int rowCount(const QModelIndex& parent = QModelIndex()) const override;
    int columnCount(const QModelIndex& parent = QModelIndex()) const override;
    QVariant data(const QModelIndex& index, int role) const override;
    QHash<int, QByteArray> roleNames() const override;

    /// Changes whether a device is allowed; no other role can be changed.
    ///
    /// @return always false, also after a change: whoever needs to know hears `dataChanged`
    bool setData(const QModelIndex& index, const QVariant& value, int role) override;

    /// Removes rows, if all of them are there.
    ///
    /// @return always false, also after they were removed
    bool removeRows(int row, int count, const QModelIndex& parent = QModelIndex()) override;

    /// Removes all rows. Deliberate: QML calls it by this spelling.
    Q_INVOKABLE void forgetEverthing();

    /// Removes one row; a number without a row changes nothing.
    Q_INVOKABLE void forgetItem(int index);

private:
    struct VRow
    {
        std::string Id;
        bool Authorised = false;
        std::string Name;
    };

    bool HasRow(const QModelIndex& index) const;

    std::vector<VRow> rows;
};
