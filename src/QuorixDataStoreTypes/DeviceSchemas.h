#pragma once

#include "QuorixDataStore/DataPath.h"
#include "QuorixDataStore/DataToken.h"

#include <cstdint>
#include <string>

/// Where the data of devices lie in the store, so that nobody writes such a path by hand. What type
/// a value has is settled by whoever first writes it.
///
/// A device's path is a class root and the device's identifier; below it are sections and values.
/// Threads: every function [any]; none takes a lock of a store. Failure: none; a path that was made
/// of bad input finds nothing.
namespace DeviceSchemas {

/// Returns the path of a device: its class root and its identifier, as one component each.
///
/// An empty root becomes "InvalidDeviceClass" and an empty identifier "qx:000000"; that is logged,
/// at most once in 30 seconds, with the count of such calls so far.
VDataPath MakeDevicePath(const VDataPath& classRoot, const std::string& deviceIdentifier);

/// The class roots. Each has `<Name>Root()`, which returns the path of that one component, and
/// `<Name>Device(identifier)`, which returns the path of a device through `MakeDevicePath`.
#define KVR_DEVICE_CLASSES(declare)                                                                \
    declare(ApplicationSettings) declare(Device) declare(Subject) declare(System)                  \
        declare(Gen6System) declare(PavoSystem) declare(VideoInput) declare(Host) declare(Camera)  \
            declare(IMUHub)

/// The sections of a device, as name and component. Each has `<Name>Section(devicePath)`, which
/// returns the path of the section.
#define KVR_DEVICE_SECTIONS(declare)                                                               \
    declare(General, "General") declare(Firmware, "Firmware") declare(Hardware, "Hardware")        \
        declare(Timecode, "Timecode") declare(Network, "Network") declare(Settings, "Settings")    \
            declare(Warnings, "Warnings") declare(Calibration, "Calibration")                      \
                declare(MaskGrid, "MaskGrid") declare(Progress, "Progress")                        \
                    declare(Internal, "Internal") declare(PhysicalStatus, "PhysicalStatus")        \
                        declare(PhysicalSensorData, "PhysicalSensorData")                          \
                            declare(CalibrationDetails, "CalibrationDetails")                      \
                                declare(Sensor, "Sensor")                                          \
                                    declare(GenlockAndTimecode, "Genlock and Timecode")

/// The values of a device, as section and name. Each has `<Name>Path(devicePath)`,
/// `<Name>Token(devicePath)`, and `<Name>Leaf()`, which returns the last component.
// Deliberate: TimeOffsetFrames lies under Timecode and its sibling TimeOffsetTicks under Settings,
// since configuration files that exist use these paths.
#define KVR_DEVICE_VALUES(declare)                                                                 \
    declare(Settings, CaptureDirectory) declare(Settings, Connected) declare(                      \
        Settings, ConnectionCount) declare(Hardware, DisplayType) declare(Settings, Enabled)       \
        declare(Settings, Name) declare(Settings, ProcessInRealtime) declare(Hardware, Type)       \
            declare(Settings, UserId) declare(Settings, VideoContainer)                            \
                declare(Settings, VideoPayload) declare(Settings, AudioPayload)                    \
                    declare(Settings, Master) declare(Settings, ContributingTimecode)              \
                        declare(Settings, ContributingAnalogue)                                    \
                            declare(Settings, ContributingCentroids)                               \
                                declare(Settings, ContributingGreyscale)                           \
                                    declare(Settings, ContributingVideo)                           \
                                        declare(Settings, Contributions)                           \
                                            declare(Settings, VideoModeEnabled)                    \
                                                declare(Timecode, TimeOffsetFrames)                \
                                                    declare(Settings, TimeOffsetTicks)             \
                                                        declare(Settings, UseTimecodeForSync)

#define KVR_DECLARE_CLASS(name)                                                                    \
    const VDataPath& name##Root();                                                                 \
    VDataPath name##Device(const std::string& deviceIdentifier);
KVR_DEVICE_CLASSES(KVR_DECLARE_CLASS)
#undef KVR_DECLARE_CLASS

#define KVR_DECLARE_SECTION(name, component) VDataPath name##Section(const VDataPath& devicePath);
KVR_DEVICE_SECTIONS(KVR_DECLARE_SECTION)
#undef KVR_DECLARE_SECTION

/// Returns the path of an analogue card: "AnalogueCard" directly followed by its number.
VDataPath AnalogueCardSection(const VDataPath& devicePath, std::uint32_t card);

#define KVR_DECLARE_VALUE(section, name)                                                           \
    const std::string& name##Leaf();                                                               \
    VDataPath name##Path(const VDataPath& devicePath);                                             \
    VDataToken name##Token(const VDataPath& devicePath);
KVR_DEVICE_VALUES(KVR_DECLARE_VALUE)
#undef KVR_DECLARE_VALUE

/// Puts another clock, in nanoseconds from any start, in place of the monotonic one that spaces the
/// lines of `MakeDevicePath`, for tests. Null brings the monotonic one back.
void SetLogClock(std::int64_t (*nanoseconds)());

} // namespace DeviceSchemas
