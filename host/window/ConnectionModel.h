#pragma once

#include "window/StoreWatch.h"

#include <QAbstractTableModel>

#include <atomic>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

class VDataStore;

namespace QuorixHost {

class VControlSystem;

/// The devices that control this host, or have done so since its start, and how fresh the word of
/// the present one is.
///
/// The store tells who is connected, the dispatcher when a beat came; a beat does not tell whose it
/// is, so it counts for the device that was connected last.
/// Owns: a copy of what is shown; its place among the dispatcher's listeners. Threads: [gui].
class VConnectionModel : public QAbstractTableModel
{
    Q_OBJECT

public:
    enum EColumn { ColumnName, ColumnId, ColumnState, ColumnSince, ColumnBeat, ColumnCount };

    VConnectionModel(std::shared_ptr<VDataStore> store,
                     std::shared_ptr<VControlSystem> controlSystem, QObject* parent = nullptr);
    ~VConnectionModel() override;

    int rowCount(const QModelIndex& parent = QModelIndex()) const override;
    int columnCount(const QModelIndex& parent = QModelIndex()) const override;
    QVariant headerData(int section, Qt::Orientation orientation, int role) const override;
    QVariant data(const QModelIndex& index, int role) const override;

    /// Reads the store anew.
    void Refresh();

    /// Renews what grows old by itself: the ages of the beats.
    void RefreshAges();

private:
    struct VDevice
    {
        std::string Id;
        std::string Name;
        bool IsConnected = false;
        std::int64_t Since = 0; // when it was first seen connected, in milliseconds
    };

    struct VBeat;

    std::vector<VDevice> ReadDevices() const;
    bool IsPresentDevice(const VDevice& device) const;
    QString TextOf(const VDevice& device, int column) const;
    QString BeatText(const VDevice& device) const;

    const std::shared_ptr<VDataStore> store;
    const std::shared_ptr<VControlSystem> controlSystem;
    const std::shared_ptr<VBeat> beat; // shared with the listener below
    std::vector<VDevice> devices;      // by id
    const VStoreWatch storeWatch;
    const std::uint64_t commandHandle;
};

} // namespace QuorixHost
