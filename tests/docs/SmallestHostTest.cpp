#include "host/RunningHost.h"
#include "host/cameras/WireDevice.h"

#include <gmock/gmock.h>

#include <string>
#include <vector>

// The example host of the documentation, as a device and a host's maker meet it.

using CameraTest::VWireDevice;
using testing::HasSubstr;
using TestSupport::VHostProcess;

namespace {

const std::vector<std::string> offscreen = {"env", "QT_QPA_PLATFORM=offscreen"};

} // namespace

TEST(SmallestHost, ServesADeviceAndEndsWhileItsUserIsAsked)
{
    VHostProcess host({QUORIX_PLUGIN_LIBRARY}, offscreen, QUORIX_SMALLEST_HOST);
    ASSERT_TRUE(host.WaitReady()) << host.Errors();
    VWireDevice device;

    EXPECT_EQ(TestSupport::serverInformation, device.client.Request("<ServerInformation/>"));
    EXPECT_THAT(device.client.Request("<Commands><Correlation>1</Correlation></Commands>"),
                HasSubstr("CameraSettings_SetSelection"));
    const std::string reply =
        device.Run("System.Authorize", {{"DeviceId", "1"}, {"DeviceName", "Tablet"}});
    EXPECT_THAT(reply, HasSubstr("SmallestHost on "));
    EXPECT_THAT(reply, HasSubstr("<Value>Pending</Value>"));
    EXPECT_THAT(device.Run("CameraSettings_GetStrobeIntensity", {{"Param_CameraDeviceId", "1"}}),
                HasSubstr("Error"));

    EXPECT_TRUE(host.SendLine("end"));
    EXPECT_EQ(0, host.WaitExit().value_or(-1)) << host.Errors();
    EXPECT_EQ(CameraTest::Event("Event.Disconnect", {}), device.NextEvent());
}

TEST(SmallestHost, SaysWhatIsNoPlugin)
{
    VHostProcess host({"/no/such/plugin.so"}, offscreen, QUORIX_SMALLEST_HOST);

    EXPECT_EQ(1, host.WaitExit().value_or(-1));
    EXPECT_THAT(host.Errors(), HasSubstr("/no/such/plugin.so"));
}
