#include "AuthorizationBench.h"
#include "QuorixPluginControlStreamServer/Authorization/ControlDeviceNames.h"
#include "support/LogCapture.h"

#include <boost/asio/ip/host_name.hpp>
#include <gmock/gmock.h>

#include <stdexcept>
#include <type_traits>

using AuthorizationBench::VScriptedGUI;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Pair;

namespace {

class ControlAuthorization : public AuthorizationBench::VAuthorizationBench
{
};

} // namespace

static_assert(!std::is_copy_constructible<IControlAuthorization>::value, "");
static_assert(!std::is_copy_assignable<IControlAuthorization>::value, "");

TEST(ControlAuthorizationInterface, KeepsTheOrderOfItsSlots)
{
    using NotificationTest::SlotOf;
    EXPECT_EQ(0U, SlotOf(&IControlAuthorization::Authorize));
    EXPECT_EQ(1U, SlotOf(&IControlAuthorization::CancelAuthorize));
    EXPECT_EQ(2U, SlotOf(&IControlAuthorization::Heartbeat));
    EXPECT_EQ(3U, SlotOf(&IControlAuthorization::GetAuthorizedCallback));
    EXPECT_EQ(4U, SlotOf(&IControlAuthorization::GetDisconnectedCallback));
    EXPECT_EQ(5U, SlotOf(&IControlAuthorization::GetServerName));
    EXPECT_EQ(6U, SlotOf(&IControlAuthorization::GetCurrentDeviceId));
    EXPECT_EQ(7U, SlotOf(&IControlAuthorization::IsRequestPending));
    EXPECT_EQ(0U, SlotOf(&IQuorixControlAuthorizationGUI::Ask));
    EXPECT_EQ(1U, SlotOf(&IQuorixControlAuthorizationGUI::Cancel));
}

TEST(ControlDeviceNames, AreTheHostsOwn)
{
    EXPECT_STREQ("ControlDevice", ControlDeviceNames::device);
    EXPECT_STREQ("ControlDeviceName", ControlDeviceNames::name);
    EXPECT_STREQ("ControlDeviceSelected", ControlDeviceNames::selected);
    EXPECT_STREQ("ControlDeviceConnected", ControlDeviceNames::connected);
    EXPECT_STREQ("ControlDeviceAuthorized", ControlDeviceNames::authorized);
}

TEST_F(ControlAuthorization, StartsWithNothing)
{
    Make();

    EXPECT_EQ("", manager->GetCurrentDeviceId());
    EXPECT_FALSE(manager->IsRequestPending());
    EXPECT_THAT(manager->GetDevices(), IsEmpty());
    EXPECT_EQ(0U, timers.CountMade());
    EXPECT_THAT(postal->Queue, IsEmpty());
}

TEST_F(ControlAuthorization, ReadingListsThatDoNotExistCreatesNothing)
{
    Make();

    EXPECT_FALSE(view.Has(view.AllowedPath()));
    EXPECT_FALSE(view.Has(view.BannedPath()));
}

TEST_F(ControlAuthorization, ReadsTheTwoListsAndABanWins)
{
    MakeWithLists("a;A\nb;B;b\nnonsense", "b;Banned\nc;C");

    const VControlDevices expected = {
        {"a", {true, "A"}}, {"b", {false, "Banned"}}, {"c", {false, "C"}}};
    EXPECT_EQ(expected, manager->GetDevices());
}

TEST_F(ControlAuthorization, AListOfAnotherTypeIsEmpty)
{
    VDataWriter(*store).SetValue(VDataToken(view.AllowedPath()), MakeBoolValue(true));
    Make();

    EXPECT_THAT(manager->GetDevices(), IsEmpty());
}

TEST_F(ControlAuthorization, AnUnknownDeviceIsPendingUntilTheRequestWasHandled)
{
    MakeWithOperator(EAskOutcome::DeniedOnce);

    EXPECT_EQ(EAuthorizeAnswer::Pending, manager->Authorize("id", "Name"));

    EXPECT_TRUE(manager->IsRequestPending());
    EXPECT_THAT(gui->Questions(), IsEmpty());
    EXPECT_EQ(1, postal->Deliver());
    EXPECT_THAT(gui->Questions(), ElementsAre(Pair("id", "Name")));
    EXPECT_FALSE(manager->IsRequestPending());
}

