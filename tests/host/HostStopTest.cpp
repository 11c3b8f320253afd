#include "RunningHost.h"
#include "support/TestListener.h"

#include <gmock/gmock.h>

#include <chrono>
#include <csignal>
#include <string>

// The host's stop by signals, also where a device holds it up.

using testing::HasSubstr;
using TestSupport::Connect;
using TestSupport::VRawClient;
using TestSupport::VRunningHost;

TEST(HostStop, ASignalStopsItInOrder)
{
    for (const int signal : {SIGINT, SIGTERM}) {
        VRunningHost host;
        VRawClient device = Connect();
        device.Request("<ServerInformation/>");

        host.Signal(signal);

        EXPECT_EQ(0, host.WaitExit().value_or(-1)) << host.Errors();
        EXPECT_EQ(TestSupport::Frame(TestSupport::declaration +
                                     "<Event><Name>Event.Disconnect</Name><Parameters/></Event>"),
                  device.ReadToEnd());
    }
}

TEST(HostStop, ADeviceThatDoesNotReadHoldsItUpAndIsNamed)
{
    VRunningHost host;
    VRawClient device = Connect(4096);
    device.Request("<ServerInformation/>");
    ASSERT_TRUE(TestSupport::StallWithEvent(host, device));
    const auto asked = std::chrono::steady_clock::now();

    host.Signal(SIGTERM);

    const std::string port = std::to_string(TestSupport::LocalPort(device.Descriptor()));
    EXPECT_TRUE(host.WaitForError("The stop is held up. Devices that do not read what they are "
                                  "sent: 127.0.0.1:" +
                                  port + " ("))
        << host.Errors();
    EXPECT_GE(std::chrono::steady_clock::now() - asked, std::chrono::seconds(5));
    EXPECT_EQ(std::nullopt, host.WaitExit(std::chrono::milliseconds(0)));

    device.Close();
    EXPECT_EQ(0, host.WaitExit().value_or(-1)) << host.Errors();
}

TEST(HostStop, ASecondSignalEndsItAtOnceWith130)
{
    for (const int signal : {SIGINT, SIGTERM}) {
        VRunningHost host;
        VRawClient device = Connect(4096);
        device.Request("<ServerInformation/>");
        ASSERT_TRUE(TestSupport::StallWithEvent(host, device));

        host.Signal(signal);
        ASSERT_TRUE(host.WaitForError("Stopping")); // else the two might count as one
        host.Signal(SIGTERM);

        EXPECT_EQ(130, host.WaitExit().value_or(-1)) << host.Errors();
    }
}
