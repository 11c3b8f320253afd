#include "QuorixPreferences/WellKnownPaths.h"

#include <gtest/gtest.h>

namespace {

using namespace WellKnownPaths;

TEST(WellKnownPaths, AreSpelledAsFilesHaveThem)
{
    const std::pair<VDataPath, const char*> paths[] = {
        {ApplicationSettings(), "ApplicationSettings"},
        {CaptureTakeSettings(), "ApplicationSettings.CaptureTake"},
        {CaptureSettings(), "ApplicationSettings.Capture"},
        {FileNameStem(), "ApplicationSettings.Capture.FileNameStem"},
        {Cameras(), "Camera"},
        {CameraCalibration(), "CameraCalibration"},
        {CalibrationOrientation(), "CameraCalibration.Orientation"},
        {CalibrationVolumeProperties(), "CameraCalibration.VolumeProperties"},
        {Graph(), "Graph"},
        {ObjectPresets(), "ObjectPreset"},
        {Preferences(), "Preferences"},
        {SystemPreferences(), "Preferences.System"},
        {CaptureFolder(), "Preferences.System.Directory"},
        {UserPreferences(), "Preferences.User"},
        {Slaves(), "Slaves"},
        {Subjects(), "Subject"},
        {Subject(0), "Subject.0"},
        {Subject(1234567), "Subject.1234567"},
        {System(), "System"},
    };
    for (const auto& [path, text] : paths) {
        EXPECT_EQ(path.Text(), text);
        EXPECT_EQ(path, VDataPath(text));
    }
}

} // namespace
