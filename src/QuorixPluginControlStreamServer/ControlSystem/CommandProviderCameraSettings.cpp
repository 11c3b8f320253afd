#include "QuorixPluginControlStreamServer/ControlSystem/CommandProviderCameraSettings.h"

#include "QuorixDataStoreTypes/GreyscaleMode.h"
#include "QuorixPluginControlStreamServer/ControlSystem/CameraNames.h"
#include "QuorixPluginControlStreamServer/ControlSystem/GreyscaleModeText.h"
#include "QuorixPluginInterface/ICameraSelectionSource.h"
#include "QuorixPluginInterface/ICameraSelectionView.h"
#include "QuorixPluginInterface/ICameraSettingsSource.h"
#include "QuorixPluginInterface/IDevice.h"
#include "QuorixPluginInterface/IParameter.h"
#include "io/ValueText.h"
#include "io/Values.h"
#include "utils/LogStatement.h"
#include "utils/NumberText.h"
#include "utils/SplitTokens.h"
#include "utils/WideText.h"

#include <optional>
#include <utility>

using ControlSystem::ICommandInformation;
using ControlSystem::IParameterInformation;
using ControlSystem::IParameters;
using ControlSystem::IResult;

namespace {

constexpr char logCategory[] = "CommandProviderCameraSettings";
constexpr int tracing = 6;

constexpr std::int32_t success = 1;
constexpr std::int32_t unknownCommand = 2;
constexpr std::int32_t noSuchSetting = 4;
constexpr std::int32_t noSuchCamera = 10;
constexpr std::int32_t refused = 15;
constexpr std::int32_t unknownError = 46;

constexpr wchar_t paramCameraDeviceId[] = L"Param_CameraDeviceId";
constexpr wchar_t paramStrobeIntensity[] = L"Param_StrobeIntensity";
constexpr wchar_t paramCentroidThreshold[] = L"Param_CentroidThreshold";
constexpr wchar_t paramShutterDuration[] = L"Param_ShutterDuration";
constexpr wchar_t paramGreyscaleMode[] = L"Param_GreyscaleMode";
constexpr wchar_t paramCameraSelection[] = L"Param_CameraSelection";

constexpr char missingGreyscaleMode[] = "Camera does not support greyscale mode.";

void Trace(const char* message)
{
    KVR_LOG(logCategory, tracing, message);
}

std::int32_t Write(IParameter& parameter, const VDataValue& value)
{
    return parameter.SetValue(value) ? success : refused;
}

} // namespace

/// A camera's number, the same in everything but its names and its messages.
struct VCommandProviderCameraSettings::VNumberSetting
{
    const char* parameter;        ///< the host's name
    const wchar_t* wireParameter; ///< the device's name
    const char* missingOnRead;    ///< logged where a camera lacks the setting
    const char* missingOnWrite;   ///< the same for a writer
    const char* unreadable;       ///< logged where a writer is sent no number
};

const VCommandProviderCameraSettings::VNumberSetting
    VCommandProviderCameraSettings::strobeIntensity = {
        CameraNames::StrobeIntensity,
        paramStrobeIntensity,
        "Camera does not support strobe intensity.",
        "Camera does not support strobe intensity.",
        "Invalid intensity value.",
};

// Deliberate: an unreadable threshold is called an intensity, as those who search logs know it.
const VCommandProviderCameraSettings::VNumberSetting VCommandProviderCameraSettings::threshold = {
    CameraNames::Threshold,
    paramCentroidThreshold,
    "Camera does not support threshold.",
    "Camera does not support threshold.",
    "Invalid intensity value.",
};

// Deliberate: the first message has lost its verb and keeps it lost, since logs are searched for
// it.
const VCommandProviderCameraSettings::VNumberSetting
    VCommandProviderCameraSettings::shutterDuration = {
        CameraNames::ShutterDuration,        paramShutterDuration,
        "Camera does not shutter duration.", "Camera does not support shutter duration.",
        "Invalid shutter duration.",
};

