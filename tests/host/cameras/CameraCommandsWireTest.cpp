#include "WireDevice.h"

#include <gmock/gmock.h>

#include <string>
#include <thread>
#include <vector>

// The camera commands as a device runs them on a host with a camera of each kind.

using namespace CameraTest;
using testing::HasSubstr;

namespace {

class CameraCommandsWire : public testing::Test
{
protected:
    /// What a sanitizer has found in the host shows in its exit code.
    void TearDown() override
    {
        if (!host.WaitExit(std::chrono::milliseconds(0))) {
            TestSupport::ExpectOrderlyEnd(host);
        }
    }

    /// Returns what the console shows of a parameter of camera 1.
    std::string Shown(const std::string& parameter)
    {
        return host.Command("get Device qx:1 " + parameter);
    }

    TestSupport::VRunningHost host{{"--headless", "--console", "--cameras", "5"}};
    VWireDevice device;
};

const char* const noSetting = "Error: Invalid Parameter Name";
const char* const noAccess = "Error: Unable to access requested data.";
const char* const readOnly = "Error: Unable to modify read only data.";
const char* const unknown = "Error: An unknown error occurred.";

} // namespace

TEST_F(CameraCommandsWire, AreListedBehindTheHostsOwn)
{
    EXPECT_EQ(declaration +
                  "<Correlation>7</Correlation><Commands><Command>Host.Information</Command>"
                  "<Command>Host.Echo</Command>"
                  "<Command>System.Authorize</Command>"
                  "<Command>System.Authorize.Cancel</Command>"
                  "<Command>System.Heartbeat</Command>"
                  "<Command>CameraSettings_EnableStrobes</Command>"
                  "<Command>CameraSettings_DisableStrobes</Command>"
                  "<Command>CameraSettings_GetStrobeIntensity</Command>"
                  "<Command>CameraSettings_SetStrobeIntensity</Command>"
                  "<Command>CameraSettings_GetCentroidThreshold</Command>"
                  "<Command>CameraSettings_SetCentroidThreshold</Command>"
                  "<Command>CameraSettings_GetShutterDuration</Command>"
                  "<Command>CameraSettings_SetShutterDuration</Command>"
                  "<Command>CameraSettings_GetGreyscaleMode</Command>"
                  "<Command>CameraSettings_SetGreyscaleMode</Command>"
                  "<Command>CameraSettings_GetSelection</Command>"
                  "<Command>CameraSettings_SetSelection</Command>"
                  "<Command>CameraSettings_ToggleTap</Command>"
                  "<Command>CameraSettings_GetTapEnabled</Command></Commands>",
              device.client.Request("<Commands><Correlation>7</Correlation></Commands>"));
}

TEST_F(CameraCommandsWire, ReadersAnswerByWhatTheCameraHas)
{
    struct VCase
    {
        const char* command;
        const char* camera;
        const char* result;
        Parameters reply;
    };
    // clang-format off
    const VCase cases[] = {
        {"CameraSettings_GetStrobeIntensity",   "1", "OK", {{"Param_StrobeIntensity", "0.5"}}},
        {"CameraSettings_GetStrobeIntensity",   "2", "OK", {{"Param_StrobeIntensity", "0.5"}}},
        {"CameraSettings_GetStrobeIntensity",   "3", "OK", {{"Param_StrobeIntensity", "0.5"}}},
        {"CameraSettings_GetStrobeIntensity",   "5", noSetting, {}},
        {"CameraSettings_GetStrobeIntensity",   "6", noAccess, {}},
        {"CameraSettings_GetStrobeIntensity",   "x", noAccess, {}},
        {"CameraSettings_GetStrobeIntensity",   "",  noAccess, {}},
        {"CameraSettings_GetStrobeIntensity",   "007", noAccess, {}},
        {"CameraSettings_GetStrobeIntensity",   "001", "OK", {{"Param_StrobeIntensity", "0.5"}}},
        {"CameraSettings_GetCentroidThreshold", "1", "OK", {{"Param_CentroidThreshold", "0.25"}}},
        {"CameraSettings_GetCentroidThreshold", "2", "OK", {{"Param_CentroidThreshold", "0.25"}}},
        {"CameraSettings_GetCentroidThreshold", "3", noSetting, {}},
        {"CameraSettings_GetCentroidThreshold", "4", "OK", {{"Param_CentroidThreshold", "0.25"}}},
        {"CameraSettings_GetCentroidThreshold", "6", noAccess, {}},
        {"CameraSettings_GetShutterDuration",   "1", "OK", {{"Param_ShutterDuration", "0.1"}}},
        {"CameraSettings_GetShutterDuration",   "2", noSetting, {}},
        {"CameraSettings_GetShutterDuration",   "3", "OK", {{"Param_ShutterDuration", "0.1"}}},
        {"CameraSettings_GetShutterDuration",   "6", noAccess, {}},
        {"CameraSettings_GetGreyscaleMode",     "5", noSetting, {}},
        {"CameraSettings_GetGreyscaleMode",     "6", noAccess, {}},
    };
    // clang-format on
    for (const VCase& row : cases) {
        EXPECT_EQ(Reply(row.command, row.result, row.reply),
                  device.Run(row.command, {{"Param_CameraDeviceId", row.camera}}))
            << row.camera;
    }
    EXPECT_EQ(Reply("CameraSettings_GetStrobeIntensity", noAccess),
              device.Run("CameraSettings_GetStrobeIntensity"));
}

