#include "QuorixPluginControlStreamServer/ControlSystem/EventProviderCameraSettings.h"

#include "QuorixPluginControlStreamServer/ControlSystem/CameraNames.h"
#include "QuorixPluginControlStreamServer/ControlSystem/GreyscaleModeText.h"
#include "QuorixPluginInterface/ICameraSettingsSource.h"
#include "QuorixPluginInterface/IDevice.h"
#include "QuorixPluginInterface/IParameter.h"
#include "io/ValueText.h"
#include "io/Values.h"
#include "notification/WeakBinding.h"
#include "utils/WideText.h"

#include <boost/bind/bind.hpp>

#include <optional>
#include <utility>

using ControlSystem::IParameters;

namespace {

constexpr wchar_t nameChanged[] = L"Event.Cameras.NameChanged";
constexpr wchar_t userIdChanged[] = L"Event.Cameras.UserIdChanged";
constexpr wchar_t greyscaleModeChanged[] = L"Event.Cameras.GreyscaleModeChanged";
constexpr wchar_t settingChanged[] = L"Event.Cameras.SettingChanged";
constexpr wchar_t tapToSelectChanged[] = L"Event.Cameras.TapToSelectChanged";

IParameters ParametersOfCamera(std::uint32_t number)
{
    IParameters parameters;
    parameters.Set(L"CameraId", std::to_wstring(number));
    return parameters;
}

} // namespace

VEventProviderCameraSettings::VEventProviderCameraSettings(
    IControlSystem* dispatcher, std::shared_ptr<ICameraSettingsSource> cameraSettings)
    : VEventProvider(dispatcher), settingsSource(std::move(cameraSettings))
{
}

void VEventProviderCameraSettings::GetEventNames(std::vector<std::wstring>& names)
{
    names.insert(names.end(), {nameChanged, userIdChanged, greyscaleModeChanged, settingChanged,
                               tapToSelectChanged});
}

void VEventProviderCameraSettings::OnCreated()
{
    if (!settingsSource) {
        return;
    }
    settingsSource->GetDeviceAddedCallback().Add(
        boost::bind(&VEventProviderCameraSettings::OnDeviceAdded,
                    boost::bind(&KVR::LockOrDeregister<VEventProviderCameraSettings>, WeakSelf()),
                    boost::placeholders::_1, boost::placeholders::_2));
}

void VEventProviderCameraSettings::OnDeviceAdded(const std::string& deviceClass,
                                                 const std::string& deviceId)
{
    if (deviceClass == CameraNames::SystemClass && deviceId == CameraNames::SystemId) {
        SubscribeToSystem();
    } else if (deviceClass == CameraNames::DeviceClass) {
        if (const std::optional<std::uint32_t> number = CameraNames::CameraNumber(deviceId)) {
            SubscribeToCamera(deviceId, *number);
        }
    }
}

void VEventProviderCameraSettings::SubscribeToSystem()
{
    const auto system = settingsSource->GetDevice(CameraNames::SystemClass, CameraNames::SystemId);
    if (system) {
        Subscribe(*system, CameraNames::EnableTapToSelect,
                  boost::bind(&VEventProviderCameraSettings::OnTapToSelectChanged,
                              boost::placeholders::_1, boost::placeholders::_2));
    }
}

void VEventProviderCameraSettings::SubscribeToCamera(const std::string& deviceId,
                                                     std::uint32_t number)
{
    using boost::placeholders::_1;
    using boost::placeholders::_2;
    using Self = VEventProviderCameraSettings;

    const auto camera = settingsSource->GetDevice(CameraNames::DeviceClass, deviceId);
    if (!camera) {
        return;
    }

    Subscribe(*camera, CameraNames::Name, boost::bind(&Self::OnNameChanged, _1, _2, number));
    Subscribe(*camera, CameraNames::UserId, boost::bind(&Self::OnUserIdChanged, _1, _2, number));
    Subscribe(*camera, CameraNames::GreyscaleMode,
              boost::bind(&Self::OnGreyscaleModeChanged, _1, _2, number));
    for (const char* setting :
         {CameraNames::StrobeIntensity, CameraNames::Threshold, CameraNames::ShutterDuration}) {
        Subscribe(*camera, setting,
                  boost::bind(&Self::OnSettingChanged, _1, _2, number, KVR::Utf8ToWide(setting)));
    }
}