struct VCommandProviderCameraSettings::VCommand
{
    std::wstring name;
    std::wstring description;
    std::vector<IParameterInformation> input;
    std::vector<IParameterInformation> reply;
    Handler run;
};

/// The commands in the order in which they are listed to devices.
const std::vector<VCommandProviderCameraSettings::VCommand>&
VCommandProviderCameraSettings::Commands()
{
    using Self = VCommandProviderCameraSettings;

    static const IParameterInformation camera = {paramCameraDeviceId,
                                                 L"Unique device id for given camera"};
    static const IParameterInformation videoCamera = {paramCameraDeviceId,
                                                      L"Unique device id for given video camera"};
    static const IParameterInformation intensity = {paramStrobeIntensity,
                                                    L"Strobe Intensity value, between 0.0 and 1.0"};
    static const IParameterInformation centroid = {
        paramCentroidThreshold, L"Centroid fitting threshold, between 0.0 and 1.0"};
    static const IParameterInformation shutter = {paramShutterDuration,
                                                  L"Video shutter duration, between 0.01 and 1.0"};
    static const IParameterInformation selection = {
        paramCameraSelection, L"Comma separated list of device IDs for selected cameras"};
    static const IParameterInformation tap = {
        CameraNames::ParamTapEnabled, L"Whether the setting is enabled or disabled, 1 for on"};

    static const std::vector<VCommand> commands = {
        {L"CameraSettings_EnableStrobes",
         L"Restore previous strobe settings for all cameras to what it was prior to being disabled "
         L"and enables GUI param again",
         {},
         {},
         &Self::SwitchStrobes},
        {L"CameraSettings_DisableStrobes",
         L"Turns off strobes for all cameras and disables the param in the GUI",
         {},
         {},
         &Self::SwitchStrobes},
        {L"CameraSettings_GetStrobeIntensity",
         L"Returns current strobe intensity",
         {camera},
         {intensity},
         &Self::GetNumber<strobeIntensity>},
        {L"CameraSettings_SetStrobeIntensity",
         L"Sets current strobe intensity",
         {camera, intensity},
         {},
         &Self::SetNumber<strobeIntensity>},
        {L"CameraSettings_GetCentroidThreshold",
         L"Returns current centroid fitting threshold for the given camera",
         {camera},
         {centroid},
         &Self::GetNumber<threshold>},
        {L"CameraSettings_SetCentroidThreshold",
         L"Sets centroid fitting threshold for the given camera",
         {camera, centroid},
         {},
         &Self::SetNumber<threshold>},
        {L"CameraSettings_GetShutterDuration",
         L"Returns current shutter duration for the given video camera",
         {videoCamera},
         {shutter},
         &Self::GetNumber<shutterDuration>},
        {L"CameraSettings_SetShutterDuration",
         L"Sets shutter duration for the given video camera",
         {videoCamera, shutter},
         {},
         &Self::SetNumber<shutterDuration>},
        {L"CameraSettings_GetGreyscaleMode",
         L"Returns greyscale mode as a string. One of 'Auto', 'None', 'All', 'Only', 'Edges', 'No "
         L"Edges'",
         {camera},
         {{paramGreyscaleMode, L"Current greyscale mode (string)"}},
         &Self::GetGreyscaleMode},
        {L"CameraSettings_SetGreyscaleMode",
         L"Set greyscale mode from one of 'Auto', 'None', 'All', 'Only', 'Edges', 'No Edges'",
         {camera, {paramGreyscaleMode, L"Requested greyscale mode (string)"}},
         {},
         &Self::SetGreyscaleMode},
        {L"CameraSettings_GetSelection",
         L"Returns device ids of selected cameras",
         {},
         {selection},
         &Self::GetSelection},
        {L"CameraSettings_SetSelection",
         L"Set selected cameras",
         {selection},
         {},
         &Self::SetSelection},
        {L"CameraSettings_ToggleTap",
         L"Toggle Tap-To-Select (Disabled/Enabled) for all cameras",
         {tap},
         {},
         &Self::ToggleTap},
        {L"CameraSettings_GetTapEnabled",
         L"Returns the current global Tap-To-Select setting",
         {},
         {tap},
         &Self::GetTapEnabled},
    };
    return commands;
}

