#include "AuthorizationBench.h"
#include "DebugServices/AssertFailHandler.h"
#include "QuorixPluginControlStreamServer/ControlSystem/CommandProviderAuthorization.h"
#include "QuorixPluginControlStreamServer/ControlSystem/EventProviderAuthorized.h"
#include "notification/AsioPostalService.h"
#include "support/FakeControlSystem.h"
#include "support/LogCapture.h"

#include <gmock/gmock.h>

#include <atomic>
#include <stdexcept>
#include <thread>

// The end of the authorization: what it still does, and that everything that it works with may go
// first.

using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

namespace {

/// A timer that waits no longer than others need to get at the authorization in between.
std::shared_ptr<void> SoonTimer(const std::shared_ptr<KVR::IAsioPostalService>& service,
                                boost::function<void()> function, std::uint32_t /*milliseconds*/)
{
    return NotificationSystem::MakeDeadlineTimer(service, std::move(function), 1);
}

class AuthorizationEnd : public AuthorizationBench::VAuthorizationBench
{
};

} // namespace

TEST_F(AuthorizationEnd, TellsTheListenersBeforeItWritesTheLists)
{
    MakeWithLists("a;A", "b;B");
    manager->SetDevices({{"c", {true, "C"}}, {"d", {false, "D"}}});
    int told = 0;
    std::string allowedWhenTold;
    manager->GetDisconnectedCallback().Add([&] {
        ++told;
        allowedWhenTold = view.Allowed();
    });

    manager.reset();

    EXPECT_EQ(1, told);
    EXPECT_EQ("a;A", allowedWhenTold);
    EXPECT_EQ("c;C", view.Allowed());
    EXPECT_EQ("d;D", view.Banned());
}

TEST_F(AuthorizationEnd, IsToldAtNoOtherTime)
{
    Make();
    int told = 0;
    manager->GetDisconnectedCallback().Add([&] { ++told; });

    Ask("id");
    clock.Advance(100000);
    timers.Fire();
    Ask("other");

    EXPECT_EQ(0, told);
    manager.reset();
    EXPECT_EQ(1, told);
}

TEST_F(AuthorizationEnd, WritesBothListsAlsoWhereTheyAreEmpty)
{
    MakeWithLists("a;A", "b;B");
    manager->SetDevices({});

    manager.reset();

    EXPECT_TRUE(view.Has(view.AllowedPath()));
    EXPECT_TRUE(view.Has(view.BannedPath()));
    EXPECT_EQ("", view.Allowed());
    EXPECT_EQ("", view.Banned());
}

TEST_F(AuthorizationEnd, TheNextOneReadsWhatThisOneWrote)
{
    Make();
    const VControlDevices devices = {{"", {false, "nameless id"}},
                                     {"a", {true, "A;x"}},
                                     {"b.c", {false, "\xC3\xA9"}},
                                     {"\xF0\x9F\x98\x80", {true, ""}}};
    manager->SetDevices(devices);
    manager.reset();

    Make();

    EXPECT_EQ(devices, manager->GetDevices());
}

TEST_F(AuthorizationEnd, WritesTheListsAlsoWhereAListenerThrows)
{
    const TestSupport::VLogCapture log;
    for (const bool known : {true, false}) {
        MakeWithLists("", "");
        manager->SetDevices({{"a", {true, "A"}}, {"b", {false, "B"}}});
        manager->GetDisconnectedCallback().Add([known] {
            if (known) {
                throw std::runtime_error("a listener's");
            }
            throw 1;
        });

        manager.reset();

        EXPECT_EQ("a;A", view.Allowed());
        EXPECT_EQ("b;B", view.Banned());
    }
    EXPECT_THAT(log.Texts("Authorization"), ElementsAre(HasSubstr("a listener's"), HasSubstr("")));
}

