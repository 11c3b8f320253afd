#include "window/CameraModel.h"

#include "QuorixDataStore/DataStore.h"
#include "QuorixDataStore/DataVerifyReader.h"
#include "QuorixDataStoreTypes/GreyscaleMode.h"
#include "cameras/CameraSelection.h"
#include "cameras/SimulatedCameras.h"
#include "io/ValueText.h"
#include "io/Values.h"
#include "window/GreyscaleNames.h"
#include "window/ShownText.h"

#include <QFont>

#include <algorithm>
#include <set>

namespace QuorixHost {
namespace {

struct VColumnModel
{
    const char* Title;
    const char* Setting; // null where the column shows none
    bool Editable;
};

// clang-format off
constexpr VColumnModel columns[VCameraModel::ColumnCount] = {
    {"Camera",    nullptr,           false},
    {"Name",      "Name",            true},
    {"Type",      "DisplayType",     false},
    {"User id",   "UserId",          true},
    {"Strobe",    "StrobeIntensity", true},
    {"Threshold", "Threshold",       true},
    {"Shutter",   "ShutterDuration", true},
    {"Greyscale", "GreyscaleMode",   true},
    {"Selected",  nullptr,           true},
};
// clang-format on

std::set<std::uint32_t> SelectedNumbers(VCameraSelection& selection)
{
    std::vector<VSelectionEntry> entries;
    selection.GetView()->GetSelection(VCameraSelection::CameraFilter(), entries);
    std::set<std::uint32_t> numbers;
    for (const VSelectionEntry& entry : entries) {
        std::string id;
        const auto number = entry.GetDeviceId(id) ? CameraNumber(id) : std::nullopt;
        if (number) {
            numbers.insert(*number);
        }
    }
    return numbers;
}

bool IsEnum(const VDataValue& value)
{
    return value.EffectiveSchema()->Type == KVR::IO::EType::Enum32;
}

QString ShownText(const VDataValue& value)
{
    if (IsEnum(value)) {
        return GreyscaleName(static_cast<std::int32_t>(ReadUInt32OrZero(value)));
    }
    if (value.EffectiveSchema()->Type == KVR::IO::EType::String) {
        return QString::fromStdString(ReadString(value));
    }
    return QString::fromStdString(ValueToText(value));
}

/// Returns the value that an edit asks for; an empty one for what is no value of that type.
VDataValue ParseEdit(const KVR::IO::ISchema& schema, const QVariant& edit)
{
    if (schema.Type == KVR::IO::EType::Enum32) {
        bool isNumber = false;
        const int number = edit.toInt(&isNumber);
        return isNumber ? MakeEnumValue(schema, number) : VDataValue();
    }
    const std::string text = edit.toString().toStdString();
    if (schema.Type == KVR::IO::EType::String) {
        return MakeStringValue(text);
    }
    VDataValue value;
    value.Schema = &schema;
    const char* position = text.data();
    const char* const end = position + text.size();
    const bool isValue =
        KVR::IO::TextToBinary(position, end, schema, value.Bytes, KVR::IO::SchemaTextModeRow) &&
        position == end;
    return isValue ? value : VDataValue();
}

} // namespace

VCameraModel::VCameraModel(const VCameraServices& cameraServices, QObject* parent)
    : QAbstractTableModel(parent),
      services(cameraServices),
      storeWatch(services.store, [this] { Refresh(); }),
      selectionSignal([this] { Refresh(); }),
      selectionHandle(
          services.selection->GetSelectionChangedCallback(VCameraSelection::CameraFilter())
              .Add(selectionSignal.Waker()))
{
    Refresh();
}

VCameraModel::~VCameraModel()
{
    services.selection->GetSelectionChangedCallback(VCameraSelection::CameraFilter())
        .Remove(selectionHandle);
}

int VCameraModel::rowCount(const QModelIndex& parent) const
{
    return parent.isValid() ? 0 : static_cast<int>(rows.size());
}

int VCameraModel::columnCount(const QModelIndex& parent) const
{
    return parent.isValid() ? 0 : ColumnCount;
}

QVariant VCameraModel::headerData(int section, Qt::Orientation orientation, int role) const
{
    if (orientation == Qt::Horizontal && role == Qt::DisplayRole && section >= 0 &&
        section < ColumnCount) {
        return QString(columns[section].Title);
    }
    return QVariant();
}

QVariant VCameraModel::data(const QModelIndex& index, int role) const
{
    if (!HasRow(index)) {
        return QVariant();
    }
    const VRow& row = rows[static_cast<std::size_t>(index.row())];
    const VCell& cell = row.Cells[static_cast<std::size_t>(index.column())];
    switch (role) {
    case Qt::DisplayRole:
        return ShownLine(TextOf(row, index.column()));
    case Qt::EditRole:
        return IsEnum(cell.Value) ? QVariant(static_cast<int>(ReadUInt32OrZero(cell.Value)))
                                  : QVariant(TextOf(row, index.column()));
    case Qt::CheckStateRole:
        return index.column() == ColumnSelected
                   ? QVariant(row.IsSelected ? Qt::Checked : Qt::Unchecked)
                   : QVariant();
    case Qt::FontRole: {
        QFont font;
        font.setItalic(true);
        return cell.IsPending() ? QVariant(font) : QVariant();
    }
    case Qt::ToolTipRole:
        return TipOf(cell);
    case RolePending:
        return cell.IsPending();
    default:
        return QVariant();
    }
}

bool VCameraModel::HasRow(const QModelIndex& index) const
{
    return index.isValid() && index.row() < rowCount();
}

QString VCameraModel::TextOf(const VRow& row, int column) const
{
    if (column == ColumnId) {
        return QString::fromStdString(CameraId(row.Number));
    }
    const VCell& cell = row.Cells[static_cast<std::size_t>(column)];
    return cell.Parameter ? ShownText(cell.Value) : QString();
}

QString VCameraModel::TipOf(const VCell& cell) const
{
    if (!cell.Parameter) {
        return QString();
    }
    if (!cell.IsPending()) {
        return ShownTip(ShownLine(ShownText(cell.Value))); // its column may be too narrow for it
    }
    return ShownTip(
        tr("Asked for %1; the camera still has %2")
            .arg(ShownLine(ShownText(cell.Value)), ShownLine(ShownText(cell.Verified))));
}

Qt::ItemFlags VCameraModel::flags(const QModelIndex& index) const
{
    Qt::ItemFlags itemFlags = QAbstractTableModel::flags(index);
    if (!HasRow(index)) {
        return itemFlags;
    }
    const auto column = static_cast<std::size_t>(index.column());
    if (column == ColumnSelected) {
        itemFlags |= Qt::ItemIsUserCheckable;
    } else if (columns[column].Editable &&
               rows[static_cast<std::size_t>(index.row())].Cells[column].Parameter) {
        itemFlags |= Qt::ItemIsEditable;
    }
    return itemFlags;
}

bool VCameraModel::setData(const QModelIndex& index, const QVariant& value, int role)
{
    if (!HasRow(index)) {
        return false;
    }
    const VRow& row = rows[static_cast<std::size_t>(index.row())];
    if (role == Qt::CheckStateRole && index.column() == ColumnSelected) {
        return SetSelected(row, value.toInt() == Qt::Checked);
    }
    if (role != Qt::EditRole || !flags(index).testFlag(Qt::ItemIsEditable)) {
        return false;
    }
    return SetText(row.Cells[static_cast<std::size_t>(index.column())], value);
}

bool VCameraModel::SetText(const VCell& cell, const QVariant& value)
{
    const VSettingModel& setting = cell.Parameter->Setting();
    const VDataValue parsed = ParseEdit(*setting.Initial.EffectiveSchema(), value);
    if (parsed.Empty()) {
        emit EditRefused(tr("\"%1\" is no value of %2")
                             .arg(value.toString(), QString::fromStdString(setting.Name)));
        return false;
    }
    // The row may be gone when this returns: the change comes back by way of the store.
    const std::shared_ptr<VSimulatedParameter> parameter = cell.Parameter;
    if (!parameter->SetValue(parsed)) {
        emit EditRefused(tr("%1 refuses to be changed")
                             .arg(QString::fromStdString(parameter->Setting().Path.Text())));
        return false;
    }
    return true;
}

bool VCameraModel::SetSelected(const VRow& row, bool selected)
{
    std::set<std::uint32_t> numbers = SelectedNumbers(*services.selection);
    if (selected) {
        numbers.insert(row.Number);
    } else {
        numbers.erase(row.Number);
    }
    std::vector<VSelectionEntry> entries;
    entries.reserve(numbers.size());
    for (const std::uint32_t number : numbers) {
        entries.emplace_back(CameraId(number));
    }
    services.selection->GetView()->SetSelection(entries, VCameraSelection::CameraFilter());
    return true;
}

void VCameraModel::Refresh()
{
    MatchRows(services.cameras->CameraNumbers());

    const std::set<std::uint32_t> selected = SelectedNumbers(*services.selection);
    std::vector<int> changed;
    {
        const VDataVerifyReader reader(*services.store); // one state of the store for all of it
        for (std::size_t i = 0; i < rows.size(); ++i) {
            const bool isSelected = selected.count(rows[i].Number) != 0;
            const bool differs = ReadRow(reader, rows[i]) || rows[i].IsSelected != isSelected;
            rows[i].IsSelected = isSelected;
            if (differs) {
                changed.push_back(static_cast<int>(i));
            }
        }
    }
    // With no view open: who hears of it may write.
    for (const int row : changed) {
        emit dataChanged(index(row, 0), index(row, ColumnCount - 1));
    }
}

bool VCameraModel::ReadRow(const IDataVerifyReader& reader, VRow& row)
{
    bool differs = false;
    for (VCell& cell : row.Cells) {
        if (!cell.Parameter) {
            continue;
        }
        const VDataValue value = reader.GetValue(cell.Parameter->Token());
        VDataValue verified;
        if (!reader.GetVerifiedValue(cell.Parameter->Token(), verified)) {
            verified = value; // there is nobody to confirm it
        }
        differs = differs || !(cell.Value == value) || !(cell.Verified == verified);
        cell.Value = value;
        cell.Verified = verified;
    }
    return differs;
}

void VCameraModel::MatchRows(const std::vector<std::uint32_t>& numbers)
{
    for (int i = static_cast<int>(rows.size()) - 1; i >= 0; --i) {
        if (!std::binary_search(numbers.begin(), numbers.end(),
                                rows[static_cast<std::size_t>(i)].Number)) {
            beginRemoveRows(QModelIndex(), i, i);
            rows.erase(rows.begin() + i);
            endRemoveRows();
        }
    }
    for (int i = 0; i < static_cast<int>(numbers.size()); ++i) {
        const std::uint32_t number = numbers[static_cast<std::size_t>(i)];
        if (i == static_cast<int>(rows.size()) ||
            rows[static_cast<std::size_t>(i)].Number != number) {
            beginInsertRows(QModelIndex(), i, i);
            rows.insert(rows.begin() + i, MakeRow(number));
            endInsertRows();
        }
    }
}

VCameraModel::VRow VCameraModel::MakeRow(std::uint32_t number) const
{
    VRow row;
    row.Number = number;
    const auto camera = services.cameras->Find("Device", CameraId(number));
    for (std::size_t column = 0; camera && column < ColumnCount; ++column) {
        if (columns[column].Setting != nullptr) {
            row.Cells[column].Parameter = camera->Find(columns[column].Setting);
        }
    }
    return row;
}

} // namespace QuorixHost