TEST_F(ControlAuthorization, AnAllowedDeviceIsLetInAtOnceWithoutAQuestion)
{
    MakeWithLists("id;Old name", "");
    manager->SetGUI(gui);

    EXPECT_EQ(EAuthorizeAnswer::Allowed, manager->Authorize("id", "New name"));

    EXPECT_EQ("id", manager->GetCurrentDeviceId());
    EXPECT_FALSE(manager->IsRequestPending());
    EXPECT_FALSE(view.IsRecorded("id"));
    EXPECT_EQ(1, postal->Deliver());
    EXPECT_TRUE(view.IsConnected("id"));
    EXPECT_EQ("New name", view.NameOf("id"));
    EXPECT_THAT(gui->Questions(), IsEmpty());
    EXPECT_THAT(outcomes, IsEmpty());
    const VControlDevices unchanged = {{"id", {true, "Old name"}}};
    EXPECT_EQ(unchanged, manager->GetDevices());
}

TEST_F(ControlAuthorization, ABannedDeviceIsRefusedAndNothingElseHappens)
{
    MakeWithLists("", "id;Name");
    manager->SetGUI(gui);
    const TestSupport::VLogLevel everything("Authorization", 6);
    const TestSupport::VLogCapture log;

    for (int i = 0; i < 3; ++i) {
        EXPECT_EQ(EAuthorizeAnswer::Refused, Ask("id"));
    }

    EXPECT_THAT(gui->Questions(), IsEmpty());
    EXPECT_THAT(outcomes, IsEmpty());
    EXPECT_EQ("", manager->GetCurrentDeviceId());
    EXPECT_FALSE(manager->IsRequestPending());
    EXPECT_FALSE(view.IsRecorded("id"));
    EXPECT_THAT(log.Texts("Authorization"), IsEmpty());
}

TEST_F(ControlAuthorization, WithoutAGUIEveryDeviceIsAcceptedAndNoneRemembered)
{
    Make();
    std::string currentDuringNotification = "unset";
    bool recordedDuringNotification = true;
    onOutcome = [&] {
        currentDuringNotification = manager->GetCurrentDeviceId();
        recordedDuringNotification = view.IsRecorded("id");
    };

    EXPECT_EQ(EAuthorizeAnswer::Pending, Ask("id", "<b>Name</b>"));

    EXPECT_THAT(outcomes, ElementsAre(true));
    EXPECT_EQ("", currentDuringNotification); // the notification comes first
    EXPECT_FALSE(recordedDuringNotification);
    EXPECT_EQ("id", manager->GetCurrentDeviceId());
    EXPECT_TRUE(view.IsConnected("id"));
    EXPECT_EQ("<b>Name</b>", view.NameOf("id"));
    EXPECT_THAT(manager->GetDevices(), IsEmpty());
    EXPECT_FALSE(manager->IsRequestPending());
}

TEST_F(ControlAuthorization, AGUIThatHasGoneCountsAsNone)
{
    MakeWithOperator(EAskOutcome::DeniedAndRemembered);
    gui.reset();

    Ask("id");

    EXPECT_THAT(outcomes, ElementsAre(true));
    EXPECT_EQ("id", manager->GetCurrentDeviceId());
}

TEST_F(ControlAuthorization, AGUIThatJoinsWhileARequestWaitsIsAsked)
{
    Make();
    manager->Authorize("id", "Name");
    manager->SetGUI(gui);

    postal->Deliver();

    EXPECT_THAT(gui->Questions(), ElementsAre(Pair("id", "Name")));
    EXPECT_THAT(outcomes, IsEmpty());
}

TEST_F(ControlAuthorization, MarkupIsShownAndRememberedAsPlainTextAndRecordedAsSent)
{
    MakeWithOperator(EAskOutcome::AllowedAndRemembered);

    Ask("id", "<b>Ann</b> &amp; <i>Bob</i>");

    EXPECT_THAT(gui->Questions(), ElementsAre(Pair("id", "Ann & Bob")));
    const VControlDevices expected = {{"id", {true, "Ann & Bob"}}};
    EXPECT_EQ(expected, manager->GetDevices());
    EXPECT_EQ("<b>Ann</b> &amp; <i>Bob</i>", view.NameOf("id"));
}

TEST_F(ControlAuthorization, NoLockIsHeldWhileTheOperatorIsAsked)
{
    Make();
    gui->Answer = [this] { // each of these would wait for ever
        manager->Heartbeat();
        manager->GetCurrentDeviceId();
        manager->SetDevices(manager->GetDevices());
        manager->CancelAuthorize("id");
        EXPECT_EQ(EAuthorizeAnswer::Pending, manager->Authorize("other", "Other"));
        return EAskOutcome::Cancelled;
    };
    manager->SetGUI(gui);
    manager->Authorize("id", "Name");

    const boost::function<void()> step = postal->Queue.front();
    postal->Queue.pop_front();
    step();

    EXPECT_THAT(gui->Questions(), ElementsAre(Pair("id", "Name")));
}

