#include "AuthorizationBench.h"

#include <gmock/gmock.h>

#include <chrono>
#include <future>
#include <optional>

// What each answer of the operator brings about.

using testing::ElementsAre;
using testing::IsEmpty;

namespace {

struct VOutcomeCase
{
    const char* name;
    EAskOutcome outcome;
    std::optional<bool> told;       ///< what the notification says, empty for none
    std::optional<bool> remembered; ///< whether the record says allowed, empty for no record
    bool connected;
};

// clang-format off
const VOutcomeCase outcomeCases[] = {
    {"Cancelled",            EAskOutcome::Cancelled,            {},    {},    false},
    {"AllowedOnce",          EAskOutcome::AllowedOnce,          true,  {},    true},
    {"DeniedOnce",           EAskOutcome::DeniedOnce,           false, {},    false},
    {"AllowedAndRemembered", EAskOutcome::AllowedAndRemembered, true,  true,  true},
    {"DeniedAndRemembered",  EAskOutcome::DeniedAndRemembered,  false, false, false},
    {"BelowTheTable",        static_cast<EAskOutcome>(-1),      {},    {},    false},
    {"BeyondTheTable",       static_cast<EAskOutcome>(5),       {},    {},    false},
};
// clang-format on

class ControlOutcomes : public AuthorizationBench::VAuthorizationBench,
                        public testing::WithParamInterface<VOutcomeCase>
{
};

using ControlOutcome = AuthorizationBench::VAuthorizationBench;

} // namespace

TEST_P(ControlOutcomes, AreAppliedAsTheOperatorAnswers)
{
    MakeWithOperator(GetParam().outcome);

    Ask("id", "<b>Name</b>");

    EXPECT_EQ(GetParam().told ? std::vector<bool>{*GetParam().told} : std::vector<bool>(),
              outcomes);
    VControlDevices devices;
    if (GetParam().remembered) {
        devices["id"] = {*GetParam().remembered, "Name"};
    }
    EXPECT_EQ(devices, manager->GetDevices());
    EXPECT_EQ(GetParam().connected ? "id" : "", manager->GetCurrentDeviceId());
    EXPECT_EQ(GetParam().connected, view.IsRecorded("id"));
    EXPECT_EQ(GetParam().connected ? 1U : 0U, timers.CountMade());
    EXPECT_FALSE(manager->IsRequestPending());
}

TEST_P(ControlOutcomes, LeaveARecordOfAnotherDeviceAlone)
{
    MakeWithLists("a;A", "b;B");
    gui->Answer = [] { return GetParam().outcome; };
    manager->SetGUI(gui);

    Ask("id");

    VControlDevices devices = {{"a", {true, "A"}}, {"b", {false, "B"}}};
    if (GetParam().remembered) {
        devices["id"] = {*GetParam().remembered, "A device"};
    }
    EXPECT_EQ(devices, manager->GetDevices());
}

INSTANTIATE_TEST_SUITE_P(Cases, ControlOutcomes, testing::ValuesIn(outcomeCases),
                         [](const auto& test) { return test.param.name; });

TEST_F(ControlOutcome, OfADeviceThatIsAllowedOnceMayBeAnotherNextTime)
{
    MakeWithOperator(EAskOutcome::AllowedOnce);
    Ask("id");
    gui->Answer = [] { return EAskOutcome::DeniedOnce; };

    EXPECT_EQ(EAuthorizeAnswer::Pending, Ask("id"));

    EXPECT_THAT(outcomes, ElementsAre(true, false));
    EXPECT_EQ("id", manager->GetCurrentDeviceId()); // nothing takes it back
}

TEST_F(ControlOutcome, AllowedAndRememberedIsLetInNextTime)
{
    MakeWithOperator(EAskOutcome::AllowedAndRemembered);
    Ask("id");

    EXPECT_EQ(EAuthorizeAnswer::Allowed, Ask("id"));

    EXPECT_EQ(1U, gui->Questions().size());
    EXPECT_THAT(outcomes, ElementsAre(true));
}