TEST_F(CameraCommandsWire, DeliberatelyAValidGreyscaleModeFailsWithoutTheMode)
{
    const Parameters camera = {{"Param_CameraDeviceId", "1"}};
    const char* const command = "CameraSettings_GetGreyscaleMode";

    EXPECT_EQ(Reply(command, noAccess), device.Run(command, camera));
    for (const char* number : {"0", "5"}) {
        EXPECT_EQ("ok", host.Command(std::string("mode 1 ") + number));
        EXPECT_EQ(Reply(command, noAccess), device.Run(command, camera));
    }
    for (const char* number : {"6", "-1"}) {
        EXPECT_EQ("ok", host.Command(std::string("mode 1 ") + number));
        EXPECT_EQ(Reply(command, unknown), device.Run(command, camera));
    }
}

TEST_F(CameraCommandsWire, WritersAnswerByWhatTheCameraTakes)
{
    struct VCase
    {
        const char* command;
        const char* parameter;
        const char* camera;
        const char* value;
        const char* result;
    };
    // clang-format off
    const VCase cases[] = {
        {"CameraSettings_SetStrobeIntensity",   "Param_StrobeIntensity",   "1", "0.75", "OK"},
        {"CameraSettings_SetStrobeIntensity",   "Param_StrobeIntensity",   "5", "0.75", noSetting},
        {"CameraSettings_SetStrobeIntensity",   "Param_StrobeIntensity",   "6", "0.75", noAccess},
        {"CameraSettings_SetStrobeIntensity",   "Param_StrobeIntensity",   "x", "0.75", noAccess},
        {"CameraSettings_SetCentroidThreshold", "Param_CentroidThreshold", "1", "0.75", "OK"},
        {"CameraSettings_SetCentroidThreshold", "Param_CentroidThreshold", "3", "0.75", noSetting},
        {"CameraSettings_SetCentroidThreshold", "Param_CentroidThreshold", "4", "0.75", readOnly},
        {"CameraSettings_SetCentroidThreshold", "Param_CentroidThreshold", "4", "much", readOnly},
        {"CameraSettings_SetCentroidThreshold", "Param_CentroidThreshold", "6", "0.75", noAccess},
        {"CameraSettings_SetShutterDuration",   "Param_ShutterDuration",   "1", "0.75", "OK"},
        {"CameraSettings_SetShutterDuration",   "Param_ShutterDuration",   "2", "0.75", noSetting},
        {"CameraSettings_SetShutterDuration",   "Param_ShutterDuration",   "2", "long", noSetting},
        {"CameraSettings_SetShutterDuration",   "Param_ShutterDuration",   "6", "0.75", noAccess},
        {"CameraSettings_SetGreyscaleMode",     "Param_GreyscaleMode",     "1", "No Edges", "OK"},
        {"CameraSettings_SetGreyscaleMode",     "Param_GreyscaleMode",     "5", "All",  noSetting},
        {"CameraSettings_SetGreyscaleMode",     "Param_GreyscaleMode",     "6", "All",  noAccess},
    };
    // clang-format on
    for (const VCase& row : cases) {
        EXPECT_EQ(Reply(row.command, row.result),
                  device.Run(row.command,
                             {{"Param_CameraDeviceId", row.camera}, {row.parameter, row.value}}))
            << row.camera << " " << row.value;
    }

    EXPECT_EQ(R"(ok "0.75")", Shown("StrobeIntensity"));
    EXPECT_EQ(R"(ok "0.75")", Shown("Threshold"));
    EXPECT_EQ(R"(ok "0.75")", Shown("ShutterDuration"));
    EXPECT_EQ(R"(ok "NoEdges")", Shown("GreyscaleMode"));
    EXPECT_EQ(R"(ok "0.25")", host.Command("get Device qx:4 Threshold"));
    EXPECT_EQ(Reply("CameraSettings_GetStrobeIntensity", "OK", {{"Param_StrobeIntensity", "0.75"}}),
              device.Run("CameraSettings_GetStrobeIntensity", {{"Param_CameraDeviceId", "1"}}));
}

