#include "FakeHost/FakeHost.h"

#include "ControlStreamClient/AsyncClient.h"
#include "FakeHost/RecordedContent.h"
#include "FakeHost/SimulatedContent.h"
#include "device/ClientSupport.h"
#include "device/ReservedPort.h"

#include <gmock/gmock.h>

namespace {

using namespace ControlStream;
using namespace std::chrono_literals;
using FakeHost::EDecision;
using FakeHost::ERecorded;
using FakeHost::VFakeHost;
using FakeHost::VOperatorOptions;
using FakeHost::VRecordedMoment;
using testing::ElementsAre;

/// A client that is connected to a fake host.
class VGuest : public VClient
{
public:
    explicit VGuest(const VFakeHost& host) : VClient(WithLimit(Patient))
    {
        Connect("127.0.0.1", host.Port(), Patient);
        GetServerInformation(); // from here on it hears events
    }
};

std::string StatusOf(const VCommandReply& reply)
{
    return GetValue(reply.Parameters, "Status");
}

const VParameters device = {{"DeviceId", "d"}, {"DeviceName", "n"}};

TEST(FakeHost, HasCamerasThatBehaveAsRealOnes)
{
    VFakeHost host(FakeHost::MakeSimulatedContent(2, {}), 0);
    VGuest client(host);
    const VParameters strobe = {{"Param_CameraDeviceId", "2"}, {"Param_StrobeIntensity", "0.75"}};

    EXPECT_EQ("1,2", GetValue(client.ExecuteCommand("Host.Information").Parameters, "Cameras"));
    EXPECT_TRUE(client.ExecuteCommand("CameraSettings_SetStrobeIntensity", strobe).Ok);

    const auto event = client.WaitForEvent(Patient);
    ASSERT_TRUE(event);
    EXPECT_EQ("Event.Cameras.SettingChanged", event->Name);
    EXPECT_EQ("0.75", GetValue(event->Parameters, "SettingValue"));
    client.ExecuteCommand("CameraSettings_ToggleTap", {{"Param_TapEnabled", "1"}});
    const auto next = client.WaitForEvent(Patient);
    EXPECT_EQ("Event.Cameras.TapToSelectChanged", next->Name) << "one change is one event";
}

TEST(FakeHost, RefusesAPortThatIsTaken)
{
    const VFakeHost first(FakeHost::MakeSimulatedContent(0, {}), 0);

    EXPECT_THROW(VFakeHost(FakeHost::MakeSimulatedContent(0, {}), first.Port()),
                 std::runtime_error);
}

TEST(FakeHost, LetsGoOfItsPortAlsoWhileADeviceAsks)
{
    const VReservedPort port;
    std::string requests;
    for (int i = 0; i < 100; ++i) {
        requests += TestSupport::Frame("<ServerInformation/>");
    }
    for (int round = 0; round < 100; ++round) {
        auto host = std::make_unique<VFakeHost>(FakeHost::MakeSimulatedContent(0, {}),
                                                port.Number()); // not taken any more
        VPeer peer(port.Number());
        peer.Send(requests);
        peer.ReadFrame();

        host.reset();
    }
}

TEST(FakeHost, SaysFarewell)
{
    auto host = std::make_unique<VFakeHost>(FakeHost::MakeSimulatedContent(1, {}), 0);
    VGuest client(*host);

    host.reset();

    EXPECT_EQ("Event.Disconnect", client.WaitForEvent(Patient)->Name);
    EXPECT_EQ(EErrorKind::Closed, ThrownBy([&] { client.WaitForEvent(Patient); }).Kind);
}

struct VDecisionCase
{
    const char* Name;
    EDecision Decision;
    std::string Answer;
    std::string Outcome; // of Event.Authorize, empty for none
};

class FakeOperator : public testing::TestWithParam<VDecisionCase>
{
};

TEST_P(FakeOperator, DecidesAsChosen)
{
    VFakeHost host(FakeHost::MakeSimulatedContent(0, {GetParam().Decision, 1ms}), 0);
    VGuest client(host);

    EXPECT_EQ(GetParam().Answer, StatusOf(client.ExecuteCommand("System.Authorize", device)));

    if (!GetParam().Outcome.empty()) {
        const auto event = client.WaitForEvent(Patient);
        ASSERT_TRUE(event);
        EXPECT_EQ("Event.Authorize", event->Name);
        EXPECT_EQ(GetParam().Outcome, GetValue(event->Parameters, "Status"));
    }
}

// clang-format off
const VDecisionCase decisionCases[] = {
    {"Allow", EDecision::Allow, "Authorized", ""},
    {"Deny", EDecision::Deny, "Failed", ""},
    {"AskAllow", EDecision::AskAllow, "Pending", "Authorized"},
    {"AskDeny", EDecision::AskDeny, "Pending", "Failed"},
};
// clang-format on

INSTANTIATE_TEST_SUITE_P(Table, FakeOperator, testing::ValuesIn(decisionCases),
                         [](const auto& named) { return std::string(named.param.Name); });

TEST(FakeOperator, ThatNeverAnswersHoldsThePlaceUntilTheRequestIsTakenBack)
{
    VFakeHost host(FakeHost::MakeSimulatedContent(0, {EDecision::AskNobody, 0ms}), 0);
    VGuest client(host);

    EXPECT_EQ("Pending", StatusOf(client.ExecuteCommand("System.Authorize", device)));
    EXPECT_EQ("Connected", StatusOf(client.ExecuteCommand("System.Authorize", device)));
    EXPECT_FALSE(client.ExecuteCommand("System.Authorize.Cancel", {{"DeviceId", "d"}}).Ok);
    EXPECT_EQ("Pending", StatusOf(client.ExecuteCommand("System.Authorize", device)));
}

TEST(FakeOperator, GivesThePlaceToOneDeviceAtATime)
{
    VFakeHost host(FakeHost::MakeSimulatedContent(0, {}), 0);
    VGuest client(host);

    EXPECT_EQ("Authorized", StatusOf(client.ExecuteCommand("System.Authorize", device)));
    EXPECT_EQ("Connected", StatusOf(client.ExecuteCommand(
                               "System.Authorize", {{"DeviceId", "other"}, {"DeviceName", "n"}})));
}

TEST(AsyncClientWithFakeHost, IsAuthorizedAnewByEachHost)
{
    const VReservedPort port;
    auto host = std::make_unique<VFakeHost>(
        FakeHost::MakeSimulatedContent(1, {EDecision::AskAllow, 1ms}), port.Number());
    VAsyncOptions options;
    options.Port = port.Number();
    options.BackOff = VBackOffOptions{1ms, 20ms, 0.0};
    options.Device = VDeviceIdentity{"d", "n"};
    VAsyncClient client(options);
    const auto authorized = [](const VAsyncStatus& status) {
        return status.Permission == EPermission::Authorized;
    };
    ASSERT_TRUE(client.WaitFor(authorized, Patient));

    host.reset();
    ASSERT_TRUE(client.WaitFor(
        [](const VAsyncStatus& status) { return status.State != EConnectionState::Connected; },
        Patient));
    const VFakeHost next(FakeHost::MakeSimulatedContent(1, {EDecision::AskAllow, 1ms}),
                         port.Number());

    EXPECT_TRUE(client.WaitFor(authorized, Patient));
}

VRecordedMoment Moment(double seconds, ERecorded kind, const std::string& text,
                       unsigned connection = 1)
{
    return {seconds, connection, kind, text};
}

std::string Request(const std::string& correlation, const std::string& value)
{
    return "<ExecuteCommand><Name>Go</Name><Correlation>" + correlation +
           "</Correlation><Parameters><Parameter><Name>p</Name><Value>" + value +
           "</Value></Parameter></Parameters></ExecuteCommand>";
}

std::vector<VRecordedMoment> Recorded()
{
    return {
        Moment(0, ERecorded::Connected, ""),
        Moment(0.001, ERecorded::Device, "<Commands><Correlation>a</Correlation></Commands>"),
        Moment(0.001, ERecorded::Host,
               "<Correlation>a</Correlation><Commands><Command>Go</Command></Commands>"),
        Moment(0.001, ERecorded::Host, "<Events><Event>E</Event></Events>"),
        Moment(0.002, ERecorded::Device, Request("1", "&lt;x")),
        Moment(0.002, ERecorded::Device, Request("2", "y")),
        Moment(0.002, ERecorded::Host, EventText("E", "first")),
        Moment(0.003, ERecorded::Host, ReplyText("2", "Error: Object not found.")),
        Moment(0.003, ERecorded::Host, ReplyText("1")),
        Moment(0.004, ERecorded::Host, "noise"),
        Moment(0.004, ERecorded::Device, Request("3", "y")),
        Moment(0.004, ERecorded::Host, ReplyText("3")),
        Moment(0.005, ERecorded::Host, EventText("E", "second")),
        Moment(0.005, ERecorded::Closed, ""),
    };
}

TEST(RecordedHost, SaysAgainWhatItSaid)
{
    const VFakeHost host(FakeHost::MakeRecordedContent(Recorded()), 0);
    VGuest client(host);

    EXPECT_THAT(client.GetCommands(), ElementsAre("Go"));
    EXPECT_THAT(client.GetEvents(), ElementsAre("E"));
    EXPECT_EQ("OK", client.ExecuteCommand("Go", {{"p", "<x"}}).Result);
    EXPECT_EQ("Error: Object not found.", client.ExecuteCommand("Go", {{"p", "y"}}).Result);
    EXPECT_EQ("OK", client.ExecuteCommand("Go", {{"p", "y"}}).Result) << "the second outcome";
    EXPECT_EQ("OK", client.ExecuteCommand("Go", {{"p", "y"}}).Result) << "the last one stays";
    EXPECT_EQ("Error: Object not found.", client.ExecuteCommand("Go", {{"p", "new"}}).Result)
        << "other parameters get the outcomes of the name";
    EXPECT_EQ("Error: Invalid command name or command not valid for the host application.",
              client.ExecuteCommand("Never").Result);
}

TEST(RecordedHost, PublishesItsEventsFromTheFirstConnectionOn)
{
    const VFakeHost host(FakeHost::MakeRecordedContent(Recorded()), 0);
    VClient client(WithLimit(Patient));
    client.Connect("127.0.0.1", host.Port(), Patient);

    const auto event = client.WaitForEvent(Patient);

    ASSERT_TRUE(event); // the first may have come before the server knew the connection
    const std::string value = GetValue(event->Parameters, "p");
    EXPECT_TRUE(value == "first" || value == "second") << value;
}

} // namespace