TEST_F(AuthorizationEnd, AStoreThatFailsAnAssertionEndsNothing)
{
    Make();
    manager->SetDevices({{"a", {true, "A"}}});
    const TestSupport::VLogCapture log;
    const auto previous = DebugServices::SetAssertFailHandler(
        [](const char* text, const char*, int) { throw std::runtime_error(text); });
    {
        const VDataReader reader(*store); // no writer may be made beneath it
        manager.reset();
    }
    DebugServices::SetAssertFailHandler(previous);

    EXPECT_EQ("", view.Allowed());
    EXPECT_THAT(log.Texts("Authorization"), ElementsAre(HasSubstr("writing the lists")));
}

TEST_F(AuthorizationEnd, AStepThatStillWaitsDoesNothing)
{
    MakeWithOperator(EAskOutcome::AllowedOnce);
    manager->SetDevices({{"known", {true, "K"}}});
    manager->Authorize("known", "K");
    manager->Authorize("id", "Name");
    const std::weak_ptr<VQuorixControlAuthorization> watched = manager;

    manager.reset();

    EXPECT_TRUE(watched.expired()); // the steps do not hold it
    EXPECT_EQ(2, postal->Deliver());
    EXPECT_THAT(gui->Questions(), IsEmpty());
    EXPECT_THAT(outcomes, IsEmpty());
    EXPECT_FALSE(view.IsRecorded("id"));
    EXPECT_FALSE(view.IsRecorded("known"));
}

TEST_F(AuthorizationEnd, AStepThatRunsIsFinishedFirst)
{
    Make();
    gui->Answer = [this] {
        manager.reset(); // as when the plug-in goes while a dialog is open
        return EAskOutcome::AllowedAndRemembered;
    };
    manager->SetGUI(gui);

    Ask("id", "Name");

    EXPECT_THAT(outcomes, ElementsAre(true));
    EXPECT_TRUE(view.IsConnected("id"));
    EXPECT_EQ("id;Name", view.Allowed());
    EXPECT_EQ(0U, timers.CountHeld());
}

TEST_F(AuthorizationEnd, ACheckThatHoldsTheLastReferenceEndsItOnItsOwnThread)
{
    NotificationTest::VLatch waits, released, ended;
    manager =
        KVR::MakeShared<VQuorixControlAuthorization>(postal, store, &SoonTimer, clock.Function());
    manager->GetDisconnectedCallback().Add([&] { ended.CountDown(); });
    bool once = false;
    clock.Advance(4000);
    view.Listeners(VDataPath("Control.id.Connected")).OnVerifiedChanged.Add([&] {
        if (!view.IsConnected("id") && !once) { // the check's write
            once = true;
            waits.CountDown();
            released.Wait();
        }
    });
    Ask("id");
    clock.Advance(4000);
    ASSERT_TRUE(waits.Wait());

    manager.reset();
    released.CountDown();

    EXPECT_TRUE(ended.Wait());
}

TEST_F(AuthorizationEnd, OnceTheCheckHasEndedTheLastReferenceIsItsOwners)
{
    for (int round = 0; round < 50; ++round) {
        manager = KVR::MakeShared<VQuorixControlAuthorization>(postal, store, &SoonTimer);
        Ask("id");
        bool told = false;
        manager->GetDisconnectedCallback().Add([&told] { told = true; });

        manager->EndHeartbeatCheck();
        manager.reset();

        ASSERT_TRUE(told) << round;
    }
}

TEST_F(AuthorizationEnd, ACheckThatHasEndedIsNotScheduledAgain)
{
    Make();
    Ask("id");
    manager->EndHeartbeatCheck();

    EXPECT_EQ(0U, timers.CountHeld());
    Ask("other");

    EXPECT_TRUE(view.IsConnected("other"));
    EXPECT_EQ(1U, timers.CountMade());
}

TEST_F(AuthorizationEnd, ACheckThatComesAfterItsEndDoesNothing)
{
    Make();
    Ask("id");
    const auto timer = timers.Last(); // it has expired, and its function is on its way
    manager->EndHeartbeatCheck();
    clock.Advance(4000);

    EXPECT_TRUE(KVR::GuardedCall(timer->Function));

    EXPECT_TRUE(view.IsConnected("id"));
}