TEST_F(CameraCommandsWire, DeliberatelyANumberThatDoesNotParseIsWrittenAsZeroAndSucceeds)
{
    EXPECT_EQ(Reply("CameraSettings_SetStrobeIntensity", "OK"),
              device.Run("CameraSettings_SetStrobeIntensity",
                         {{"Param_CameraDeviceId", "1"}, {"Param_StrobeIntensity", "bright"}}));

    EXPECT_EQ(SettingChanged("1", "StrobeIntensity", "0.0"), device.NextEvent());
}

TEST_F(CameraCommandsWire, DeliberatelyAnUnknownGreyscaleModeIsNone)
{
    EXPECT_EQ("ok", host.Command("mode 1 2"));

    EXPECT_EQ(Reply("CameraSettings_SetGreyscaleMode", "OK"),
              device.Run("CameraSettings_SetGreyscaleMode",
                         {{"Param_CameraDeviceId", "1"}, {"Param_GreyscaleMode", "no edges"}}));

    EXPECT_EQ(R"(ok "None")", Shown("GreyscaleMode"));
}

TEST_F(CameraCommandsWire, DeliberatelyTheStrobeSwitchesChangeNothing)
{
    const std::string before = host.Command("state");

    for (const char* command : {"CameraSettings_DisableStrobes", "CameraSettings_EnableStrobes"}) {
        EXPECT_EQ(Reply(command, "OK"), device.Run(command));
        EXPECT_EQ(before, host.Command("state"));
    }
}

TEST_F(CameraCommandsWire, ValuesBeyondTheRangeAreTakenAndClampedByTheCamera)
{
    struct VCase
    {
        const char* command;
        const char* parameter;
        const char* setting;
        const char* value;
        const char* confirmed;
    };
    // clang-format off
    const VCase cases[] = {
        {"CameraSettings_SetStrobeIntensity",   "Param_StrobeIntensity",   "StrobeIntensity", "5.0",  "1.0"},
        {"CameraSettings_SetStrobeIntensity",   "Param_StrobeIntensity",   "StrobeIntensity", "-5.0", "0.0"},
        {"CameraSettings_SetStrobeIntensity",   "Param_StrobeIntensity",   "StrobeIntensity", "inf",  "1.0"},
        {"CameraSettings_SetCentroidThreshold", "Param_CentroidThreshold", "Threshold",       "1.01", "1.0"},
        {"CameraSettings_SetShutterDuration",   "Param_ShutterDuration",   "ShutterDuration", "0.0",  "0.01"},
        {"CameraSettings_SetShutterDuration",   "Param_ShutterDuration",   "ShutterDuration", "9.0",  "1.0"},
    };
    // clang-format on
    for (const VCase& row : cases) {
        EXPECT_EQ(Reply(row.command, "OK"), device.Run(row.command, {{"Param_CameraDeviceId", "1"},
                                                                     {row.parameter, row.value}}));
        EXPECT_EQ(SettingChanged("1", row.setting, row.confirmed), device.NextEvent());
        EXPECT_EQ(std::string("ok \"") + row.confirmed + "\"", Shown(row.setting));
    }
}

TEST_F(CameraCommandsWire, NotANumberIsTakenAndChangesNothing)
{
    EXPECT_EQ(Reply("CameraSettings_SetStrobeIntensity", "OK"),
              device.Run("CameraSettings_SetStrobeIntensity",
                         {{"Param_CameraDeviceId", "1"}, {"Param_StrobeIntensity", "nan"}}));
    EXPECT_TRUE(TestSupport::ComesTrue([&] { return Shown("StrobeIntensity") == R"(ok "0.5")"; }));

    EXPECT_EQ("ok", host.Command("notify Device qx:2 Threshold 1"));
    EXPECT_EQ(SettingChanged("2", "Threshold", "0.25"), device.NextEvent()); // and nothing before
}

