#pragma once

#include "QuorixDataStore/DataToken.h"
#include "QuorixPluginInterface/IParameter.h"
#include "cameras/DeviceModel.h"
#include "notification/MultiCallback.h"

#include <atomic>
#include <memory>

class IDataStore;

namespace QuorixHost {

/// A setting of a simulated device, whose value lives in the store.
///
/// A user of it works with the value that was asked for last; the hardware confirms it later. It
/// lives as long as its device, or as long as somebody still holds it: after its device has gone it
/// has no value and takes none.
/// Owns: a reference to the store. Threads: every operation [any], but none on a thread that holds
/// a reading view, since SetValue takes the write lock.
class VSimulatedParameter : public IParameter
{
public:
    VSimulatedParameter(std::shared_ptr<IDataStore> store, VSettingModel setting);

    /// Returns the value that was asked for last, confirmed or not.
    VDataValue GetValue() override;

    /// Asks for a value, which GetValue returns at once.
    ///
    /// @return false for a value of another type, and for a setting that is held or has gone
    bool SetValue(const VDataValue& value) override;

    /// Fires once for each value that the hardware has confirmed, on the hardware's thread.
    KVR::IMultiCallback<void()>& GetChangedCallback() override { return changed; }

    /// Fires the notification on the calling thread; what a function throws passes through.
    void Notify() { changed(); }

    /// Notes that the hardware has this parameter on its list. @return whether it had already
    bool SetQueued(bool isQueued) { return queued.exchange(isQueued); }

    const VSettingModel& Setting() const { return setting; }
    const VDataToken& Token() const { return token; }

private:
    const std::shared_ptr<IDataStore> store;
    const VSettingModel setting;
    const VDataToken token;
    std::atomic<bool> queued{false};
    NotificationSystem::VMultiCallback<void()> changed;
};

} // namespace QuorixHost
