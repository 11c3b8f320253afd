#pragma once

#include "QuorixDataStore/DataPath.h"
#include "io/DataValue.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace QuorixHost {

/// The least and the greatest number that a device's hardware takes.
struct VNumberRange
{
    double Least = 0.0;
    double Greatest = 0.0;
};

/// One setting of a simulated device.
struct VSettingModel
{
    std::string Name;                  ///< by which devices and the console know it
    VDataPath Path;                    ///< where it lies in the store
    VDataValue Initial;                ///< also gives the schema of all later values
    std::optional<VNumberRange> Range; ///< only of a double
    bool Held = false;                 ///< a calibration holds it: every write is refused
};

/// A simulated device as it appears.
struct VDeviceModel
{
    std::string Class;
    std::string Id;
    VDataPath Path; ///< of the device; everything of it lies below
    std::vector<VSettingModel> Settings;
};

/// Returns the id of a camera: "qx:" and its number in decimal.
std::string CameraId(std::uint32_t number);

/// Returns the number of a camera by its id, empty for any other text. Leading zeros are no id.
std::optional<std::uint32_t> CameraNumber(const std::string& deviceId);

/// Describes a camera. Cameras differ on purpose, so that a device meets one of each kind: 1 has
/// every setting, 2 is an optical camera without a shutter, 3 is a video camera without a
/// threshold, 4 is being calibrated and refuses a new threshold, 5 is a passive one without strobe
/// and greyscale. The kinds come round again from 6 on.
VDeviceModel MakeCameraModel(std::uint32_t number);

/// Describes the one device that stands for the whole system.
VDeviceModel MakeSystemModel();

/// Returns the value that the hardware confirms upon a proposal: the nearest one in its range, and
/// for what is no number the one that it has. A raw greyscale number outside the enumeration is
/// taken as it stands.
VDataValue ConfirmedValue(const VSettingModel& setting, const VDataValue& proposed,
                          const VDataValue& verified);

} // namespace QuorixHost
