#include "QuorixPluginControlStreamServer/ControlSystem/EventProviderAuthorized.h"
#include "FakeAuthorization.h"
#include "support/FakeControlSystem.h"

#include <gmock/gmock.h>

#include <map>
#include <memory>
#include <string>
#include <utility>
#include <vector>

using AuthorizationBench::VFakeAuthorization;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

using Content = std::map<std::wstring, std::wstring>;
using Event = std::pair<std::wstring, Content>;

const Event authorizedEvent = {L"Event.Authorize",
                               {{L"Status", L"Authorized"}, {L"ServerName", L"Server \u00E9"}}};
const Event failedEvent = {L"Event.Authorize",
                           {{L"Status", L"Failed"}, {L"ServerName", L"Server \u00E9"}}};
const Event disconnectEvent = {L"Event.Disconnect", {}};

class EventProviderAuthorized : public testing::Test
{
protected:
    EventProviderAuthorized()
    {
        controlSystem->GetEventNotification().Add(
            [this](const std::wstring& name, const ControlSystem::IParameters& parameters) {
                events.emplace_back(name, Content(parameters.begin(), parameters.end()));
            });
    }

    std::shared_ptr<TestSupport::VFakeControlSystem> controlSystem =
        std::make_shared<TestSupport::VFakeControlSystem>();
    std::shared_ptr<VFakeAuthorization> authorization = std::make_shared<VFakeAuthorization>();
    std::shared_ptr<VEventProviderAuthorized> provider =
        std::make_shared<VEventProviderAuthorized>(controlSystem, authorization);
    std::vector<Event> events;
};

} // namespace

TEST_F(EventProviderAuthorized, AppendsItsTwoEventsInOrder)
{
    std::vector<std::wstring> names = {L"Before"};
    provider->GetEventNames(names);

    EXPECT_THAT(names, ElementsAre(L"Before", L"Event.Authorize", L"Event.Disconnect"));
}

TEST_F(EventProviderAuthorized, DescribesNothingAndChecksNothing)
{
    const ControlSystem::IEventInformation information = provider->GetEventInformation();

    EXPECT_EQ(L"", information.Name);
    EXPECT_EQ(L"", information.Description);
    EXPECT_THAT(information.Parameters, IsEmpty());
    EXPECT_EQ(1, provider->CheckEvent().Code);
    EXPECT_THAT(events, IsEmpty());
}

TEST_F(EventProviderAuthorized, PublishesEachOutcome)
{
    authorization->Authorized(true);
    authorization->Authorized(false);

    EXPECT_THAT(events, ElementsAre(authorizedEvent, failedEvent));
}

TEST_F(EventProviderAuthorized, PublishesTheEndWithoutParameters)
{
    authorization->Disconnected();

    EXPECT_THAT(events, ElementsAre(disconnectEvent));
}

TEST_F(EventProviderAuthorized, ItsFunctionsOutliveIt)
{
    provider.reset();

    authorization->Authorized(true);
    authorization->Disconnected();

    EXPECT_THAT(events, ElementsAre(authorizedEvent, disconnectEvent));
    EXPECT_EQ(1, authorization.use_count()); // it holds nothing in its own list
}

TEST_F(EventProviderAuthorized, ItsFunctionsOutliveTheDispatcher)
{
    provider.reset();
    controlSystem.reset(); // which they must not keep: it holds the providers

    authorization->Authorized(true);
    authorization->Disconnected();

    EXPECT_THAT(events, IsEmpty());
}

TEST_F(EventProviderAuthorized, WithoutADispatcherNothingIsPublished)
{
    const VEventProviderAuthorized other(nullptr, authorization);
    provider.reset();

    authorization->Authorized(true);
    authorization->Disconnected();

    EXPECT_THAT(events, ElementsAre(authorizedEvent, disconnectEvent)); // the first one's
}
