#pragma once

#include "QuorixPluginInterface/ICameraSelectionSource.h"
#include "QuorixPluginInterface/ICameraSelectionView.h"
#include "QuorixPluginInterface/ICameraSettingsSource.h"
#include "QuorixPluginInterface/IDevice.h"
#include "QuorixPluginInterface/IParameter.h"
#include "notification/MultiCallback.h"

#include <map>
#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace TestSupport {

/// A parameter whose value the test reads and writes. Threads: one at a time.
class VFakeParameter : public IParameter
{
public:
    VDataValue Value;
    bool Takes = true;               ///< what SetValue answers; only then it changes Value
    std::vector<VDataValue> Written; ///< every value that SetValue was given
    NotificationSystem::VMultiCallback<void()> Changed;

    VDataValue GetValue() override { return Value; }
    bool SetValue(const VDataValue& value) override
    {
        Written.push_back(value);
        if (Takes) {
            Value = value;
        }
        return Takes;
    }
    KVR::IMultiCallback<void()>& GetChangedCallback() override { return Changed; }
};

/// A device whose two look-ups are counted apart. Threads: one at a time.
class VFakeDevice : public IDevice
{
public:
    std::map<std::string, std::shared_ptr<VFakeParameter>> Parameters;
    std::vector<std::string> Got;
    std::vector<std::string> Found;

    /// Makes a parameter of that name with a value, or replaces it.
    VFakeParameter& Add(const std::string& name, const VDataValue& value)
    {
        Parameters[name] = std::make_shared<VFakeParameter>();
        Parameters[name]->Value = value;
        return *Parameters[name];
    }

    std::shared_ptr<IParameter> GetParameter(const std::string& name) override
    {
        Got.push_back(name);
        return LookUp(name);
    }
    std::shared_ptr<IParameter> FindParameter(const std::string& name) override
    {
        Found.push_back(name);
        return LookUp(name);
    }

private:
    std::shared_ptr<IParameter> LookUp(const std::string& name) const
    {
        const auto found = Parameters.find(name);
        return found != Parameters.end() ? found->second : nullptr;
    }
};

/// Devices by class and id. Threads: one at a time.
class VFakeCameraSettings : public ICameraSettingsSource
{
public:
    using DeviceName = std::pair<std::string, std::string>;

    std::map<DeviceName, std::shared_ptr<VFakeDevice>> Devices;
    std::vector<DeviceName> LookedUp;
    NotificationSystem::VMultiCallback<void(std::string, std::string)> DeviceAdded;

    VFakeDevice& Add(const std::string& deviceClass, const std::string& deviceId)
    {
        auto& device = Devices[{deviceClass, deviceId}];
        device = std::make_shared<VFakeDevice>();
        return *device;
    }

    std::shared_ptr<IDevice> GetDevice(const std::string& deviceClass,
                                       const std::string& deviceId) override
    {
        LookedUp.emplace_back(deviceClass, deviceId);
        const auto found = Devices.find({deviceClass, deviceId});
        return found != Devices.end() ? found->second : nullptr;
    }
    KVR::IMultiCallback<void(std::string, std::string)>& GetDeviceAddedCallback() override
    {
        return DeviceAdded;
    }
};

/// A selection and the filters with which it was asked for. Threads: one at a time.
class VFakeCameraSelection : public ICameraSelectionSource
{
public:
    struct VView : ICameraSelectionView
    {
        std::vector<VSelectionEntry> Selected;
        std::vector<std::vector<std::int32_t>> Filters;
        int Replaced = 0;

        void GetSelection(const std::vector<std::int32_t>& filter,
                          std::vector<VSelectionEntry>& entries) override
        {
            Filters.push_back(filter);
            entries = Selected;
        }
        void SetSelection(const std::vector<VSelectionEntry>& selection,
                          const std::vector<std::int32_t>& filter) override
        {
            Filters.push_back(filter);
            Selected = selection;
            ++Replaced;
        }
    };

    std::shared_ptr<VView> View = std::make_shared<VView>();
    std::vector<std::vector<std::int32_t>> SubscribedFilters;
    NotificationSystem::VMultiCallback<void()> Changed;

    /// Returns the ids of the selected devices, with "-" for an entry that names none.
    std::vector<std::string> SelectedIds() const
    {
        std::vector<std::string> ids;
        for (const VSelectionEntry& entry : View->Selected) {
            std::string id = "-";
            (void)entry.GetDeviceId(id);
            ids.push_back(id);
        }
        return ids;
    }

    std::shared_ptr<ICameraSelectionView> GetView() override { return View; }
    KVR::IMultiCallback<void()>&
    GetSelectionChangedCallback(const std::vector<std::int32_t>& filter) override
    {
        SubscribedFilters.push_back(filter);
        return Changed;
    }
};

} // namespace TestSupport