TEST_F(AuthorizationEnd, TheChecksThreadIsWaitedFor)
{
    Make();
    Ask("id");
    NotificationTest::VLatch ending;
    std::atomic<bool> left{false};
    timers.Last()->Service->Post(
        [&] {
            ending.Wait();
            left = true;
        },
        0);

    ending.CountDown();
    manager->EndHeartbeatCheck();

    EXPECT_TRUE(left);
}

namespace {

/// Everything of an authorization on real threads, and one thing of it to release first.
class VReleaseBench
{
public:
    VReleaseBench()
    {
        gui->Answer = [] { return EAskOutcome::AllowedOnce; };
        manager->SetGUI(gui);
        manager->Authorize("id", "Name");
    }

    std::shared_ptr<TestSupport::VFakeControlSystem> controlSystem =
        std::make_shared<TestSupport::VFakeControlSystem>();
    std::shared_ptr<VDataStore> store = std::make_shared<VDataStore>();
    std::shared_ptr<KVR::IPostalService> postal =
        std::make_shared<NotificationSystem::VAsioPostalService>("Steps", 1, 0);
    std::shared_ptr<AuthorizationBench::VScriptedGUI> gui =
        std::make_shared<AuthorizationBench::VScriptedGUI>();
    std::shared_ptr<VQuorixControlAuthorization> manager =
        KVR::MakeShared<VQuorixControlAuthorization>(postal, store, &SoonTimer);
    std::shared_ptr<ControlSystem::ICommandProvider> commands =
        std::make_shared<VCommandProviderAuthorization>(manager);
    std::shared_ptr<ControlSystem::IEventProvider> events =
        std::make_shared<VEventProviderAuthorized>(controlSystem, manager);
};

using Release = void (*)(VReleaseBench&);

struct VReleaseCase
{
    const char* name;
    Release first;
};

const VReleaseCase releaseCases[] = {
    {"Manager", [](VReleaseBench& bench) { bench.manager.reset(); }},
    {"Commands", [](VReleaseBench& bench) { bench.commands.reset(); }},
    {"Events", [](VReleaseBench& bench) { bench.events.reset(); }},
    {"ControlSystem", [](VReleaseBench& bench) { bench.controlSystem.reset(); }},
    {"GUI", [](VReleaseBench& bench) { bench.gui.reset(); }},
    {"PostalService", [](VReleaseBench& bench) { bench.postal.reset(); }},
    {"Store", [](VReleaseBench& bench) { bench.store.reset(); }},
};

class AuthorizationRelease : public testing::TestWithParam<std::tuple<VReleaseCase, VReleaseCase>>
{
};

} // namespace

TEST_P(AuthorizationRelease, InAnyOrderWithStepsAndChecksOnTheirWayIsSafe)
{
    for (int round = 0; round < 10; ++round) {
        VReleaseBench bench;
        std::thread device([commands = bench.commands] {
            ControlSystem::IParameters reply;
            for (int i = 0; i < 20; ++i) {
                commands->ExecuteCommand(L"System.Heartbeat", {}, reply);
                commands->ExecuteCommand(L"System.Authorize", {}, reply);
                commands->ExecuteCommand(L"System.Authorize.Cancel", {}, reply);
            }
        });

        std::get<0>(GetParam()).first(bench);
        std::get<1>(GetParam()).first(bench);
        device.join();
        // The rest goes in the order of the fields; a step or a check that runs may be the last.
    }
}

INSTANTIATE_TEST_SUITE_P(Orders, AuthorizationRelease,
                         testing::Combine(testing::ValuesIn(releaseCases),
                                          testing::ValuesIn(releaseCases)),
                         [](const auto& test) {
                             return std::string(std::get<0>(test.param).name) + "Then" +
                                    std::get<1>(test.param).name;
                         });
