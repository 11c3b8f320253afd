#pragma once

#include "QuorixDataStore/DataPath.h"

#include <cstdint>

/// The well-known places in the data store.
namespace WellKnownPaths {

VDataPath ApplicationSettings();
VDataPath CaptureTakeSettings();
VDataPath CaptureSettings();
VDataPath FileNameStem();
VDataPath Cameras();
VDataPath CameraCalibration();
VDataPath CalibrationOrientation();
VDataPath CalibrationVolumeProperties();
VDataPath Graph();
VDataPath ObjectPresets();
VDataPath Preferences();
VDataPath SystemPreferences(); ///< the content of System.Prefs
VDataPath CaptureFolder();
VDataPath UserPreferences(); ///< the content of User.Prefs
VDataPath Slaves();
VDataPath Subjects();
VDataPath Subject(std::uint64_t index);
VDataPath System();

} // namespace WellKnownPaths