TEST_F(CameraCommandsWire, TheSelectionIsReadAndReplaced)
{
    const auto selected = [&](const char* numbers) {
        return Reply("CameraSettings_GetSelection", "OK", {{"Param_CameraSelection", numbers}});
    };
    EXPECT_EQ(selected(""), device.Run("CameraSettings_GetSelection"));

    EXPECT_EQ(Reply("CameraSettings_SetSelection", "OK"),
              device.Run("CameraSettings_SetSelection",
                         {{"Param_CameraSelection", "1, 2,word,\"3\",-1,4294967296"}}));
    EXPECT_EQ(selected("1,2,3"), device.Run("CameraSettings_GetSelection"));
    EXPECT_THAT(host.Command("state"), HasSubstr(R"("selection":[1,2,3])"));

    EXPECT_EQ("ok", host.Command("select 4,1"));
    EXPECT_EQ(selected("4,1"), device.Run("CameraSettings_GetSelection"));

    EXPECT_EQ(Reply("CameraSettings_SetSelection", "OK"),
              device.Run("CameraSettings_SetSelection", {{"Param_CameraSelection", "word"}}));
    EXPECT_EQ(selected(""), device.Run("CameraSettings_GetSelection"));
}

TEST_F(CameraCommandsWire, DeliberatelyTheTapCommandSetsWhatItIsGivenAndOnly1IsOn)
{
    const auto enabled = [&](const char* text) {
        return Reply("CameraSettings_GetTapEnabled", "OK", {{"Param_TapEnabled", text}});
    };
    EXPECT_EQ(enabled("0"), device.Run("CameraSettings_GetTapEnabled"));

    for (int twice = 0; twice < 2; ++twice) {
        EXPECT_EQ(Reply("CameraSettings_ToggleTap", "OK"),
                  device.Run("CameraSettings_ToggleTap", {{"Param_TapEnabled", "1"}}));
        EXPECT_EQ(enabled("1"), device.Run("CameraSettings_GetTapEnabled"));
    }
    EXPECT_THAT(host.Command("state"), HasSubstr(R"("tapToSelect":true)"));
    EXPECT_EQ(Reply("CameraSettings_ToggleTap", "OK"),
              device.Run("CameraSettings_ToggleTap", {{"Param_TapEnabled", "true"}}));
    EXPECT_EQ(enabled("0"), device.Run("CameraSettings_GetTapEnabled"));
}

TEST_F(CameraCommandsWire, CamerasThatComeAndGoAreFoundAndLost)
{
    const Parameters camera = {{"Param_CameraDeviceId", "6"}};
    const auto cameras = [&](const char* numbers) {
        return HasSubstr(std::string("<Name>Cameras</Name><Value>") + numbers + "</Value>");
    };
    EXPECT_THAT(device.Run("Host.Information"), cameras("1,2,3,4,5"));

    EXPECT_EQ("ok", host.Command("add 6"));
    EXPECT_EQ("ok", host.Command("remove 2"));

    EXPECT_THAT(device.Run("Host.Information"), cameras("1,3,4,5,6"));
    EXPECT_EQ(Reply("CameraSettings_GetStrobeIntensity", "OK", {{"Param_StrobeIntensity", "0.5"}}),
              device.Run("CameraSettings_GetStrobeIntensity", camera));
    EXPECT_EQ("ok", host.Command("remove 6"));
    EXPECT_EQ(Reply("CameraSettings_GetStrobeIntensity", noAccess),
              device.Run("CameraSettings_GetStrobeIntensity", camera));
    EXPECT_THAT(device.Run("Host.Information"), cameras("1,3,4,5"));
}

TEST_F(CameraCommandsWire, TwoDevicesAtOnceEachReadTheirOwnWriting)
{
    constexpr int rounds = 100;
    const auto drive = [](VWireDevice& driver, const std::string& camera) {
        for (int i = 1; i <= rounds; ++i) {
            const std::string value = "0." + std::to_string(1000 + i); // no trailing zero is lost
            const bool zero = value.back() == '0';
            EXPECT_EQ(Reply("CameraSettings_SetStrobeIntensity", "OK"),
                      driver.Run("CameraSettings_SetStrobeIntensity",
                                 {{"Param_CameraDeviceId", camera},
                                  {"Param_StrobeIntensity", zero ? value + "1" : value}}));
            EXPECT_EQ(Reply("CameraSettings_GetStrobeIntensity", "OK",
                            {{"Param_StrobeIntensity", zero ? value + "1" : value}}),
                      driver.Run("CameraSettings_GetStrobeIntensity",
                                 {{"Param_CameraDeviceId", camera}}));
        }
    };
    VWireDevice other;

    std::thread thread([&] { drive(other, "2"); });
    drive(device, "1");
    thread.join();

    EXPECT_EQ(R"(ok "0.11001")", host.Command("get Device qx:1 StrobeIntensity"));
    EXPECT_EQ(R"(ok "0.11001")", host.Command("get Device qx:2 StrobeIntensity"));
}
