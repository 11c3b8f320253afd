#include "QuorixPluginControlStreamServer/ControlSystem/CommandProviderAuthorization.h"
#include "AuthorizationBench.h"
#include "FakeAuthorization.h"

#include <gmock/gmock.h>

#include <tuple>

using AuthorizationBench::VFakeAuthorization;
using ControlSystem::IParameters;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Pair;

namespace {

using Content = std::map<std::wstring, std::wstring>;

Content ContentOf(const IParameters& parameters)
{
    return Content(parameters.begin(), parameters.end());
}

class CommandProviderAuthorization : public testing::Test
{
protected:
    /// Runs a command. @return its code; the reply is in `reply`
    std::int32_t Run(const std::wstring& name, const Content& input = {})
    {
        IParameters parameters;
        for (const auto& [key, value] : input) {
            parameters.Set(key, value);
        }
        reply = IParameters();
        return provider->ExecuteCommand(name, parameters, reply).Code;
    }

    /// Lets a device ask. @return the status
    std::wstring Ask(const std::wstring& deviceId)
    {
        EXPECT_EQ(1, Run(L"System.Authorize", {{L"DeviceId", deviceId}, {L"DeviceName", L"N"}}));
        return reply.Get(L"Status");
    }

    const std::shared_ptr<VFakeAuthorization> authorization =
        std::make_shared<VFakeAuthorization>();
    AuthorizationBench::VManualClock clock;
    std::shared_ptr<VCommandProviderAuthorization> provider =
        std::make_shared<VCommandProviderAuthorization>(authorization, clock.Function());
    IParameters reply;
};

} // namespace

TEST_F(CommandProviderAuthorization, AppendsItsThreeCommandsInOrder)
{
    std::vector<std::wstring> names = {L"Before"};
    provider->GetCommandNames(names);

    EXPECT_THAT(names, ElementsAre(L"Before", L"System.Authorize", L"System.Authorize.Cancel",
                                   L"System.Heartbeat"));
}

TEST_F(CommandProviderAuthorization, DeliberatelyDescribesNoneOfItsCommands)
{
    for (const wchar_t* const name :
         {L"System.Authorize", L"System.Authorize.Cancel", L"System.Heartbeat", L"Other"}) {
        const ControlSystem::ICommandInformation information =
            provider->GetCommandInformation(name);
        EXPECT_EQ(L"", information.Name);
        EXPECT_EQ(L"Command not found.", information.Description);
        EXPECT_THAT(information.InputParameters, IsEmpty());
        EXPECT_THAT(information.ReplyParameters, IsEmpty());
    }
}

TEST_F(CommandProviderAuthorization, AuthorizeRepliesWithStatusServerNameAndVersion)
{
    authorization->Answer = EAuthorizeAnswer::Allowed;

    EXPECT_EQ(1, Run(L"System.Authorize", {{L"DeviceId", L"id"}, {L"DeviceName", L"Name"}}));

    const Content expected = {
        {L"Status", L"Authorized"}, {L"ServerName", L"Server \u00E9"}, {L"ServerVersion", L"300"}};
    EXPECT_EQ(expected, ContentOf(reply));
    EXPECT_THAT(authorization->Asked, ElementsAre(Pair("id", "Name")));
}

TEST_F(CommandProviderAuthorization, AuthorizeEchoesAServerNameThatTheDeviceGives)
{
    EXPECT_EQ(1, Run(L"System.Authorize", {{L"DeviceId", L"id"}, {L"ServerName", L" mine"}}));

    EXPECT_EQ(L" mine", reply.Get(L"ServerName"));
}

TEST_F(CommandProviderAuthorization, EachAnswerHasItsStatusAndTheCode1)
{
    const std::tuple<EAuthorizeAnswer, const wchar_t*> cases[] = {
        {EAuthorizeAnswer::Refused, L"Failed"},
        {EAuthorizeAnswer::Pending, L"Pending"},
        {EAuthorizeAnswer::Allowed, L"Authorized"},
    };
    for (const auto& [answer, status] : cases) {
        authorization->Answer = answer;
        EXPECT_EQ(status, Ask(L"id")); // expects code 1
        EXPECT_EQ(L"300", reply.Get(L"ServerVersion"));
        EXPECT_EQ(L"Server \u00E9", reply.Get(L"ServerName"));
    }
}

TEST_F(CommandProviderAuthorization, IdsAndNamesAreUtf8OnTheOtherSide)
{
    Run(L"System.Authorize", {{L"DeviceId", L"\u00E9\xD83D\xDE00"}, {L"DeviceName", L"\u4E00"}});

    EXPECT_THAT(authorization->Asked,
                ElementsAre(Pair("\xC3\xA9\xF0\x9F\x98\x80", "\xE4\xB8\x80")));
}

TEST_F(CommandProviderAuthorization, AMissingIdIsAnEmptyOne)
{
    EXPECT_EQ(1, Run(L"System.Authorize"));

    EXPECT_THAT(authorization->Asked, ElementsAre(Pair("", "")));
}

TEST_F(CommandProviderAuthorization, BeforeAnyBeatNobodyHoldsTheConnection)
{
    authorization->CurrentDeviceId = "other";

    EXPECT_EQ(L"Pending", Ask(L"id"));
}

