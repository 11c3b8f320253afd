#include "AuthorizationBench.h"
#include "ControlSystem.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/Server.h"
#include "QuorixPluginControlStreamServer/ControlStreamServer/SocketASIO.h"
#include "QuorixPluginControlStreamServer/ControlSystem/CommandProviderAuthorization.h"
#include "QuorixPluginControlStreamServer/ControlSystem/EventProviderAuthorized.h"
#include "notification/AsioPostalService.h"
#include "support/RawClient.h"

#include <gmock/gmock.h>

#include <future>

// Devices on the wire before an operator who takes his time.

using AuthorizationBench::VScriptedGUI;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::Pair;
using TestSupport::VRawClient;

namespace {

std::string Command(const std::string& name, const std::string& id)
{
    return "<ExecuteCommand><Name>" + name +
           "</Name><Correlation>1</Correlation><Parameters><Parameter><Name>DeviceId</"
           "Name><Value>" +
           id + "</Value></Parameter></Parameters></ExecuteCommand>";
}

/// The server, the dispatcher and the authorization, put together as the plug-in does.
class AuthorizationDialogue : public testing::Test
{
protected:
    AuthorizationDialogue()
    {
        manager = KVR::MakeShared<VQuorixControlAuthorization>(postal, store);
        server = ControlStreamServer::VServer::Create(controlSystem, socket, nullptr, false);
        controlSystem->AddCommandProvider(std::make_shared<VCommandProviderAuthorization>(manager));
        controlSystem->AddEventProvider(
            std::make_shared<VEventProviderAuthorized>(controlSystem, manager));
        gui->Answer = [this] {
            asked.set_value();
            return answer.get_future().get();
        };
        manager->SetGUI(gui);
    }
    ~AuthorizationDialogue() override
    {
        server.reset();
        socket.reset();
    }

    /// A device that the server has on its list.
    std::unique_ptr<VRawClient> Connect() const
    {
        auto device = std::make_unique<VRawClient>(socket->Port());
        device->Request("<ServerInformation/>");
        return device;
    }

    const std::shared_ptr<QuorixHost::VControlSystem> controlSystem =
        std::make_shared<QuorixHost::VControlSystem>();
    const std::shared_ptr<VDataStore> store = std::make_shared<VDataStore>();
    const std::shared_ptr<NotificationSystem::VAsioPostalService> postal =
        std::make_shared<NotificationSystem::VAsioPostalService>("Operator", 1, 0);
    const std::shared_ptr<VScriptedGUI> gui = std::make_shared<VScriptedGUI>();
    std::shared_ptr<ControlStreamServer::VSocketASIO> socket =
        std::make_shared<ControlStreamServer::VSocketASIO>(0);
    std::shared_ptr<ControlStreamServer::VServer> server;
    std::shared_ptr<VQuorixControlAuthorization> manager;
    std::promise<void> asked;         // the dialog is open
    std::promise<EAskOutcome> answer; // the operator's
};

} // namespace

TEST_F(AuthorizationDialogue, WhileADialogIsOpenEveryRequestHearsConnected)
{
    const auto first = Connect();
    const auto second = Connect();
    EXPECT_THAT(first->Request(Command("System.Authorize", "one")), HasSubstr(">Pending<"));
    asked.get_future().wait();

    EXPECT_THAT(first->Request(Command("System.Authorize", "one")), HasSubstr(">Connected<"));
    EXPECT_THAT(second->Request(Command("System.Authorize", "two")), HasSubstr(">Connected<"));
    EXPECT_THAT(second->Request(Command("System.Heartbeat", "two")), HasSubstr(">OK<"));

    answer.set_value(EAskOutcome::DeniedOnce);
    EXPECT_THAT(first->ReadFrame(), HasSubstr(">Failed<"));
    EXPECT_THAT(second->ReadFrame(), HasSubstr(">Failed<"));
    EXPECT_THAT(gui->Questions(), ElementsAre(Pair("one", "")));
}

TEST_F(AuthorizationDialogue, ADeviceThatLeavesChangesNothingAndTheAnswerCounts)
{
    const auto other = Connect();
    {
        const auto leaving = Connect();
        EXPECT_THAT(leaving->Request(Command("System.Authorize", "one")), HasSubstr(">Pending<"));
        asked.get_future().wait();
    }
    const auto back = Connect(); // the server has noticed by then, or will not care

    EXPECT_THAT(back->Request(Command("System.Authorize", "one")), HasSubstr(">Connected<"));
    answer.set_value(EAskOutcome::AllowedAndRemembered);

    EXPECT_THAT(back->ReadFrame(), HasSubstr(">Authorized<"));
    EXPECT_THAT(other->ReadFrame(), HasSubstr(">Authorized<"));
    EXPECT_THAT(other->Request(Command("System.Authorize", "two")), HasSubstr(">Connected<"));
    // Once the answer has been applied to its end, the device is known.
    while (manager->IsRequestPending()) {
        std::this_thread::yield();
    }
    EXPECT_THAT(back->Request(Command("System.Authorize", "one")), HasSubstr(">Authorized<"));
    EXPECT_EQ("one", manager->GetCurrentDeviceId());
}

TEST_F(AuthorizationDialogue, CancellingReachesTheOpenDialogWhoeverAsks)
{
    const auto first = Connect();
    const auto second = Connect();
    first->Request(Command("System.Authorize", "one"));
    asked.get_future().wait();

    EXPECT_THAT(second->Request(Command("System.Authorize.Cancel", "two")),
                HasSubstr("<Result>Error: Invalid command name"));

    EXPECT_THAT(gui->Cancelled(), ElementsAre("two"));
    answer.set_value(EAskOutcome::Cancelled);
    while (manager->IsRequestPending()) {
        std::this_thread::yield();
    }
    EXPECT_FALSE(first->IsReadable()); // nobody is told
}
