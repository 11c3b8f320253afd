#include "WireDevice.h"

#include <gmock/gmock.h>

#include <csignal>
#include <memory>
#include <string>
#include <thread>
#include <vector>

// What every device hears of the host's cameras.

using namespace CameraTest;
using namespace std::string_literals;
using testing::HasSubstr;

namespace {

class CameraEventsWire : public testing::Test
{
protected:
    /// What a sanitizer has found in the host shows in its exit code.
    void TearDown() override
    {
        if (!host.WaitExit(std::chrono::milliseconds(0))) {
            TestSupport::ExpectOrderlyEnd(host);
        }
    }

    /// Expects that both devices hear this next.
    void ExpectEvent(const std::string& event)
    {
        EXPECT_EQ(event, first.NextEvent());
        EXPECT_EQ(event, second.NextEvent());
    }

    /// Expects that there was no event since the last one: the next is one that is made now.
    void ExpectNoEvent()
    {
        EXPECT_EQ("ok", host.Command("notify Device qx:2 Threshold 1"));
        ExpectEvent(SettingChanged("2", "Threshold", "0.25"));
    }

    TestSupport::VRunningHost host;
    VWireDevice first;
    VWireDevice second;
};

} // namespace

TEST_F(CameraEventsWire, AreListedInOrder)
{
    EXPECT_EQ(declaration + "<Events><Event>Event.Authorize</Event><Event>Event.Disconnect</Event>"
                            "<Event>Event.Cameras.SelectionChanged</Event>"
                            "<Event>Event.Cameras.NameChanged</Event>"
                            "<Event>Event.Cameras.UserIdChanged</Event>"
                            "<Event>Event.Cameras.GreyscaleModeChanged</Event>"
                            "<Event>Event.Cameras.SettingChanged</Event>"
                            "<Event>Event.Cameras.TapToSelectChanged</Event></Events>",
              first.client.Request("<Events/>"));
}

TEST_F(CameraEventsWire, ASettingThatTheUserChangesIsHeardByteForByte)
{
    EXPECT_EQ("ok", host.Command("set Device qx:1 StrobeIntensity 0.75"));
    EXPECT_EQ(R"(ok "0.75")", host.Command("get Device qx:1 StrobeIntensity"));

    const std::string event =
        "\x54\x01\x00\x00"
        "<?xml version=\"1.0\" encoding=\"UTF-16\" standalone=\"no\"?>"
        "<Event><Name>Event.Cameras.SettingChanged</Name><Parameters>"
        "<Parameter><Name>CameraId</Name><Value>1</Value></Parameter>"
        "<Parameter><Name>SettingName</Name><Value>StrobeIntensity</Value></Parameter>"
        "<Parameter><Name>SettingValue</Name><Value>0.75</Value></Parameter>"
        "</Parameters></Event>"s;
    EXPECT_EQ(event, first.client.ReadBytes(event.size()));
    EXPECT_EQ(event, second.client.ReadBytes(event.size()));
}

TEST_F(CameraEventsWire, ASettingThatADeviceChangesIsHeardByAllItselfIncluded)
{
    first.Run("CameraSettings_SetCentroidThreshold",
              {{"Param_CameraDeviceId", "2"}, {"Param_CentroidThreshold", "0.75"}});
    ExpectEvent(SettingChanged("2", "Threshold", "0.75"));

    second.Run("CameraSettings_SetShutterDuration",
               {{"Param_CameraDeviceId", "3"}, {"Param_ShutterDuration", "0.75"}});
    ExpectEvent(SettingChanged("3", "ShutterDuration", "0.75"));
}