TEST_F(CommandProviderAuthorization, AnotherDeviceIsKeptOutFor3499Milliseconds)
{
    authorization->CurrentDeviceId = "first";
    Run(L"System.Heartbeat");

    clock.Advance(3499);
    EXPECT_EQ(L"Connected", Ask(L"second"));
    EXPECT_EQ(L"300", reply.Get(L"ServerVersion"));
    EXPECT_EQ(L"Server \u00E9", reply.Get(L"ServerName"));
    EXPECT_THAT(authorization->Asked, IsEmpty());

    clock.Advance(1); // to have asked has not moved the beat
    EXPECT_EQ(L"Pending", Ask(L"second"));
    EXPECT_THAT(authorization->Asked, ElementsAre(Pair("second", "N")));
}

TEST_F(CommandProviderAuthorization, TheHolderMayAskAgainUnlessARequestIsPending)
{
    authorization->CurrentDeviceId = "id";
    authorization->Answer = EAuthorizeAnswer::Allowed;
    Run(L"System.Heartbeat");

    EXPECT_EQ(L"Authorized", Ask(L"id"));
    authorization->Pending = true;
    EXPECT_EQ(L"Connected", Ask(L"id"));
    EXPECT_EQ(1U, authorization->Asked.size());
}

TEST_F(CommandProviderAuthorization, WithoutAFreshBeatAPendingRequestKeepsEveryoneOut)
{
    authorization->Pending = true;

    EXPECT_EQ(L"Connected", Ask(L"id"));
    EXPECT_EQ(L"Connected", Ask(L"another"));
    EXPECT_THAT(authorization->Asked, IsEmpty());
}

TEST_F(CommandProviderAuthorization, OnlyAnAnswerOfAllowedCountsAsABeat)
{
    authorization->CurrentDeviceId = "first";
    authorization->Answer = EAuthorizeAnswer::Refused;
    EXPECT_EQ(L"Failed", Ask(L"first"));
    authorization->Answer = EAuthorizeAnswer::Pending;
    EXPECT_EQ(L"Pending", Ask(L"first"));
    EXPECT_EQ(L"Pending", Ask(L"second"));

    authorization->Answer = EAuthorizeAnswer::Allowed;
    EXPECT_EQ(L"Authorized", Ask(L"first"));
    EXPECT_EQ(L"Connected", Ask(L"second"));
    clock.Advance(3500);
    EXPECT_EQ(L"Authorized", Ask(L"second"));
}

TEST_F(CommandProviderAuthorization, TheOutcomeOfARequestCountsAsABeatOnlyWhenPositive)
{
    authorization->CurrentDeviceId = "first";

    authorization->Authorized(false);
    EXPECT_EQ(L"Pending", Ask(L"second"));

    authorization->Authorized(true);
    EXPECT_EQ(L"Connected", Ask(L"second"));
    clock.Advance(3500);
    EXPECT_EQ(L"Pending", Ask(L"second"));
}

TEST_F(CommandProviderAuthorization, AHeartbeatEchoesItsIdAndReachesTheAuthorization)
{
    EXPECT_EQ(1, Run(L"System.Heartbeat", {{L"BeatId", L"\u00E9 7"}, {L"Other", L"x"}}));

    const Content expected = {{L"BeatId", L"\u00E9 7"}};
    EXPECT_EQ(expected, ContentOf(reply));
    EXPECT_EQ(1, authorization->Beats);
}

TEST_F(CommandProviderAuthorization, AHeartbeatWithoutAnIdAnswersWithAnEmptyOne)
{
    EXPECT_EQ(1, Run(L"System.Heartbeat"));

    const Content expected = {{L"BeatId", L""}};
    EXPECT_EQ(expected, ContentOf(reply));
}

TEST_F(CommandProviderAuthorization, CancellingWorksAndDeliberatelyFailsAsUnknown)
{
    EXPECT_EQ(2, Run(L"System.Authorize.Cancel", {{L"DeviceId", L"\u00E9"}}));

    EXPECT_THAT(authorization->Cancelled, ElementsAre("\xC3\xA9"));
    const Content expected = {{L"Status", L"Unknown Command"}};
    EXPECT_EQ(expected, ContentOf(reply));
    EXPECT_EQ(0, authorization->Beats);
}

TEST_F(CommandProviderAuthorization, OtherNamesAreUnknownAndChangeNothing)
{
    for (const wchar_t* const name :
         {L"", L"System.authorize", L"System.Authorize ", L"System.Heartbeats", L"System",
          L"System.Authorize.cancel", L"CameraSettings_GetSelection"}) {
        EXPECT_EQ(2, Run(name, {{L"DeviceId", L"id"}})) << name;
        const Content expected = {{L"Status", L"Unknown Command"}};
        EXPECT_EQ(expected, ContentOf(reply));
    }
    EXPECT_THAT(authorization->Asked, IsEmpty());
    EXPECT_THAT(authorization->Cancelled, IsEmpty());
    EXPECT_EQ(0, authorization->Beats);
}

TEST_F(CommandProviderAuthorization, WhatItLeavesWithTheAuthorizationOutlivesIt)
{
    provider.reset();

    authorization->Authorized(true); // a use after free would show under the address sanitizer

    EXPECT_EQ(1U, authorization->Authorized.Count());
    EXPECT_EQ(1, authorization.use_count()); // it holds nothing in its own list
}
