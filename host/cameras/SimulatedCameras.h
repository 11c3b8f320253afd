#pragma once

#include "QuorixPluginInterface/ICameraSettingsSource.h"
#include "cameras/CameraHardware.h"
#include "cameras/SimulatedDevice.h"
#include "notification/MultiCallback.h"
#include "utils/Mutex.h"

#include <cstdint>
#include <map>
#include <memory>
#include <set>
#include <string>
#include <utility>
#include <vector>

namespace QuorixHost {

/// The host's devices: the system, and the cameras that come and go.
///
/// Owns: the devices and the hardware's hearing of them; references to store and hardware.
/// Threads: look-ups [any]; what adds, removes or reports is for one thread, and on it no reading
/// view of the store may be open.
class VSimulatedCameras : public ICameraSettingsSource
{
public:
    /// Begins with the system and without any camera.
    VSimulatedCameras(std::shared_ptr<IDataStore> store, std::shared_ptr<VCameraHardware> hardware);

    VSimulatedCameras(const VSimulatedCameras&) = delete;
    VSimulatedCameras& operator=(const VSimulatedCameras&) = delete;

    std::shared_ptr<IDevice> GetDevice(const std::string& deviceClass,
                                       const std::string& deviceId) override;
    KVR::IMultiCallback<void(std::string, std::string)>& GetDeviceAddedCallback() override;

    /// As GetDevice.
    std::shared_ptr<VSimulatedDevice> Find(const std::string& deviceClass,
                                           const std::string& deviceId) const;

    /// Returns the numbers of the cameras, rising.
    std::vector<std::uint32_t> CameraNumbers() const;

    /// Puts a camera with its first values into the store and reports it.
    ///
    /// @return false, with nothing changed, where a camera of that number exists
    bool AddCamera(std::uint32_t number);

    /// Takes a camera and its values out of the store. Its parameters die with the last who works
    /// with them just now.
    ///
    /// @return false where there is none of that number
    bool RemoveCamera(std::uint32_t number);

    /// Reports every device that exists, the system first and the cameras by their numbers, to who
    /// has subscribed since it appeared.
    void ReportDevices();

private:
    /// A device, and what goes with it.
    struct VEntry
    {
        VDataPath Path;
        std::shared_ptr<VSimulatedDevice> Device;
        std::vector<std::unique_ptr<VHardwareWatch>> Watches;
    };

    void Add(const VDeviceModel& model);
    void WriteFirstValues(const VDeviceModel& model);

    const std::shared_ptr<IDataStore> store;
    const std::shared_ptr<VCameraHardware> hardware;
    NotificationSystem::VMultiCallback<void(std::string, std::string)> deviceAdded;

    mutable KVR::VMutex mutex;
    std::map<std::pair<std::string, std::string>, VEntry> devices KVR_GUARDED_BY(mutex);
    std::set<std::uint32_t> numbers KVR_GUARDED_BY(mutex);
};

} // namespace QuorixHost