TEST_F(CameraEventsWire, GreyscaleModesAreHeardByTheirTextsAndANumberWithoutOneAsEmpty)
{
    const char* const cases[][2] = {{"0", "Auto"},  {"1", "None"},     {"2", "All"}, {"3", "Only"},
                                    {"4", "Edges"}, {"5", "No Edges"}, {"6", ""},    {"-1", ""}};
    for (const auto& [number, text] : cases) {
        EXPECT_EQ("ok", host.Command(std::string("mode 4 ") + number));
        ExpectEvent(Event("Event.Cameras.GreyscaleModeChanged",
                          {{"CameraId", "4"}, {"GreyscaleMode", text}}));
    }
    first.Run("CameraSettings_SetGreyscaleMode",
              {{"Param_CameraDeviceId", "4"}, {"Param_GreyscaleMode", "Only"}});
    ExpectEvent(Event("Event.Cameras.GreyscaleModeChanged",
                      {{"CameraId", "4"}, {"GreyscaleMode", "Only"}}));
}

TEST_F(CameraEventsWire, NamesUserIdsAndTapAreHeard)
{
    EXPECT_EQ("ok", host.Command("set Device qx:2 Name Left \xD0\xBC"));
    ExpectEvent(
        Event("Event.Cameras.NameChanged",
              {{"CameraId", "2"}, {"CameraName", "Left \xD0\xBC"}, {"CameraType", "Optical"}}));

    EXPECT_EQ("ok", host.Command("set Device qx:2 UserId 4294967295"));
    ExpectEvent(
        Event("Event.Cameras.UserIdChanged", {{"CameraId", "2"}, {"UserId", "4294967295"}}));

    EXPECT_EQ("ok", host.Command("set System Gen6System EnableTapToSelect true"));
    ExpectEvent(Event("Event.Cameras.TapToSelectChanged", {{"Param_TapEnabled", "1"}}));
    first.Run("CameraSettings_ToggleTap", {{"Param_TapEnabled", "0"}});
    ExpectEvent(Event("Event.Cameras.TapToSelectChanged", {{"Param_TapEnabled", "0"}}));
}

TEST_F(CameraEventsWire, TheSelectionIsHeardAndDeliberatelyNotItsClearing)
{
    EXPECT_EQ("ok", host.Command("select 2,1"));
    ExpectEvent(Event("Event.Cameras.SelectionChanged", {{"SelectedCameraIds", "2,1"}}));

    EXPECT_EQ("ok", host.Command("select"));
    ExpectNoEvent();

    first.Run("CameraSettings_SetSelection", {{"Param_CameraSelection", "3"}});
    ExpectEvent(Event("Event.Cameras.SelectionChanged", {{"SelectedCameraIds", "3"}}));
    first.Run("CameraSettings_SetSelection", {{"Param_CameraSelection", ""}});
    ExpectNoEvent();
}

TEST_F(CameraEventsWire, WhatIsRefusedOrStaysAsItIsIsNotHeard)
{
    first.Run("CameraSettings_SetCentroidThreshold",
              {{"Param_CameraDeviceId", "4"}, {"Param_CentroidThreshold", "0.75"}});
    EXPECT_EQ("error: Device.qx:4.Settings.Threshold refuses to be changed",
              host.Command("set Device qx:4 Threshold 0.75"));
    EXPECT_EQ("ok", host.Command("set Device qx:1 StrobeIntensity 0.5"));
    EXPECT_EQ("ok", host.Command("set Device qx:1 DisplayType Other"));

    ExpectNoEvent();
}

TEST_F(CameraEventsWire, ANotificationOfTheSameValueIsHeard)
{
    EXPECT_EQ("ok", host.Command("notify Device qx:1 StrobeIntensity 3"));
    for (int i = 0; i < 3; ++i) {
        ExpectEvent(SettingChanged("1", "StrobeIntensity", "0.5"));
    }
    ExpectNoEvent();
}

