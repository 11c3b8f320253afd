#include "cameras/DeviceModel.h"

#include "QuorixDataStoreTypes/GreyscaleMode.h"
#include "io/Values.h"

#include <gmock/gmock.h>

#include <cmath>
#include <limits>
#include <string>
#include <vector>

using namespace QuorixHost;
using testing::ElementsAre;

namespace {

std::vector<std::string> SettingNames(std::uint32_t number)
{
    std::vector<std::string> names;
    for (const VSettingModel& setting : MakeCameraModel(number).Settings) {
        names.push_back(setting.Name);
    }
    return names;
}

VSettingModel Find(const VDeviceModel& device, const std::string& name)
{
    for (const VSettingModel& setting : device.Settings) {
        if (setting.Name == name) {
            return setting;
        }
    }
    return {};
}

double Confirmed(const VSettingModel& setting, double proposed, double verified)
{
    double number = -1.0;
    EXPECT_TRUE(ReadValue(
        ConfirmedValue(setting, MakeDoubleValue(proposed), MakeDoubleValue(verified)), number));
    return number;
}

} // namespace

TEST(DeviceModel, CamerasDifferOnPurpose)
{
    // clang-format off
    EXPECT_THAT(SettingNames(1), ElementsAre("Name", "UserId", "DisplayType", "StrobeIntensity", "Threshold", "ShutterDuration", "GreyscaleMode"));
    EXPECT_THAT(SettingNames(2), ElementsAre("Name", "UserId", "DisplayType", "StrobeIntensity", "Threshold", "GreyscaleMode"));
    EXPECT_THAT(SettingNames(3), ElementsAre("Name", "UserId", "DisplayType", "StrobeIntensity", "ShutterDuration", "GreyscaleMode"));
    EXPECT_THAT(SettingNames(4), ElementsAre("Name", "UserId", "DisplayType", "StrobeIntensity", "Threshold", "ShutterDuration", "GreyscaleMode"));
    EXPECT_THAT(SettingNames(5), ElementsAre("Name", "UserId", "DisplayType", "Threshold", "ShutterDuration"));
    // clang-format on
    EXPECT_FALSE(Find(MakeCameraModel(1), "Threshold").Held);
    EXPECT_TRUE(Find(MakeCameraModel(4), "Threshold").Held);
    EXPECT_FALSE(Find(MakeCameraModel(4), "StrobeIntensity").Held);
}

TEST(DeviceModel, TheKindsComeRoundAgain)
{
    EXPECT_EQ(SettingNames(1), SettingNames(6));
    EXPECT_EQ(SettingNames(3), SettingNames(8));
    EXPECT_EQ(SettingNames(5), SettingNames(0));
    EXPECT_EQ(SettingNames(5), SettingNames(4294967295U));
}

TEST(DeviceModel, TellsNamesUserIdsAndTypes)
{
    const VDeviceModel camera = MakeCameraModel(2);

    EXPECT_EQ("Device", camera.Class);
    EXPECT_EQ("qx:2", camera.Id);
    EXPECT_EQ("Camera 2", ReadString(Find(camera, "Name").Initial));
    EXPECT_EQ(102U, ReadUInt32OrZero(Find(camera, "UserId").Initial));
    EXPECT_EQ("Optical", ReadString(Find(camera, "DisplayType").Initial));
    EXPECT_EQ("Video", ReadString(Find(MakeCameraModel(3), "DisplayType").Initial));
    EXPECT_EQ(&GreyscaleModeSchema(), Find(camera, "GreyscaleMode").Initial.Schema);
}

