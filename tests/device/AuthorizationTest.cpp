#include "ControlStreamClient/Authorization.h"

#include "ControlStreamClient/Error.h"
#include "device/ClientSupport.h"

#include <chrono>
#include <optional>
#include <string>
#include <utility>
#include <vector>

#include <gmock/gmock.h>

// The device's side of the authorization, against hosts that answer as a script says.

namespace {

using ControlStream::EAuthorizationState;
using ControlStream::EErrorKind;
using ControlStream::VAuthorization;
using ControlStream::VClient;
using ControlStream::VEvent;
using testing::ElementsAre;
using namespace std::chrono_literals;

const std::string unknownCommand =
    "Error: Invalid command name or command not valid for the host application.";

std::string Parameter(const std::string& name, const std::string& value)
{
    return "<Parameter><Name>" + name + "</Name><Value>" + value + "</Value></Parameter>";
}

std::string Answer(int correlation, const std::string& parameters, const std::string& result = "OK")
{
    return Declaration + ("<CommandReply><Name>C</Name><Correlation>" +
                          std::to_string(correlation) + "</Correlation><Result>" + result +
                          "</Result><Parameters>" + parameters + "</Parameters></CommandReply>");
}

std::string StatusAnswer(int correlation, const std::string& status)
{
    return Answer(correlation, Parameter("Status", status) + Parameter("ServerName", "Stage 5") +
                                   Parameter("ServerVersion", "300"));
}

std::string OutcomeEvent(const std::string& status)
{
    return Declaration +
           ("<Event><Name>Event.Authorize</Name><Parameters>" + Parameter("Status", status) +
            Parameter("ServerName", "Stage 5") + "</Parameters></Event>");
}

const std::string disconnectEvent =
    Declaration + std::string("<Event><Name>Event.Disconnect</Name><Parameters/></Event>");

/// A device and a host with a script.
class Authorization : public testing::Test
{
protected:
    void Connect(VScriptedHost::Script script)
    {
        host.emplace(std::move(script));
        client.Connect("127.0.0.1", host->Port());
    }

    std::optional<VScriptedHost> host;
    VClient client{WithLimit(Patient)};
    VAuthorization authorization{client, "id", "A <name>"};
};

struct VStatusCase
{
    const char* status;
    EAuthorizationState state;
};

class AuthorizationStatus : public Authorization, public testing::WithParamInterface<VStatusCase>
{
};

} // namespace

TEST_P(AuthorizationStatus, GivesTheState)
{
    Connect([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(StatusAnswer(1, GetParam().status));
        peer.ReadToEnd();
    });
    EXPECT_EQ(EAuthorizationState::Unknown, authorization.GetState());

    EXPECT_EQ(GetParam().state, authorization.Request());

    EXPECT_EQ(GetParam().state, authorization.GetState());
    EXPECT_EQ("Stage 5", authorization.ServerName());
    EXPECT_EQ("300", authorization.ServerVersion());
    client.Close();
}

INSTANTIATE_TEST_SUITE_P(Table, AuthorizationStatus,
                         testing::Values(VStatusCase{"Authorized", EAuthorizationState::Authorized},
                                         VStatusCase{"Failed", EAuthorizationState::Refused},
                                         VStatusCase{"Pending", EAuthorizationState::Pending},
                                         VStatusCase{"Connected",
                                                     EAuthorizationState::ConnectedElsewhere}),
                         [](const auto& test) { return test.param.status; });

TEST_F(Authorization, SendsIdAndNameByteForByte)
{
    std::string request;
    Connect([&](VPeer& peer) {
        request = peer.ReadFrame();
        peer.SendFrame(StatusAnswer(1, "Failed"));
        peer.ReadToEnd();
    });

    authorization.Request();
    client.Close();
    host.reset();

    EXPECT_EQ("<ExecuteCommand><Name>System.Authorize</Name><Correlation>1</Correlation>"
              "<Parameters><Parameter><Name>DeviceId</Name><Value>id</Value></Parameter>"
              "<Parameter><Name>DeviceName</Name><Value>A &lt;name&gt;</Value></Parameter>"
              "</Parameters></ExecuteCommand>",
              request.substr(request.find("<ExecuteCommand>")));
}

TEST_F(Authorization, WaitsForTheOutcomeAndHandsOnOtherEvents)
{
    for (const bool allowed : {true, false}) {
        host.reset();
        Connect([allowed](VPeer& peer) {
            const std::string request = peer.ReadFrame();
            const int correlation = request.find(">1</Correlation>") != std::string::npos ? 1 : 2;
            // The outcome may overtake the reply.
            peer.Send(TestSupport::Frame(EventText("Tick")) +
                      TestSupport::Frame(OutcomeEvent(allowed ? "Authorized" : "Failed")) +
                      TestSupport::Frame(StatusAnswer(correlation, "Pending")));
            peer.ReadToEnd();
        });
        std::vector<std::string> heard;
        authorization.SetEventHandler([&](const VEvent& event) { heard.push_back(event.Name); });

        EXPECT_EQ(EAuthorizationState::Pending, authorization.Request());
        EXPECT_EQ(allowed ? EAuthorizationState::Authorized : EAuthorizationState::Refused,
                  authorization.WaitForOutcome(Patient));

        EXPECT_THAT(heard, ElementsAre("Tick"));
        client.Close();
    }
}