TEST_F(ControlOutcome, DeniedAndRememberedIsRefusedNextTime)
{
    MakeWithOperator(EAskOutcome::DeniedAndRemembered);
    Ask("id");

    EXPECT_EQ(EAuthorizeAnswer::Refused, Ask("id"));

    EXPECT_EQ(1U, gui->Questions().size());
    EXPECT_THAT(outcomes, ElementsAre(false));
}

TEST_F(ControlOutcome, AllowedOnceIsToldWithNoLockWithTheDeviceSetAndBeforeTheRecord)
{
    MakeWithOperator(EAskOutcome::AllowedOnce);
    std::string current;
    bool recorded = true;
    onOutcome = [&] {
        current = manager->GetCurrentDeviceId(); // would wait for ever for a lock
        recorded = view.IsRecorded("id");
    };

    Ask("id");

    EXPECT_EQ("id", current);
    EXPECT_FALSE(recorded);
    EXPECT_TRUE(view.IsRecorded("id"));
}

TEST_F(ControlOutcome, DeniedOnceIsToldWithNoLock)
{
    MakeWithOperator(EAskOutcome::DeniedOnce);
    onOutcome = [this] { manager->GetDevices(); }; // would wait for ever for a lock

    Ask("id");

    EXPECT_THAT(outcomes, ElementsAre(false));
}

TEST_F(ControlOutcome, ARememberedOneIsToldAndStoredInOneHoldOfTheLock)
{
    for (const EAskOutcome outcome :
         {EAskOutcome::AllowedAndRemembered, EAskOutcome::DeniedAndRemembered}) {
        MakeWithOperator(outcome);
        std::future<std::pair<VControlDevices, std::string>> seen;
        onOutcome = [&] {
            seen = std::async(std::launch::async, [this] {
                VControlDevices devices = manager->GetDevices();
                return std::make_pair(std::move(devices), manager->GetCurrentDeviceId());
            });
            // Without the lock it would be there at once.
            EXPECT_EQ(std::future_status::timeout, seen.wait_for(std::chrono::milliseconds(50)));
        };

        Ask("id", "Name");

        const bool allowed = outcome == EAskOutcome::AllowedAndRemembered;
        const auto [devices, current] = seen.get();
        const VControlDevices expected = {{"id", {allowed, "Name"}}};
        EXPECT_EQ(expected, devices);
        EXPECT_EQ(allowed ? "id" : "", current);
        onOutcome = [] {};
    }
}

TEST_F(ControlOutcome, TheLockIsReleasedBeforeTheRecordIsWritten)
{
    MakeWithOperator(EAskOutcome::AllowedAndRemembered);
    std::string current;
    view.Listeners(VDataPath("Control.*")).OnAnyChange.Add([&] {
        current = manager->GetCurrentDeviceId(); // would wait for ever for a lock
    });

    Ask("id");

    EXPECT_EQ("id", current);
}

TEST_F(ControlOutcome, ReachesTheListsOnlyWhenTheAuthorizationGoes)
{
    MakeWithOperator(EAskOutcome::AllowedAndRemembered);

    Ask("id", "Name");

    EXPECT_FALSE(view.Has(view.AllowedPath()));
    manager.reset();
    EXPECT_EQ("id;Name", view.Allowed());
}

TEST_F(ControlOutcome, MarkupThatBreaksTheLineAddsNobodyToTheLists)
{
    MakeWithOperator(EAskOutcome::AllowedAndRemembered);
    Ask("id", "Foo<br>victim;y");
    EXPECT_EQ("Foo\nvictim;y", gui->Questions().at(0).second);

    manager.reset();
    Make();

    const VControlDevices expected = {{"id", {true, "Foo victim;y"}}};
    EXPECT_EQ(expected, manager->GetDevices());
}

TEST_F(ControlOutcome, MarkupThatNamesAZeroKeepsNoListOutOfTheFile)
{
    MakeWithOperator(EAskOutcome::DeniedAndRemembered);
    Ask("id", "Foo&#0;bar");

    manager.reset();

    EXPECT_EQ("id;Foo bar", view.Banned());
}