TEST_F(ControlAuthorization, ARequestIsPendingUntilItsLastStep)
{
    Make();
    bool pendingWhenAsked = false;
    bool pendingWhenTold = false;
    gui->Answer = [&] {
        pendingWhenAsked = manager->IsRequestPending();
        return EAskOutcome::AllowedOnce;
    };
    onOutcome = [&] { pendingWhenTold = manager->IsRequestPending(); };
    manager->SetGUI(gui);

    Ask("id");

    EXPECT_TRUE(pendingWhenAsked);
    EXPECT_TRUE(pendingWhenTold);
    EXPECT_FALSE(manager->IsRequestPending());
}

TEST_F(ControlAuthorization, AnOperatorsSideThatThrowsLeavesNothingPending)
{
    Make();
    gui->Answer = []() -> EAskOutcome { throw std::runtime_error("no display"); };
    manager->SetGUI(gui);

    EXPECT_THROW(Ask("id"), std::runtime_error);

    EXPECT_FALSE(manager->IsRequestPending());
    EXPECT_THAT(outcomes, IsEmpty());
}

TEST_F(ControlAuthorization, AListenerThatThrowsLeavesNothingPendingAndNoLock)
{
    for (const EAskOutcome outcome :
         {EAskOutcome::AllowedOnce, EAskOutcome::DeniedOnce, EAskOutcome::AllowedAndRemembered,
          EAskOutcome::DeniedAndRemembered}) {
        MakeWithOperator(outcome);
        onOutcome = [] { throw std::runtime_error("a listener"); };

        EXPECT_THROW(Ask("id"), std::runtime_error);

        EXPECT_FALSE(manager->IsRequestPending());
        manager->SetDevices({}); // takes the lock
        onOutcome = [] {};
    }
}

TEST_F(ControlAuthorization, CancellingReachesTheGUIWhateverTheId)
{
    MakeWithOperator(EAskOutcome::Cancelled);

    manager->CancelAuthorize("another");
    manager->CancelAuthorize("");

    EXPECT_THAT(gui->Cancelled(), ElementsAre("another", ""));
}

TEST_F(ControlAuthorization, CancellingWithoutAGUIDoesNothing)
{
    Make();
    manager->CancelAuthorize("id");
    manager->SetGUI(gui);
    gui.reset();
    manager->CancelAuthorize("id");
}

TEST_F(ControlAuthorization, ServerNameIsApplicationOnComputer)
{
    Make();

    EXPECT_EQ("Quorix on " + boost::asio::ip::host_name(), manager->GetServerName());
}

TEST_F(ControlAuthorization, SetDevicesReplacesThemAll)
{
    MakeWithLists("a;A", "b;B");
    const VControlDevices replacement = {{"b", {true, "Beta"}}};

    manager->SetDevices(replacement);

    EXPECT_EQ(replacement, manager->GetDevices());
    EXPECT_EQ(EAuthorizeAnswer::Allowed, Ask("b"));
    EXPECT_EQ(EAuthorizeAnswer::Pending, Ask("a"));
}

TEST_F(ControlAuthorization, IdsMayHoldAnything)
{
    Make();
    const std::string ids[] = {"", "a.b.c", "a;b", "a\nb", "\xC3\xA9", std::string(100000, 'x')};
    for (const std::string& id : ids) {
        Ask(id, "N");

        EXPECT_EQ(id, manager->GetCurrentDeviceId());
        EXPECT_TRUE(view.IsConnected(id)) << id.substr(0, 10);
    }
}

TEST_F(ControlAuthorization, TheWildcardAsAnIdHasNoRecord)
{
    Make();
    Ask("a");

    Ask("*");

    EXPECT_EQ("*", manager->GetCurrentDeviceId());
    clock.Advance(3500);
    EXPECT_TRUE(timers.Fire());
    EXPECT_TRUE(view.IsConnected("a")); // no write reaches all of them
}

TEST_F(ControlAuthorization, WithoutAPostalServiceEveryDeviceIsRefused)
{
    manager = KVR::MakeShared<VQuorixControlAuthorization>(nullptr, store);

    EXPECT_EQ(EAuthorizeAnswer::Refused, manager->Authorize("id", "Name"));
    EXPECT_FALSE(manager->IsRequestPending());
}

TEST_F(ControlAuthorization, WithoutAStoreItDecidesAndKeepsNothing)
{
    manager = KVR::MakeShared<VQuorixControlAuthorization>(postal, nullptr, timers.Factory(),
                                                           clock.Function());

    Ask("id");

    EXPECT_EQ("id", manager->GetCurrentDeviceId());
    EXPECT_TRUE(timers.Fire());
    manager.reset();
}
