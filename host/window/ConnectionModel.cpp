#include "window/ConnectionModel.h"

#include "ControlSystem.h"
#include "DebugServices/Clock.h"
#include "QuorixDataStore/DataReader.h"
#include "QuorixDataStore/DataStore.h"
#include "io/Values.h"
#include "window/ShownText.h"

#include <QDateTime>
#include <QFont>

#include <algorithm>
#include <utility>

namespace QuorixHost {
namespace {

const char* const columnTitles[VConnectionModel::ColumnCount] = {"Device", "Id", "State", "Since",
                                                                 "Last beat"};

constexpr std::int64_t millisecondsPerSecond = 1000;

} // namespace

struct VConnectionModel::VBeat
{
    std::atomic<std::int64_t> Last{0};
};

VConnectionModel::VConnectionModel(std::shared_ptr<VDataStore> watchedStore,
                                   std::shared_ptr<VControlSystem> watchedSystem, QObject* parent)
    : QAbstractTableModel(parent),
      store(std::move(watchedStore)),
      controlSystem(std::move(watchedSystem)),
      beat(std::make_shared<VBeat>()),
      storeWatch(store, [this] { Refresh(); }),
      commandHandle(
          controlSystem->GetCommandNotification().Add([kept = beat](const std::wstring& name) {
              if (name == L"System.Heartbeat") {
                  kept->Last = DebugServices::SystemMilliseconds();
              }
          }))
{
    Refresh();
}

VConnectionModel::~VConnectionModel()
{
    controlSystem->GetCommandNotification().Remove(commandHandle);
}

int VConnectionModel::rowCount(const QModelIndex& parent) const
{
    return parent.isValid() ? 0 : static_cast<int>(devices.size());
}

int VConnectionModel::columnCount(const QModelIndex& parent) const
{
    return parent.isValid() ? 0 : ColumnCount;
}

QVariant VConnectionModel::headerData(int section, Qt::Orientation orientation, int role) const
{
    if (orientation == Qt::Horizontal && role == Qt::DisplayRole && section >= 0 &&
        section < ColumnCount) {
        return QString(columnTitles[section]);
    }
    return QVariant();
}

QVariant VConnectionModel::data(const QModelIndex& index, int role) const
{
    if (!index.isValid() || index.row() >= rowCount()) {
        return QVariant();
    }
    const VDevice& device = devices[static_cast<std::size_t>(index.row())];
    if (role == Qt::FontRole && device.IsConnected) {
        QFont font;
        font.setBold(true);
        return font;
    }
    if (role == Qt::ToolTipRole) {
        const QString text = TextOf(device, index.column());
        return text.isEmpty() ? QVariant() : ShownTip(text);
    }
    return role == Qt::DisplayRole ? TextOf(device, index.column()) : QVariant();
}

QString VConnectionModel::TextOf(const VDevice& device, int column) const
{
    switch (column) {
    case ColumnName:
        return ShownLine(QString::fromStdString(device.Name));
    case ColumnId:
        return ShownLine(QString::fromStdString(device.Id));
    case ColumnState:
        return device.IsConnected ? tr("connected") : tr("gone");
    case ColumnSince:
        return device.IsConnected
                   ? QDateTime::fromMSecsSinceEpoch(device.Since).toString("HH:mm:ss")
                   : QString();
    case ColumnBeat:
        return BeatText(device);
    default:
        return QString();
    }
}

QString VConnectionModel::BeatText(const VDevice& device) const
{
    if (!IsPresentDevice(device)) {
        return QString();
    }
    const std::int64_t last = std::max(beat->Last.load(), device.Since);
    const std::int64_t age = std::max<std::int64_t>(DebugServices::SystemMilliseconds() - last, 0);
    return tr("%1 s ago").arg(age / millisecondsPerSecond);
}

/// Returns whether this is the device that was connected last, to which the beats belong.
bool VConnectionModel::IsPresentDevice(const VDevice& device) const
{
    return device.IsConnected &&
           std::none_of(devices.begin(), devices.end(), [&device](const VDevice& other) {
               return other.IsConnected && other.Since > device.Since;
           });
}

void VConnectionModel::Refresh()
{
    std::vector<VDevice> present = ReadDevices();
    const std::int64_t now = DebugServices::SystemMilliseconds();
    for (VDevice& device : present) {
        const auto before =
            std::find_if(devices.begin(), devices.end(),
                         [&device](const VDevice& other) { return other.Id == device.Id; });
        const bool wasConnected = before != devices.end() && before->IsConnected;
        device.Since = wasConnected ? before->Since : now;
    }

    const bool sameRows = present.size() == devices.size();
    if (!sameRows) {
        beginResetModel();
    }
    devices = std::move(present);
    if (!sameRows) {
        endResetModel();
    } else if (!devices.empty()) {
        const int last = static_cast<int>(devices.size()) - 1;
        emit dataChanged(index(0, 0), index(last, ColumnCount - 1));
    }
}

void VConnectionModel::RefreshAges()
{
    if (!devices.empty()) {
        emit dataChanged(index(0, ColumnBeat), index(rowCount() - 1, ColumnBeat));
    }
}

std::vector<VConnectionModel::VDevice> VConnectionModel::ReadDevices() const
{
    const VDataReader reader(*store);
    const VDataPath root{"Control"};
    std::vector<std::string> ids;
    reader.GetChildren(root, ids);

    std::vector<VDevice> found;
    for (const std::string& id : ids) {
        const VDataPath path(root, id);
        VDevice device;
        device.Id = id;
        device.Name = ReadString(reader.GetValue(VDataToken(VDataPath(path, "Name"))));
        device.IsConnected = ReadBool(reader.GetValue(VDataToken(VDataPath(path, "Connected"))));
        found.push_back(std::move(device));
    }
    return found;
}

} // namespace QuorixHost