VCommandProviderCameraSettings::VCommandProviderCameraSettings(
    std::shared_ptr<ICameraSelectionSource> cameraSelection,
    std::shared_ptr<ICameraSettingsSource> cameraSettings)
    : selectionSource(std::move(cameraSelection)), settingsSource(std::move(cameraSettings))
{
}

void VCommandProviderCameraSettings::GetCommandNames(std::vector<std::wstring>& names)
{
    for (const VCommand& command : Commands()) {
        names.push_back(command.name);
    }
}

ICommandInformation VCommandProviderCameraSettings::GetCommandInformation(const std::wstring& name)
{
    ICommandInformation information;
    information.Name = name;
    for (const VCommand& command : Commands()) {
        if (command.name == name) {
            information.Description = command.description;
            information.InputParameters = command.input;
            information.ReplyParameters = command.reply;
            break;
        }
    }
    return information;
}

IResult VCommandProviderCameraSettings::ExecuteCommand(const std::wstring& name,
                                                       const IParameters& input, IParameters& reply)
{
    for (const VCommand& command : Commands()) {
        if (command.name == name) {
            return {(this->*command.run)(input, reply)};
        }
    }
    return {unknownCommand};
}

// Deliberate: neither command does anything, whatever its description promises. Devices send them
// around their own fades and rely on the strobes staying as they are.
std::int32_t VCommandProviderCameraSettings::SwitchStrobes(const IParameters& /*input*/,
                                                           IParameters& /*reply*/) const
{
    return success;
}

template <const VCommandProviderCameraSettings::VNumberSetting& setting>
std::int32_t VCommandProviderCameraSettings::GetNumber(const IParameters& input,
                                                       IParameters& reply) const
{
    const std::shared_ptr<IDevice> camera = FindCamera(input);
    if (!camera) {
        return noSuchCamera;
    }
    const std::shared_ptr<IParameter> parameter = camera->GetParameter(setting.parameter);
    if (!parameter) {
        Trace(setting.missingOnRead);
        return noSuchSetting;
    }

    reply.Set(setting.wireParameter, KVR::Utf8ToWide(ValueToText(parameter->GetValue())));
    return success;
}

template <const VCommandProviderCameraSettings::VNumberSetting& setting>
std::int32_t VCommandProviderCameraSettings::SetNumber(const IParameters& input,
                                                       IParameters& /*reply*/) const
{
    const std::shared_ptr<IDevice> camera = FindCamera(input);
    if (!camera) {
        return noSuchCamera;
    }

    // Deliberate: what is no number is logged, and 0.0 is written in its place. Whether that was
    // taken is the result, so that a device never hears of "Invalid Parameter Value". Devices count
    // on a setter to answer for the camera alone.
    const std::optional<double> number =
        KVR::DeviceTextToDouble(KVR::WideToUtf8(input.Get(setting.wireParameter)));
    if (!number) {
        Trace(setting.unreadable);
    }

    const std::shared_ptr<IParameter> parameter = camera->GetParameter(setting.parameter);
    if (!parameter) {
        Trace(setting.missingOnWrite);
        return noSuchSetting;
    }

    return Write(*parameter, MakeDoubleValue(number.value_or(0.0)));
}

std::int32_t VCommandProviderCameraSettings::GetGreyscaleMode(const IParameters& input,
                                                              IParameters& reply) const
{
    const std::shared_ptr<IDevice> camera = FindCamera(input);
    if (!camera) {
        return noSuchCamera;
    }
    const std::shared_ptr<IParameter> parameter = camera->GetParameter(CameraNames::GreyscaleMode);
    if (!parameter) {
        Trace(missingGreyscaleMode);
        return noSuchSetting;
    }

    const std::wstring text = GreyscaleModeText(ReadUInt32OrZero(parameter->GetValue()));
    reply.Set(paramGreyscaleMode, text);
    // Deliberate: a valid mode is answered as if the camera were missing, so that no device ever
    // sees it. Devices know this command as one that fails; the mode is in the reply for other
    // callers.
    return text.empty() ? unknownError : noSuchCamera;
}

