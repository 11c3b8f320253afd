#include "host/RunningHost.h"
#include "host/cameras/WireDevice.h"

#include <gmock/gmock.h>
#include <nlohmann/json.hpp>

#include <csignal>
#include <string>

// The question about a device, from its request over TCP to the event that tells it the outcome.
// The host has its window in memory, and its console answers for the operator.

using CameraTest::Event;
using CameraTest::Parameters;
using CameraTest::VWireDevice;
using testing::HasSubstr;
using testing::Not;
using TestSupport::ComesTrue;
using TestSupport::VRunningHost;

namespace {

const std::string deviceId = "tablet-1";

/// A host with a window, and a device that is connected to it.
class HostDialog : public testing::Test
{
protected:
    nlohmann::json State()
    {
        const std::string answer = host.Command("state");
        if (answer.rfind("ok ", 0) != 0) {
            throw std::runtime_error(answer);
        }
        return nlohmann::json::parse(answer.substr(3));
    }

    /// Waits for the dialog to open. @return what the console tells of it
    nlohmann::json AwaitDialog()
    {
        nlohmann::json dialog;
        if (!ComesTrue([&] { return !(dialog = State()["dialog"]).is_null(); })) {
            throw std::runtime_error("no dialog opens");
        }
        return dialog;
    }

    bool DialogGoes()
    {
        return ComesTrue([&] { return State()["dialog"].is_null(); });
    }

    /// Sends a device's request. @return the reply
    static std::string Authorize(VWireDevice& asking, const std::string& id = deviceId,
                                 const std::string& name = "Tablet")
    {
        return asking.Run("System.Authorize", {{"DeviceId", id}, {"DeviceName", name}});
    }

    /// Expects that the device has heard of nothing so far.
    void ExpectNoEventBefore(const std::string& marker)
    {
        EXPECT_EQ("ok", host.Command("fire " + marker));
        EXPECT_EQ(Event(marker, {}), device.NextEvent());
    }

    VRunningHost host{{"--console"}, {"env", "QT_QPA_PLATFORM=offscreen"}};
    VWireDevice device;
};

/// How a reply or event tells a status.
std::string Status(const std::string& status)
{
    return "<Name>Status</Name><Value>" + status + "</Value>";
}

struct VOutcomeCase
{
    const char* name;
    const char* answer;
    const char* event;     // the status that it tells, null where there is none
    const char* nextReply; // to the device's next request
    bool connected;
};

// clang-format off
const VOutcomeCase outcomeCases[] = {
    {"Cancelled",            "answer cancel",          nullptr,      "Pending",    false},
    {"AllowedOnce",          "answer allow forget",    "Authorized", "Pending",    true},
    {"DeniedOnce",           "answer deny forget",     "Failed",     "Pending",    false},
    {"AllowedAndRemembered", "answer allow remember",  "Authorized", "Authorized", true},
    {"DeniedAndRemembered",  "answer deny remember",   "Failed",     "Failed",     false},
    {"CancelledAndTicked",   "answer cancel remember", nullptr,      "Pending",    false},
};
// clang-format on

class HostDialogOutcome : public HostDialog, public testing::WithParamInterface<VOutcomeCase>
{
};

} // namespace

INSTANTIATE_TEST_SUITE_P(Answers, HostDialogOutcome, testing::ValuesIn(outcomeCases),
                         [](const auto& named) { return std::string(named.param.name); });

TEST_P(HostDialogOutcome, ComesBackToTheDevice)
{
    EXPECT_THAT(Authorize(device), HasSubstr(Status("Pending")));
    EXPECT_EQ("Tablet", AwaitDialog()["clientName"]);

    EXPECT_EQ("ok", host.Command(GetParam().answer));

    if (GetParam().event != nullptr) {
        const std::string event = device.NextEvent();
        EXPECT_THAT(event, HasSubstr("<Event><Name>Event.Authorize</Name>"));
        EXPECT_THAT(event, HasSubstr(Status(GetParam().event)));
    }
    EXPECT_TRUE(DialogGoes());
    ExpectNoEventBefore("Event.Marker");
    const nlohmann::json control = State()["control"];
    EXPECT_EQ(GetParam().connected, control.contains(deviceId));
    EXPECT_THAT(Authorize(device), HasSubstr(Status(GetParam().nextReply)));
    TestSupport::ExpectOrderlyEnd(host);
}

TEST_F(HostDialog, TakesNoSecondRequestWhileItIsOpen)
{
    Authorize(device);
    AwaitDialog();
    VWireDevice other;

    EXPECT_THAT(Authorize(device), HasSubstr(Status("Connected")));
    EXPECT_THAT(Authorize(other, "tablet-2"), HasSubstr(Status("Connected")));

    EXPECT_EQ("ok", host.Command("answer deny forget"));
    EXPECT_THAT(other.NextEvent(), HasSubstr(Status("Failed")));
}