TEST_F(Authorization, AnOutcomeFromBeforeTheRequestIsSomebodyElses)
{
    Connect([](VPeer& peer) {
        peer.SendFrame(OutcomeEvent("Authorized"));
        peer.ReadFrame();
        peer.SendFrame(Declaration + std::string("<ServerInformation><StreamVersion major=\"1\" "
                                                 "minor=\"0\"/></ServerInformation>"));
        peer.ReadFrame();
        peer.SendFrame(StatusAnswer(1, "Pending"));
        peer.ReadToEnd();
    });
    client.GetServerInformation(); // the event has come by then, and is kept

    authorization.Request();

    EXPECT_EQ(EAuthorizationState::Pending, authorization.WaitForOutcome(Hasty));
    client.Close();
}

TEST_F(Authorization, AnOutcomeWithoutARequestIsSomebodyElses)
{
    authorization.OnEvent({"Event.Authorize", {{"Status", "Authorized"}}});

    EXPECT_EQ(EAuthorizationState::Unknown, authorization.GetState());
}

TEST_F(Authorization, AHostThatGoesAwayIsLost)
{
    Connect([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(StatusAnswer(1, "Pending"));
        peer.SendFrame(disconnectEvent);
        peer.ReadToEnd();
    });
    authorization.Request();

    EXPECT_EQ(EAuthorizationState::Lost, authorization.WaitForOutcome(Patient));
    client.Close();
}

TEST_F(Authorization, AConnectionThatEndsIsLost)
{
    Connect([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(StatusAnswer(1, "Pending"));
    });
    authorization.Request();

    EXPECT_EQ(EErrorKind::Closed, ThrownBy([&] { authorization.WaitForOutcome(Patient); }).Kind);
    EXPECT_EQ(EAuthorizationState::Lost, authorization.GetState());
    EXPECT_EQ(EErrorKind::NoConnection, ThrownBy([&] { authorization.Beat(); }).Kind);
    EXPECT_EQ(EAuthorizationState::Lost, authorization.GetState());
}

TEST_F(Authorization, CancellingCountsAsDoneThoughTheHostCallsItUnknown)
{
    Connect([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(StatusAnswer(1, "Pending"));
        peer.ReadFrame();
        peer.SendFrame(Answer(2, "", unknownCommand));
        peer.ReadToEnd();
    });
    authorization.Request();

    authorization.Cancel();

    EXPECT_EQ(EAuthorizationState::Unknown, authorization.GetState());
    client.Close();
}

TEST_F(Authorization, OtherFailuresAreNoAnswers)
{
    Connect([](VPeer& peer) {
        for (int i = 1; i <= 3; ++i) {
            peer.ReadFrame();
            peer.SendFrame(Answer(i, "", "Error: System Error"));
        }
        peer.ReadFrame();
        peer.SendFrame(StatusAnswer(4, "Perhaps"));
        peer.ReadToEnd();
    });

    EXPECT_EQ(EErrorKind::Protocol, ThrownBy([&] { authorization.Request(); }).Kind);
    EXPECT_EQ(EErrorKind::Protocol, ThrownBy([&] { authorization.Cancel(); }).Kind);
    EXPECT_EQ(EErrorKind::Protocol, ThrownBy([&] { authorization.Beat(); }).Kind);
    EXPECT_EQ(EErrorKind::Protocol, ThrownBy([&] { authorization.Request(); }).Kind);
    EXPECT_EQ(EAuthorizationState::Unknown, authorization.GetState());
    client.Close();
}

TEST_F(Authorization, EachBeatHasAnIdOfItsOwnThatComesBack)
{
    Connect([](VPeer& peer) {
        peer.ReadFrame();
        peer.SendFrame(Answer(1, Parameter("BeatId", "1")));
        peer.ReadFrame();
        peer.SendFrame(Answer(2, Parameter("BeatId", "2")));
        peer.ReadFrame();
        peer.SendFrame(Answer(3, Parameter("BeatId", "2")));
        peer.ReadToEnd();
    });

    authorization.Beat();
    authorization.Beat();

    EXPECT_EQ(EErrorKind::Protocol, ThrownBy([&] { authorization.Beat(); }).Kind);
    client.Close();
}

TEST_F(Authorization, ReconnectsWithWaitsThatGrow)
{
    std::vector<std::chrono::milliseconds> waits;
    std::uint16_t port = 0;
    {
        const VScriptedHost gone([](VPeer&) {});
        port = gone.Port();
    }
    ControlStream::VBackOffOptions options;
    options.Spread = 0;
    const auto wait = [&](std::chrono::milliseconds time) {
        waits.push_back(time);
        return waits.size() < 4;
    };

    EXPECT_FALSE(authorization.Reconnect("127.0.0.1", port, Patient, wait, options));

    EXPECT_THAT(waits, ElementsAre(100ms, 200ms, 400ms, 800ms));
    EXPECT_EQ(EAuthorizationState::Lost, authorization.GetState());

    const VScriptedHost back([](VPeer& peer) { peer.ReadToEnd(); });
    EXPECT_TRUE(authorization.Reconnect("127.0.0.1", back.Port(), Patient, wait, options));
    EXPECT_EQ(EAuthorizationState::Unknown, authorization.GetState());
    client.Close();
}
