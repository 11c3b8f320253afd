#pragma once

/// Names by which parts of the host speak of control devices. The authorization itself neither
/// reads nor writes anything under them.
namespace ControlDeviceNames {

constexpr char device[] = "ControlDevice";
constexpr char name[] = "ControlDeviceName";
constexpr char selected[] = "ControlDeviceSelected";
constexpr char connected[] = "ControlDeviceConnected";
constexpr char authorized[] = "ControlDeviceAuthorized";

} // namespace ControlDeviceNames
