#include "cameras/SimulatedCameras.h"

#include "QuorixDataStore/DataVerifyWriter.h"
#include "QuorixDataStore/DataWriter.h"

namespace QuorixHost {

VSimulatedCameras::VSimulatedCameras(std::shared_ptr<IDataStore> store,
                                     std::shared_ptr<VCameraHardware> hardware)
    : store(std::move(store)), hardware(std::move(hardware))
{
    Add(MakeSystemModel());
}

std::shared_ptr<IDevice> VSimulatedCameras::GetDevice(const std::string& deviceClass,
                                                      const std::string& deviceId)
{
    return Find(deviceClass, deviceId);
}

KVR::IMultiCallback<void(std::string, std::string)>& VSimulatedCameras::GetDeviceAddedCallback()
{
    return deviceAdded;
}

std::shared_ptr<VSimulatedDevice> VSimulatedCameras::Find(const std::string& deviceClass,
                                                          const std::string& deviceId) const
{
    const KVR::VMutexLock lock(mutex);
    const auto found = devices.find({deviceClass, deviceId});
    return found != devices.end() ? found->second.Device : nullptr;
}

std::vector<std::uint32_t> VSimulatedCameras::CameraNumbers() const
{
    const KVR::VMutexLock lock(mutex);
    return {numbers.begin(), numbers.end()};
}

bool VSimulatedCameras::AddCamera(std::uint32_t number)
{
    const VDeviceModel model = MakeCameraModel(number);
    if (Find(model.Class, model.Id)) {
        return false;
    }
    Add(model);
    {
        const KVR::VMutexLock lock(mutex);
        numbers.insert(number);
    }
    deviceAdded(model.Class, model.Id);
    return true;
}

bool VSimulatedCameras::RemoveCamera(std::uint32_t number)
{
    const VDeviceModel model = MakeCameraModel(number);
    VEntry removed; // let go after the lock: somebody else's functions go with it
    {
        const KVR::VMutexLock lock(mutex);
        const auto found = devices.find({model.Class, model.Id});
        if (found == devices.end()) {
            return false;
        }
        removed = std::move(found->second);
        devices.erase(found);
        numbers.erase(number);
    }
    removed.Watches.clear();

    VDataWriter writer(*store);
    // True or not, nothing of the camera is left: each of its values was there or is gone already.
    static_cast<void>(writer.RemoveAll(VDataPath(removed.Path, "*")));
    return true;
}

void VSimulatedCameras::ReportDevices()
{
    const VDeviceModel system = MakeSystemModel();
    deviceAdded(system.Class, system.Id);
    for (const std::uint32_t number : CameraNumbers()) {
        const VDeviceModel camera = MakeCameraModel(number);
        deviceAdded(camera.Class, camera.Id);
    }
}

void VSimulatedCameras::Add(const VDeviceModel& model)
{
    WriteFirstValues(model);

    VEntry entry{model.Path, std::make_shared<VSimulatedDevice>(store, model), {}};
    // Only now, so that the first values are no change that anybody is notified of.
    for (const auto& parameter : entry.Device->Parameters()) {
        entry.Watches.push_back(hardware->Watch(parameter));
    }

    const KVR::VMutexLock lock(mutex);
    devices[{model.Class, model.Id}] = std::move(entry);
}

void VSimulatedCameras::WriteFirstValues(const VDeviceModel& model)
{
    VDataVerifyWriter writer(*store);
    for (const VSettingModel& setting : model.Settings) {
        const VDataToken token(setting.Path);
        // None of these can fail: the path is whole, and a new item takes any value.
        static_cast<void>(writer.SetFlags(token, EDataValueFlags::VerifyRequired));
        static_cast<void>(writer.SetVerifiedValue(token, setting.Initial));
        static_cast<void>(writer.SetProposedValue(token, setting.Initial));
    }
}

} // namespace QuorixHost
