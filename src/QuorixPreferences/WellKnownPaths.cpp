#include "QuorixPreferences/WellKnownPaths.h"

#include <string>

namespace WellKnownPaths {

VDataPath ApplicationSettings()
{
    return {"ApplicationSettings"};
}

VDataPath CaptureTakeSettings()
{
    return {"ApplicationSettings", "CaptureTake"};
}

VDataPath CaptureSettings()
{
    return {"ApplicationSettings", "Capture"};
}

VDataPath FileNameStem()
{
    return {"ApplicationSettings", "Capture", "FileNameStem"};
}

VDataPath Cameras()
{
    return {"Camera"};
}

VDataPath CameraCalibration()
{
    return {"CameraCalibration"};
}

VDataPath CalibrationOrientation()
{
    return {"CameraCalibration", "Orientation"};
}

VDataPath CalibrationVolumeProperties()
{
    return {"CameraCalibration", "VolumeProperties"};
}

VDataPath Graph()
{
    return {"Graph"};
}

VDataPath ObjectPresets()
{
    return {"ObjectPreset"};
}

VDataPath Preferences()
{
    return {"Preferences"};
}

VDataPath SystemPreferences()
{
    return {"Preferences", "System"};
}

VDataPath CaptureFolder()
{
    return {"Preferences", "System", "Directory"};
}

VDataPath UserPreferences()
{
    return {"Preferences", "User"};
}

VDataPath Slaves()
{
    return {"Slaves"};
}

VDataPath Subjects()
{
    return {"Subject"};
}

VDataPath Subject(std::uint64_t index)
{
    return VDataPath{"Subject", std::to_string(index)};
}

VDataPath System()
{
    return {"System"};
}

} // namespace WellKnownPaths
