#include "host/cameras/WireDevice.h"

#include <boost/asio/ip/host_name.hpp>
#include <gmock/gmock.h>

#include <string>

// Devices that ask a running host to be let in. It has no window, and so lets in every one.

using CameraTest::Event;
using CameraTest::Parameters;
using CameraTest::Reply;
using CameraTest::VWireDevice;
using testing::HasSubstr;
using TestSupport::declaration;

namespace {

const std::string serverName = "Quorix on " + boost::asio::ip::host_name();
const std::string unknownCommand =
    "Error: Invalid command name or command not valid for the host application.";

std::string StatusReply(const std::string& status)
{
    return Reply("System.Authorize", "OK",
                 {{"ServerName", serverName}, {"ServerVersion", "300"}, {"Status", status}});
}

const std::string authorizedEvent =
    Event("Event.Authorize", {{"ServerName", serverName}, {"Status", "Authorized"}});

class AuthorizationWire : public testing::Test
{
protected:
    void TearDown() override { TestSupport::ExpectOrderlyEnd(host); }

    static std::string Ask(VWireDevice& device, const std::string& id,
                           const std::string& name = "Name")
    {
        return device.Run("System.Authorize", {{"DeviceId", id}, {"DeviceName", name}});
    }

    /// Lets a device in, which both hear of.
    void LetIn(VWireDevice& device, const std::string& id, const std::string& name = "Name")
    {
        ASSERT_EQ(StatusReply("Pending"), Ask(device, id, name));
        ASSERT_EQ(authorizedEvent, first.NextEvent());
        ASSERT_EQ(authorizedEvent, second.NextEvent());
        // The console takes its turn behind the step, which is pending to its end.
        ASSERT_EQ("ok", host.Command("clock +0"));
    }

    /// Waits until the state shows a text: the record comes a moment behind the event.
    bool StateShows(const std::string& text)
    {
        return TestSupport::ComesTrue(
            [&] { return host.Command("state").find(text) != std::string::npos; });
    }

    TestSupport::VRunningHost host;
    VWireDevice first;
    VWireDevice second;
};

} // namespace

TEST_F(AuthorizationWire, AnUnknownDeviceIsPendingAndAllHearOfTheOutcome)
{
    LetIn(first, "one", "Phone 1");

    EXPECT_TRUE(StateShows(R"("control":{"one":{"Connected":true,"Name":"Phone 1"}})"));
}

TEST_F(AuthorizationWire, AnotherDeviceTakesOverAfterThreeAndAHalfSilentSeconds)
{
    LetIn(first, "one");
    EXPECT_EQ(Reply("System.Heartbeat", "OK", {{"BeatId", "7"}}),
              first.Run("System.Heartbeat", {{"BeatId", "7"}}));
    EXPECT_EQ(StatusReply("Connected"), Ask(second, "two"));

    EXPECT_EQ("ok", host.Command("clock +3500"));

    LetIn(second, "two");
    EXPECT_EQ(StatusReply("Connected"), Ask(first, "one"));
    EXPECT_TRUE(StateShows(R"("two":{"Connected":true)"));
}

TEST_F(AuthorizationWire, ASilentDeviceIsMarkedSoAndRevivedByALaterBeat)
{
    LetIn(first, "one");
    EXPECT_TRUE(StateShows(R"("one":{"Connected":true)"));

    EXPECT_EQ("ok", host.Command("clock +3500"));
    EXPECT_TRUE(StateShows(R"("one":{"Connected":false)")); // by the check, within 3 seconds

    second.Run("System.Heartbeat"); // anybody's beat
    EXPECT_TRUE(TestSupport::ComesTrue([&] {
        second.Run("System.Heartbeat");
        return host.Command("state").find(R"("one":{"Connected":true)") != std::string::npos;
    }));
}

TEST_F(AuthorizationWire, TheHolderMayAskAgainAndIsAskedAboutAgain)
{
    LetIn(first, "one");
    LetIn(first, "one"); // nothing is remembered without a window
}

TEST_F(AuthorizationWire, ABeatWithoutAnIdComesBackWithAnEmptyOne)
{
    EXPECT_EQ(Reply("System.Heartbeat", "OK", {{"BeatId", ""}}), first.Run("System.Heartbeat"));
}

TEST_F(AuthorizationWire, CancellingIsAnsweredAsAnUnknownCommand)
{
    EXPECT_EQ(Reply("System.Authorize.Cancel", unknownCommand),
              first.Run("System.Authorize.Cancel", {{"DeviceId", "one"}}));
}

TEST_F(AuthorizationWire, TheCommandsAreListedAndNotDescribed)
{
    for (const char* const name :
         {"System.Authorize", "System.Authorize.Cancel", "System.Heartbeat"}) {
        EXPECT_EQ(declaration + "<CommandInformation><Correlation>1</Correlation><Name/>"
                                "<Description>Command not found.</Description>"
                                "<InputParameters/><ReplyParameters/></CommandInformation>",
                  first.client.Request("<CommandInformation><Correlation>1</Correlation><Name>" +
                                       std::string(name) + "</Name></CommandInformation>"));
    }
}

TEST_F(AuthorizationWire, ANameWithMarkupIsRecordedAsSent)
{
    LetIn(first, "one", "&lt;img src='/dev/zero'&gt;&lt;b&gt;x&lt;/b&gt;&amp;amp;");

    EXPECT_TRUE(StateShows(R"("Name":"<img src='/dev/zero'><b>x</b>&amp;")"));
}

TEST_F(AuthorizationWire, AThousandUnknownDevicesOneAfterTheOther)
{
    for (int i = 0; i < 1000; ++i) {
        LetIn(i % 2 == 0 ? first : second, "device " + std::to_string(i));
        ASSERT_FALSE(HasFatalFailure()) << i;
        ASSERT_EQ("ok", host.Command("clock +3500"));
    }

    EXPECT_TRUE(StateShows(R"("device 0":{)"));
    EXPECT_TRUE(StateShows(R"("device 999":{)"));
}

TEST_F(AuthorizationWire, IdsMayBeEmptyOrHoldDots)
{
    LetIn(first, "");
    EXPECT_EQ("ok", host.Command("clock +3500"));
    LetIn(first, "a.b");

    EXPECT_TRUE(StateShows(R"("control":{"":{"Connected":true,"Name":"Name"},"a.b":{)"));
}