void VEventProviderCameraSettings::Subscribe(
    IDevice& device, const char* parameterName,
    boost::function<void(VEventProviderCameraSettings*, IParameter&)> handler)
{
    const std::shared_ptr<IParameter> parameter = device.GetParameter(parameterName);
    if (!parameter) {
        return;
    }
    parameter->GetChangedCallback().Add(
        boost::bind(&VEventProviderCameraSettings::OnChanged,
                    boost::bind(&KVR::LockOrDeregister<VEventProviderCameraSettings>, WeakSelf()),
                    std::move(handler), std::weak_ptr<IParameter>(parameter)));
}

void VEventProviderCameraSettings::OnChanged(
    const boost::function<void(VEventProviderCameraSettings*, IParameter&)>& handler,
    const std::weak_ptr<IParameter>& changed)
{
    if (const std::shared_ptr<IParameter> parameter = changed.lock()) {
        handler(this, *parameter);
    }
}

void VEventProviderCameraSettings::OnNameChanged(IParameter& parameter, std::uint32_t number) const
{
    IParameters parameters = ParametersOfCamera(number);
    parameters.Set(L"CameraName", KVR::Utf8ToWide(ReadString(parameter.GetValue())));
    parameters.Set(L"CameraType", KVR::Utf8ToWide(CameraType(number)));
    Publish(nameChanged, parameters);
}

void VEventProviderCameraSettings::OnUserIdChanged(IParameter& parameter,
                                                   std::uint32_t number) const
{
    IParameters parameters = ParametersOfCamera(number);
    parameters.Set(L"UserId", std::to_wstring(ReadUInt32OrZero(parameter.GetValue())));
    Publish(userIdChanged, parameters);
}

void VEventProviderCameraSettings::OnGreyscaleModeChanged(IParameter& parameter,
                                                          std::uint32_t number) const
{
    IParameters parameters = ParametersOfCamera(number);
    parameters.Set(L"GreyscaleMode", GreyscaleModeText(ReadUInt32OrZero(parameter.GetValue())));
    Publish(greyscaleModeChanged, parameters);
}

void VEventProviderCameraSettings::OnSettingChanged(IParameter& parameter, std::uint32_t number,
                                                    const std::wstring& settingName) const
{
    IParameters parameters = ParametersOfCamera(number);
    parameters.Set(L"SettingName", settingName);
    parameters.Set(L"SettingValue", KVR::Utf8ToWide(ValueToText(parameter.GetValue())));
    Publish(settingChanged, parameters);
}

void VEventProviderCameraSettings::OnTapToSelectChanged(IParameter& parameter) const
{
    IParameters parameters;
    parameters.Set(CameraNames::ParamTapEnabled, ReadBool(parameter.GetValue()) ? L"1" : L"0");
    Publish(tapToSelectChanged, parameters);
}

std::string VEventProviderCameraSettings::CameraType(std::uint32_t number) const
{
    const auto camera =
        settingsSource->GetDevice(CameraNames::DeviceClass, CameraNames::CameraId(number));
    const auto type = camera ? camera->GetParameter(CameraNames::DisplayType) : nullptr;
    return type ? ReadString(type->GetValue()) : std::string();
}

std::weak_ptr<VEventProviderCameraSettings> VEventProviderCameraSettings::WeakSelf()
{
    return std::static_pointer_cast<VEventProviderCameraSettings>(shared_from_this());
}