std::int32_t VCommandProviderCameraSettings::SetGreyscaleMode(const IParameters& input,
                                                              IParameters& /*reply*/) const
{
    const std::shared_ptr<IDevice> camera = FindCamera(input);
    if (!camera) {
        return noSuchCamera;
    }
    const std::int32_t mode = GreyscaleModeOfText(input.Get(paramGreyscaleMode));
    const std::shared_ptr<IParameter> parameter = camera->GetParameter(CameraNames::GreyscaleMode);
    if (!parameter) {
        Trace(missingGreyscaleMode);
        return noSuchSetting;
    }

    return Write(*parameter, MakeEnumValue(GreyscaleModeSchema(), mode));
}

std::int32_t VCommandProviderCameraSettings::GetSelection(const IParameters& /*input*/,
                                                          IParameters& reply) const
{
    std::vector<VSelectionEntry> entries;
    if (const auto view = selectionSource ? selectionSource->GetView() : nullptr) {
        view->GetSelection(CameraNames::SelectionFilter(), entries);
    }

    reply.Set(paramCameraSelection, CameraNames::SelectionText(entries));
    return success;
}

std::int32_t VCommandProviderCameraSettings::SetSelection(const IParameters& input,
                                                          IParameters& /*reply*/) const
{
    std::vector<VSelectionEntry> selection;
    for (const std::wstring& token :
         KVR::SplitTokens(input.Get(paramCameraSelection), L',', L'"', L" \t\n\r")) {
        if (const auto number = KVR::DeviceTextToUInt32(KVR::WideToUtf8(token))) {
            selection.emplace_back(CameraNames::CameraId(*number));
        }
    }

    if (const auto view = selectionSource ? selectionSource->GetView() : nullptr) {
        view->SetSelection(selection, CameraNames::SelectionFilter());
    }
    return success;
}

// Deliberate: the command sets what it is given and toggles nothing, in spite of its name; anything
// but exactly "1" is off. Devices send the state that they want.
std::int32_t VCommandProviderCameraSettings::ToggleTap(const IParameters& input,
                                                       IParameters& /*reply*/) const
{
    const bool enabled = input.Get(CameraNames::ParamTapEnabled) == L"1";
    if (const std::shared_ptr<IDevice> system = FindSystem()) {
        if (const auto parameter = system->GetParameter(CameraNames::EnableTapToSelect)) {
            // Whether the host took it is not told: the event that follows a change tells it.
            (void)parameter->SetValue(MakeBoolValue(enabled));
        }
    }
    return success;
}

std::int32_t VCommandProviderCameraSettings::GetTapEnabled(const IParameters& /*input*/,
                                                           IParameters& reply) const
{
    if (const std::shared_ptr<IDevice> system = FindSystem()) {
        if (const auto parameter = system->FindParameter(CameraNames::EnableTapToSelect)) {
            reply.Set(CameraNames::ParamTapEnabled, ReadBool(parameter->GetValue()) ? L"1" : L"0");
        }
    }
    return success;
}

std::shared_ptr<IDevice> VCommandProviderCameraSettings::FindCamera(const IParameters& input) const
{
    const auto number = KVR::DeviceTextToUInt32(KVR::WideToUtf8(input.Get(paramCameraDeviceId)));
    if (!number) {
        Trace("Invalid camera ID.");
        return nullptr;
    }

    const std::string id = CameraNames::CameraId(*number);
    std::shared_ptr<IDevice> camera =
        settingsSource ? settingsSource->GetDevice(CameraNames::DeviceClass, id) : nullptr;
    if (!camera) {
        KVR_LOG(logCategory, tracing, "Camera not found: %s.", id);
    }
    return camera;
}

std::shared_ptr<IDevice> VCommandProviderCameraSettings::FindSystem() const
{
    return settingsSource
               ? settingsSource->GetDevice(CameraNames::SystemClass, CameraNames::SystemId)
               : nullptr;
}
