#include "cameras/DeviceModel.h"

#include "QuorixDataStoreTypes/DeviceSchemas.h"
#include "QuorixDataStoreTypes/GreyscaleMode.h"
#include "io/Values.h"

#include <algorithm>
#include <cmath>
#include <iterator>
#include <utility>

namespace QuorixHost {
namespace {

constexpr char cameraIdPrefix[] = "qx:";

// What the descriptions of the camera commands promise to devices.
constexpr VNumberRange unitRange = {0.0, 1.0};
constexpr VNumberRange shutterRange = {0.01, 1.0};

// User ids differ from the numbers of their cameras, so that mixing them up is noticed.
constexpr std::uint32_t firstUserId = 100;

/// What tells one kind of camera from another.
struct VCameraKind
{
    const char* displayType;
    bool hasStrobe;
    bool hasThreshold;
    bool thresholdHeld;
    bool hasShutter;
    bool hasGreyscale;
};

// clang-format off
constexpr VCameraKind cameraKinds[] = {
    // type             strobe threshold held   shutter greyscale
    {"Universal",        true,  true,     false, true,   true},
    {"Optical",          true,  true,     false, false,  true},
    {"Video",            true,  false,    false, true,   true},
    {"Calibrating",      true,  true,     true,  true,   true},
    {"Passive",          false, true,     false, true,   false},
};
// clang-format on

/// Returns the path of a setting that the store's schemas do not name.
VDataPath SettingPath(const VDataPath& device, const char* name)
{
    return VDataPath(DeviceSchemas::SettingsSection(device), name);
}

VSettingModel NumberSetting(const VDataPath& device, const char* name, double initial,
                            VNumberRange range)
{
    return {name, SettingPath(device, name), MakeDoubleValue(initial), range, false};
}

} // namespace

std::string CameraId(std::uint32_t number)
{
    return cameraIdPrefix + std::to_string(number);
}

std::optional<std::uint32_t> CameraNumber(const std::string& deviceId)
{
    constexpr std::size_t prefixSize = std::size(cameraIdPrefix) - 1;
    constexpr std::size_t mostDigits = 10;
    if (deviceId.size() <= prefixSize || deviceId.size() > prefixSize + mostDigits ||
        !std::all_of(deviceId.begin() + prefixSize, deviceId.end(),
                     [](char c) { return c >= '0' && c <= '9'; })) {
        return std::nullopt;
    }
    const auto number = static_cast<std::uint32_t>(std::stoull(deviceId.substr(prefixSize)));
    return CameraId(number) == deviceId ? std::optional<std::uint32_t>(number) : std::nullopt;
}

VDeviceModel MakeCameraModel(std::uint32_t number)
{
    const VCameraKind& kind =
        cameraKinds[(number + std::size(cameraKinds) - 1) % std::size(cameraKinds)];
    VDeviceModel camera;
    camera.Class = "Device";
    camera.Id = CameraId(number);
    camera.Path = DeviceSchemas::DeviceDevice(camera.Id);
    camera.Settings = {
        {DeviceSchemas::NameLeaf(), DeviceSchemas::NamePath(camera.Path),
         MakeStringValue("Camera " + std::to_string(number)), std::nullopt, false},
        {DeviceSchemas::UserIdLeaf(), DeviceSchemas::UserIdPath(camera.Path),
         MakeUInt32Value(firstUserId + number), std::nullopt, false},
        {DeviceSchemas::DisplayTypeLeaf(), DeviceSchemas::DisplayTypePath(camera.Path),
         MakeStringValue(kind.displayType), std::nullopt, false},
    };
    if (kind.hasStrobe) {
        camera.Settings.push_back(NumberSetting(camera.Path, "StrobeIntensity", 0.5, unitRange));
    }
    if (kind.hasThreshold) {
        camera.Settings.push_back(NumberSetting(camera.Path, "Threshold", 0.25, unitRange));
        camera.Settings.back().Held = kind.thresholdHeld;
    }
    if (kind.hasShutter) {
        camera.Settings.push_back(NumberSetting(camera.Path, "ShutterDuration", 0.1, shutterRange));
    }
    if (kind.hasGreyscale) {
        const auto none = static_cast<std::int32_t>(EGreyscaleMode::None);
        camera.Settings.push_back({"GreyscaleMode", SettingPath(camera.Path, "GreyscaleMode"),
                                   MakeEnumValue(GreyscaleModeSchema(), none), std::nullopt,
                                   false});
    }
    return camera;
}

VDeviceModel MakeSystemModel()
{
    VDeviceModel system;
    system.Class = "System";
    system.Id = "Gen6System";
    system.Path = DeviceSchemas::SystemDevice(system.Id);
    system.Settings = {{"EnableTapToSelect", SettingPath(system.Path, "EnableTapToSelect"),
                        MakeBoolValue(false), std::nullopt, false}};
    return system;
}

VDataValue ConfirmedValue(const VSettingModel& setting, const VDataValue& proposed,
                          const VDataValue& verified)
{
    double number = 0.0;
    if (!setting.Range || !ReadValue(proposed, number)) {
        return proposed;
    }
    if (std::isnan(number)) {
        return verified;
    }
    return MakeDoubleValue(std::clamp(number, setting.Range->Least, setting.Range->Greatest));
}

} // namespace QuorixHost