TEST_F(CameraEventsWire, OfACameraThatComesAndGoesAreHeardOnceAndNoMore)
{
    EXPECT_EQ("ok", host.Command("add 7"));
    EXPECT_EQ("ok", host.Command("set Device qx:7 StrobeIntensity 0.75"));
    ExpectEvent(SettingChanged("7", "StrobeIntensity", "0.75"));

    EXPECT_EQ("ok", host.Command("notify Device qx:7 StrobeIntensity 1"));
    ExpectEvent(SettingChanged("7", "StrobeIntensity", "0.75"));
    EXPECT_EQ("ok", host.Command("remove 7"));
    ExpectNoEvent();

    EXPECT_EQ("ok", host.Command("add 7"));
    EXPECT_EQ("ok", host.Command("set Device qx:7 StrobeIntensity 0.8"));
    ExpectEvent(SettingChanged("7", "StrobeIntensity", "0.8"));
    ExpectNoEvent();
}

TEST_F(CameraEventsWire, ABurstOf1000ReachesEachOf50DevicesCompleteAndInOrder)
{
    constexpr int deviceCount = 50;
    std::vector<std::unique_ptr<VWireDevice>> devices;
    for (int i = 0; i < deviceCount; ++i) {
        devices.push_back(std::make_unique<VWireDevice>());
    }

    EXPECT_EQ("ok", host.Command("notify Device qx:1 StrobeIntensity 600"));
    EXPECT_EQ("ok", host.Command("notify Device qx:2 Threshold 400"));
    EXPECT_EQ("ok", host.Command("notify Device qx:3 ShutterDuration 1"));

    const std::string expected[] = {SettingChanged("1", "StrobeIntensity", "0.5"),
                                    SettingChanged("2", "Threshold", "0.25"),
                                    SettingChanged("3", "ShutterDuration", "0.1")};
    for (int i = 0; i <= 1000; ++i) {
        for (const auto& device : devices) {
            ASSERT_EQ(expected[i < 600 ? 0 : i < 1000 ? 1 : 2], device->NextEvent()) << i;
        }
    }
}

TEST_F(CameraEventsWire, ChangesThatAreConfirmedOneByOneAreHeardInOrder)
{
    for (int i = 1; i < 40; ++i) {
        const std::string value = "0." + std::to_string(101 + 2 * i);
        EXPECT_EQ("ok", host.Command("set Device qx:1 StrobeIntensity " + value));
        EXPECT_EQ("ok \"" + value + "\"", host.Command("get Device qx:1 StrobeIntensity"));
        ExpectEvent(SettingChanged("1", "StrobeIntensity", value));
    }
    ExpectNoEvent();
}

TEST_F(CameraEventsWire, AHostInTheMiddleOfABurstStopsInOrder)
{
    EXPECT_EQ("ok", host.Command("notify Device qx:1 StrobeIntensity 1000000"));
    EXPECT_EQ("ok", host.Command("set Device qx:2 StrobeIntensity 0.75"));
    EXPECT_EQ(SettingChanged("1", "StrobeIntensity", "0.5"), first.NextEvent());

    host.Signal(SIGTERM);
    // Both read on, as devices do.
    std::thread reader([this] { first.client.ReadToEnd(); });
    second.client.ReadToEnd();
    reader.join();

    EXPECT_EQ(0, host.WaitExit().value_or(-1)) << host.Errors();
    EXPECT_THAT(host.Errors(), HasSubstr("Stopped"));
}

TEST_F(CameraEventsWire, ADeviceThatReadsNothingHoldsUpTheStopUntilItGoes)
{
    TestSupport::ExpectGreatTextToFillBuffers();
    second.client.Close();
    auto idle = std::make_unique<VWireDevice>(4096); // behind the first on the host's list
    EXPECT_EQ("ok", host.Command("set Device qx:1 Name " + TestSupport::GreatText()));
    first.NextEvent();
    ASSERT_TRUE(idle->client.AwaitReadable()); // the first bytes are there, the last cannot be
    EXPECT_EQ("ok", host.Command("set Device qx:2 StrobeIntensity 0.75")); // the console goes on

    host.Signal(SIGTERM);
    EXPECT_TRUE(host.WaitForError("The stop is held up."));
    idle.reset();

    EXPECT_EQ(0, host.WaitExit().value_or(-1)) << host.Errors();
}
