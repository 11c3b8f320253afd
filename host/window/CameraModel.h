#pragma once

#include "CameraCommands.h"
#include "io/DataValue.h"
#include "window/GuiSignal.h"
#include "window/StoreWatch.h"

#include <QAbstractTableModel>

#include <array>
#include <cstdint>
#include <memory>
#include <vector>

class IDataVerifyReader;

namespace QuorixHost {

class VSimulatedDevice;
class VSimulatedParameter;

/// The cameras as a table: one row a camera, one column a setting, and a last one that selects.
///
/// A value that the operator or a device has asked for is shown at once, in italics until the
/// hardware has confirmed it. Owns: a copy of what is shown, renewed after every change of the
/// store. Threads: [gui]. Failure: a setting that a camera lacks is an empty cell; what cannot be
/// taken is told by EditRefused.
class VCameraModel : public QAbstractTableModel
{
    Q_OBJECT

public:
    enum EColumn {
        ColumnId,
        ColumnName,
        ColumnType,
        ColumnUserId,
        ColumnStrobe,
        ColumnThreshold,
        ColumnShutter,
        ColumnGreyscale,
        ColumnSelected,
        ColumnCount
    };

    /// Whether the value of a cell waits for the hardware.
    static constexpr int RolePending = Qt::UserRole;

    explicit VCameraModel(const VCameraServices& services, QObject* parent = nullptr);
    ~VCameraModel() override;

    int rowCount(const QModelIndex& parent = QModelIndex()) const override;
    int columnCount(const QModelIndex& parent = QModelIndex()) const override;
    QVariant headerData(int section, Qt::Orientation orientation, int role) const override;
    QVariant data(const QModelIndex& index, int role) const override;
    Qt::ItemFlags flags(const QModelIndex& index) const override;

    /// Asks for a value, as the operator: a text in the form that is shown, the number of a
    /// greyscale mode, or a check state.
    ///
    /// @return whether it was taken, which does not mean confirmed
    bool setData(const QModelIndex& index, const QVariant& value, int role) override;

    /// Reads everything anew and tells of what differs.
    void Refresh();

signals:
    /// Tells the operator why a value was not taken.
    void EditRefused(const QString& reason);

private:
    struct VCell
    {
        std::shared_ptr<VSimulatedParameter> Parameter; // empty: the camera has no such setting
        VDataValue Value;                               // asked for last
        VDataValue Verified;

        bool IsPending() const { return !(Value == Verified); }
    };

    struct VRow
    {
        std::uint32_t Number = 0;
        std::array<VCell, ColumnCount> Cells;
        bool IsSelected = false;
    };

    bool HasRow(const QModelIndex& index) const;
    VRow MakeRow(std::uint32_t number) const;
    static bool ReadRow(const IDataVerifyReader& reader, VRow& row);
    void MatchRows(const std::vector<std::uint32_t>& numbers);
    QString TextOf(const VRow& row, int column) const;
    QString TipOf(const VCell& cell) const;
    bool SetText(const VCell& cell, const QVariant& value);
    bool SetSelected(const VRow& row, bool selected);

    const VCameraServices services;
    std::vector<VRow> rows; // by number
    const VStoreWatch storeWatch;
    const VGuiSignal selectionSignal;
    const std::uint64_t selectionHandle;
};

} // namespace QuorixHost
