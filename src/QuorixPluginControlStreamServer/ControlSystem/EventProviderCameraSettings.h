#pragma once

#include "QuorixPluginControlStreamServer/ControlSystem/EventProvider.h"
#include "notification/Shared.h"

#include <boost/function.hpp>

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

class ICameraSettingsSource;
class IDevice;
class IParameter;

/// Turns each change of a camera's parameter, and of tap-to-select, into one event.
///
/// Nothing is compared, delayed or merged: a burst of notifications is a burst of events. Made by
/// KVR::MakeShared, which also subscribes it; it hears only of devices that the source reports from
/// then on.
///
/// Owns: a shared reference to the source, which may be empty. Parameters are held weakly.
/// Threads: handlers run on the thread that delivers a change, and share nothing.
/// Failure: a parameter or device that has gone ends the handler without an event.
class VEventProviderCameraSettings : public VEventProvider, public KVR::VShared
{
public:
    VEventProviderCameraSettings(IControlSystem* dispatcher,
                                 std::shared_ptr<ICameraSettingsSource> cameraSettings);

    void GetEventNames(std::vector<std::wstring>& names) override;

    void OnCreated() override;

private:
    void OnDeviceAdded(const std::string& deviceClass, const std::string& deviceId);
    void SubscribeToSystem();
    void SubscribeToCamera(const std::string& deviceId, std::uint32_t number);

    /// Calls `handler` with the parameter for each change, as long as this object and it live.
    void Subscribe(IDevice& device, const char* parameterName,
                   boost::function<void(VEventProviderCameraSettings*, IParameter&)> handler);
    void OnChanged(const boost::function<void(VEventProviderCameraSettings*, IParameter&)>& handler,
                   const std::weak_ptr<IParameter>& changed);

    void OnNameChanged(IParameter& parameter, std::uint32_t number) const;
    void OnUserIdChanged(IParameter& parameter, std::uint32_t number) const;
    void OnGreyscaleModeChanged(IParameter& parameter, std::uint32_t number) const;
    void OnSettingChanged(IParameter& parameter, std::uint32_t number,
                          const std::wstring& settingName) const;
    void OnTapToSelectChanged(IParameter& parameter) const;

    std::string CameraType(std::uint32_t number) const;
    std::weak_ptr<VEventProviderCameraSettings> WeakSelf();

    const std::shared_ptr<ICameraSettingsSource> settingsSource;
};