TEST(DeviceModel, ValuesLieWhereTheStoresSchemasHaveThem)
{
    const VDeviceModel camera = MakeCameraModel(1);
    const VDeviceModel system = MakeSystemModel();

    EXPECT_EQ("Device.qx:1", camera.Path.Text());
    EXPECT_EQ("Device.qx:1.Settings.Name", Find(camera, "Name").Path.Text());
    EXPECT_EQ("Device.qx:1.Settings.UserId", Find(camera, "UserId").Path.Text());
    EXPECT_EQ("Device.qx:1.Hardware.DisplayType", Find(camera, "DisplayType").Path.Text());
    EXPECT_EQ("Device.qx:1.Settings.StrobeIntensity", Find(camera, "StrobeIntensity").Path.Text());
    EXPECT_EQ("Device.qx:1.Settings.Threshold", Find(camera, "Threshold").Path.Text());
    EXPECT_EQ("Device.qx:1.Settings.ShutterDuration", Find(camera, "ShutterDuration").Path.Text());
    EXPECT_EQ("Device.qx:1.Settings.GreyscaleMode", Find(camera, "GreyscaleMode").Path.Text());
    EXPECT_EQ("System", system.Class);
    EXPECT_EQ("Gen6System", system.Id);
    EXPECT_EQ("System.Gen6System.Settings.EnableTapToSelect",
              Find(system, "EnableTapToSelect").Path.Text());
}

TEST(DeviceModel, CameraIdsReadBack)
{
    EXPECT_EQ(7U, CameraNumber("qx:7"));
    EXPECT_EQ(0U, CameraNumber("qx:0"));
    EXPECT_EQ(4294967295U, CameraNumber(CameraId(4294967295U)));
    for (const char* other : {"", "qx:", "qx:07", "qx:+7", "qx:7 ", "qx:4294967296", "QX:7", "7",
                              "qx:99999999999999999999"}) {
        EXPECT_EQ(std::nullopt, CameraNumber(other)) << other;
    }
}

TEST(DeviceModel, NumbersAreConfirmedWithinTheRangeThatDevicesAreTold)
{
    const VDeviceModel camera = MakeCameraModel(1);
    const VSettingModel strobe = Find(camera, "StrobeIntensity");
    const VSettingModel threshold = Find(camera, "Threshold");
    const VSettingModel shutter = Find(camera, "ShutterDuration");
    constexpr double infinity = std::numeric_limits<double>::infinity();

    EXPECT_EQ(0.75, Confirmed(strobe, 0.75, 0.5));
    EXPECT_EQ(0.0, Confirmed(strobe, 0.0, 0.5));
    EXPECT_EQ(1.0, Confirmed(strobe, 1.0, 0.5));
    EXPECT_EQ(1.0, Confirmed(strobe, 5.0, 0.5));
    EXPECT_EQ(0.0, Confirmed(strobe, -0.001, 0.5));
    EXPECT_EQ(1.0, Confirmed(strobe, infinity, 0.5));
    EXPECT_EQ(0.0, Confirmed(strobe, -infinity, 0.5));
    EXPECT_EQ(1.0, Confirmed(threshold, 1.5, 0.5));
    EXPECT_EQ(0.0, Confirmed(threshold, -1.5, 0.5));
    EXPECT_EQ(1.0, Confirmed(shutter, 1.5, 0.5));
    EXPECT_EQ(0.01, Confirmed(shutter, 0.0, 0.5));
    EXPECT_EQ(0.01, Confirmed(shutter, 0.01, 0.5));
}

TEST(DeviceModel, WhatIsNoNumberIsAnsweredByTheVerifiedOne)
{
    EXPECT_EQ(0.5, Confirmed(Find(MakeCameraModel(1), "StrobeIntensity"), std::nan(""), 0.5));
}

TEST(DeviceModel, EverythingElseIsConfirmedAsItStands)
{
    const VDeviceModel camera = MakeCameraModel(1);
    const VDataValue mode = MakeEnumValue(GreyscaleModeSchema(), 6);
    const VDataValue name = MakeStringValue("X");

    EXPECT_EQ(mode, ConfirmedValue(Find(camera, "GreyscaleMode"), mode,
                                   Find(camera, "GreyscaleMode").Initial));
    EXPECT_EQ(name, ConfirmedValue(Find(camera, "Name"), name, Find(camera, "Name").Initial));
}