TEST_F(HostDialog, LeavesTheHostAtWorkWhileItIsOpen)
{
    Authorize(device);
    AwaitDialog();

    EXPECT_THAT(device.Run("Host.Echo", {{"A", "b"}}), HasSubstr("<Value>b</Value>"));
    EXPECT_EQ("ok", host.Command("set Device qx:1 StrobeIntensity 0.75"));
    EXPECT_EQ(CameraTest::SettingChanged("1", "StrobeIntensity", "0.75"), device.NextEvent());
    TestSupport::ExpectAnswersTheNextGoodFrame();
}

TEST_F(HostDialog, IsWithdrawnByTheDevice)
{
    Authorize(device);
    AwaitDialog();

    const std::string reply = device.Run("System.Authorize.Cancel", {{"DeviceId", deviceId}});

    EXPECT_THAT(reply, Not(HasSubstr("<Result>OK</Result>")));
    EXPECT_TRUE(DialogGoes());
    ExpectNoEventBefore("Event.Marker");
    EXPECT_THAT(Authorize(device), HasSubstr(Status("Pending")));
}

TEST_F(HostDialog, IsWithdrawnByAnyOtherDevice)
{
    Authorize(device);
    AwaitDialog();
    VWireDevice other;

    other.Run("System.Authorize.Cancel", {{"DeviceId", "tablet-2"}});

    EXPECT_TRUE(DialogGoes());
}

TEST_F(HostDialog, StaysUpWhenTheDeviceHasGone)
{
    {
        VWireDevice gone;
        Authorize(gone);
        AwaitDialog();
    }

    EXPECT_EQ("Tablet", AwaitDialog()["clientName"]);
    EXPECT_EQ("ok", host.Command("answer allow  remember "));
    EXPECT_THAT(device.NextEvent(), HasSubstr(Status("Authorized")));
}

TEST_F(HostDialog, OpensItsCheckBoxAsItWasLeft)
{
    Authorize(device);
    EXPECT_EQ(true, AwaitDialog()["remember"]); // the first time
    EXPECT_EQ("ok", host.Command("answer deny forget"));
    EXPECT_TRUE(DialogGoes());

    Authorize(device);

    EXPECT_EQ(false, AwaitDialog()["remember"]);
}

TEST_F(HostDialog, AnswersWithTheCheckBoxAsItStands)
{
    Authorize(device);
    AwaitDialog();

    EXPECT_EQ("ok", host.Command("answer deny"));

    EXPECT_TRUE(DialogGoes());
    EXPECT_THAT(Authorize(device), HasSubstr(Status("Failed"))); // it was ticked
}

TEST_F(HostDialog, ShowsTheNameWithoutItsMarkup)
{
    Authorize(device, deviceId, "&lt;b&gt;Tab&lt;/b&gt;let");

    const std::string shown = AwaitDialog()["clientName"];
    EXPECT_EQ("ok", host.Command("answer allow remember"));
    EXPECT_TRUE(DialogGoes());

    EXPECT_EQ("Tablet", shown);
    EXPECT_EQ("<b>Tab</b>let", State()["control"][deviceId]["Name"]); // as it was sent
}

TEST_F(HostDialog, ShowsMarkupThatWasEncodedTwiceAsText)
{
    Authorize(device, deviceId, "&amp;lt;b&amp;gt;Tab&amp;lt;/b&amp;gt;let");

    EXPECT_EQ("<b>Tab</b>let", AwaitDialog()["clientName"]);
}

TEST_F(HostDialog, EndsInOrderWhileItIsOpen)
{
    Authorize(device);
    AwaitDialog();

    TestSupport::ExpectOrderlyEnd(host);

    EXPECT_EQ(Event("Event.Disconnect", {}), device.NextEvent());
    EXPECT_THAT(host.Errors(), Not(HasSubstr("held up")));
}

TEST_F(HostDialog, EndsBySignalWhileItIsOpen)
{
    Authorize(device);
    AwaitDialog();

    kill(host.Pid(), SIGTERM);

    EXPECT_EQ(0, host.WaitExit().value_or(-1)) << host.Errors();
}

TEST_F(HostDialog, RefusesAnswersThatAreNone)
{
    EXPECT_EQ("error: no dialog is open", host.Command("answer allow"));
    Authorize(device);
    AwaitDialog();

    EXPECT_EQ("error: expected allow, deny or cancel, not 'perhaps'",
              host.Command("answer perhaps"));
    EXPECT_EQ("error: expected remember or forget, not 'never'",
              host.Command("answer allow never"));
    EXPECT_EQ("error: unexpected 'forget'", host.Command("answer allow remember forget"));
    EXPECT_EQ("error: expected allow, deny or cancel", host.Command("answer"));

    EXPECT_FALSE(State()["dialog"].is_null());
}
