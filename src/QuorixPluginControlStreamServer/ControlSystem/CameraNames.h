#pragma once

#include "QuorixPluginInterface/SelectionEntry.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

/// How cameras and their settings are named: to the host by device class, id and parameter, to
/// devices by number and by parameters of commands and events.
namespace CameraNames {

constexpr char DeviceClass[] = "Device";
constexpr char SystemClass[] = "System";
constexpr char SystemId[] = "Gen6System";

constexpr char Name[] = "Name";
constexpr char UserId[] = "UserId";
constexpr char DisplayType[] = "DisplayType";
constexpr char StrobeIntensity[] = "StrobeIntensity";
constexpr char Threshold[] = "Threshold";
constexpr char ShutterDuration[] = "ShutterDuration";
constexpr char GreyscaleMode[] = "GreyscaleMode";
constexpr char EnableTapToSelect[] = "EnableTapToSelect";

/// The parameter of the two tap commands and of the tap event alike.
constexpr wchar_t ParamTapEnabled[] = L"Param_TapEnabled";

/// Returns the device id of a camera: "qx:" and its number in decimal.
std::string CameraId(std::uint32_t number);

/// Returns the number behind "qx:"; empty unless only digits follow that fit 32 bits. Leading zeros
/// pass: "qx:007" is 7.
std::optional<std::uint32_t> CameraNumber(const std::string& deviceId);

/// Returns the numbers of the selected cameras in decimal, separated by commas. Entries that name
/// no camera are skipped.
std::wstring SelectionText(const std::vector<VSelectionEntry>& entries);

/// The filter by which the host's selection is asked for cameras.
const std::vector<std::int32_t>& SelectionFilter();

} // namespace CameraNames
