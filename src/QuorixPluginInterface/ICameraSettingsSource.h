#pragma once

#include "notification/IMultiCallback.h"

#include <memory>
#include <string>

class IDevice;

/// The host's devices, addressed by class and id ("Device"/"qx:7", "System"/"Gen6System").
///
/// Threads: every operation may be called on any thread.
class ICameraSettingsSource
{
public:
    virtual ~ICameraSettingsSource() = default;

    /// Returns the device, empty where there is none.
    virtual std::shared_ptr<IDevice> GetDevice(const std::string& deviceClass,
                                               const std::string& deviceId) = 0;

    /// Fires with class and id for each device that appears. Subscribers learn of no others, so the
    /// host fires it after Start for those that exist already.
    virtual KVR::IMultiCallback<void(std::string, std::string)>& GetDeviceAddedCallback() = 0;
};
