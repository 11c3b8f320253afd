#include "QuorixPluginControlStreamServer/ControlSystem/EventProviderCameraSelection.h"
#include "QuorixPluginControlStreamServer/ControlSystem/EventProviderCameraSettings.h"

#include "QuorixDataStoreTypes/GreyscaleMode.h"
#include "io/Values.h"
#include "notification/MakeShared.h"
#include "support/FakeCameras.h"
#include "support/FakeControlSystem.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <thread>

using testing::ElementsAre;
using testing::IsEmpty;

namespace {

using Parameters = std::vector<std::pair<std::wstring, std::wstring>>;

struct VHeardEvent
{
    std::wstring name;
    Parameters parameters;
    std::thread::id thread;
};

/// Both providers on fake sources, and whoever listens to the dispatcher.
class CameraEvents : public testing::Test
{
protected:
    CameraEvents()
    {
        dispatcher.GetEventNotification().Add(
            [this](const std::wstring& name, const ControlSystem::IParameters& parameters) {
                heard.push_back(
                    {name, {parameters.begin(), parameters.end()}, std::this_thread::get_id()});
            });

        TestSupport::VFakeDevice& camera = settings->Add("Device", "qx:7");
        camera.Add("Name", MakeStringValue("Front \xC3\xA9"));
        camera.Add("UserId", MakeUInt32Value(42));
        camera.Add("DisplayType", MakeStringValue("Optical"));
        camera.Add("GreyscaleMode", MakeEnumValue(GreyscaleModeSchema(), 5));
        camera.Add("StrobeIntensity", MakeDoubleValue(0.5));
        camera.Add("Threshold", MakeDoubleValue(0.25));
        camera.Add("ShutterDuration", MakeDoubleValue(0.01));
        settings->Add("System", "Gen6System").Add("EnableTapToSelect", MakeBoolValue(true));
    }

    void Report(const std::string& deviceClass, const std::string& deviceId)
    {
        settings->DeviceAdded(deviceClass, deviceId);
    }

    void Change(const std::string& parameter)
    {
        (void)settings->Devices[{"Device", "qx:7"}]->Parameters[parameter]->Changed();
    }

    std::size_t Subscriptions() const
    {
        std::size_t count = 0;
        for (const auto& device : settings->Devices) {
            for (const auto& parameter : device.second->Parameters) {
                count += parameter.second->Changed.Count();
            }
        }
        return count;
    }

    std::vector<VHeardEvent> heard;
    TestSupport::VFakeControlSystem dispatcher;
    std::shared_ptr<TestSupport::VFakeCameraSettings> settings =
        std::make_shared<TestSupport::VFakeCameraSettings>();
    std::shared_ptr<TestSupport::VFakeCameraSelection> selection =
        std::make_shared<TestSupport::VFakeCameraSelection>();
    std::shared_ptr<VEventProviderCameraSettings> settingsEvents =
        KVR::MakeShared<VEventProviderCameraSettings>(&dispatcher, settings);
    std::shared_ptr<VEventProviderCameraSelection> selectionEvents =
        KVR::MakeShared<VEventProviderCameraSelection>(&dispatcher, selection);
};

TEST_F(CameraEvents, AreListedInTheirOrderBehindWhatIsThere)
{
    std::vector<std::wstring> names{L"Before"};

    settingsEvents->GetEventNames(names);
    selectionEvents->GetEventNames(names);

    EXPECT_THAT(
        names, ElementsAre(L"Before", L"Event.Cameras.NameChanged", L"Event.Cameras.UserIdChanged",
                           L"Event.Cameras.GreyscaleModeChanged", L"Event.Cameras.SettingChanged",
                           L"Event.Cameras.TapToSelectChanged", L"Event.Cameras.SelectionChanged"));
}

TEST_F(CameraEvents, InformationIsEmptyDeliberatelyAndCheckIs1)
{
    ControlSystem::IEventProvider* const providers[] = {settingsEvents.get(),
                                                        selectionEvents.get()};
    for (ControlSystem::IEventProvider* provider : providers) {
        const ControlSystem::IEventInformation information = provider->GetEventInformation();
        EXPECT_EQ(information.Name, L"");
        EXPECT_EQ(information.Description, L"");
        EXPECT_THAT(information.Parameters, IsEmpty());
        EXPECT_EQ(provider->CheckEvent().Code, 1);
    }
    EXPECT_THAT(heard, IsEmpty());
}

struct VChangeCase
{
    const char* parameter;
    std::wstring event;
    Parameters parameters;
};

// clang-format off
const VChangeCase changeCases[] = {
    {"Name", L"Event.Cameras.NameChanged", {{L"CameraId", L"7"}, {L"CameraName", L"Front \u00E9"}, {L"CameraType", L"Optical"}}},
    {"UserId", L"Event.Cameras.UserIdChanged", {{L"CameraId", L"7"}, {L"UserId", L"42"}}},
    {"GreyscaleMode", L"Event.Cameras.GreyscaleModeChanged", {{L"CameraId", L"7"}, {L"GreyscaleMode", L"No Edges"}}},
    {"StrobeIntensity", L"Event.Cameras.SettingChanged", {{L"CameraId", L"7"}, {L"SettingName", L"StrobeIntensity"}, {L"SettingValue", L"0.5"}}},
    {"Threshold", L"Event.Cameras.SettingChanged", {{L"CameraId", L"7"}, {L"SettingName", L"Threshold"}, {L"SettingValue", L"0.25"}}},
    {"ShutterDuration", L"Event.Cameras.SettingChanged", {{L"CameraId", L"7"}, {L"SettingName", L"ShutterDuration"}, {L"SettingValue", L"0.01"}}},
};
// clang-format on

class CameraChanges : public CameraEvents, public testing::WithParamInterface<VChangeCase>
{
};

TEST_P(CameraChanges, ArePublished)
{
    Report("Device", "qx:7");

    Change(GetParam().parameter);

    ASSERT_EQ(heard.size(), 1U);
    EXPECT_EQ(heard[0].name, GetParam().event);
    EXPECT_EQ(heard[0].parameters, GetParam().parameters);
}

INSTANTIATE_TEST_SUITE_P(All, CameraChanges, testing::ValuesIn(changeCases),
                         [](const auto& test) { return std::string(test.param.parameter); });

TEST_F(CameraEvents, TapToSelectBearsTheCommandsParameterAndNoCamera)
{
    Report("System", "Gen6System");
    auto& tap = *settings->Devices[{"System", "Gen6System"}]->Parameters["EnableTapToSelect"];

    (void)tap.Changed();
    tap.Value = MakeBoolValue(false);
    (void)tap.Changed();

    ASSERT_EQ(heard.size(), 2U);
    EXPECT_EQ(heard[0].name, L"Event.Cameras.TapToSelectChanged");
    EXPECT_THAT(heard[0].parameters, ElementsAre(std::pair(L"Param_TapEnabled", L"1")));
    EXPECT_THAT(heard[1].parameters, ElementsAre(std::pair(L"Param_TapEnabled", L"0")));
}

TEST_F(CameraEvents, EachNotificationIsOneEventDeliberatelyAlsoWithoutAChange)
{
    Report("Device", "qx:7");

    for (int i = 0; i < 5; ++i) {
        Change("StrobeIntensity");
    }

    EXPECT_EQ(heard.size(), 5U);
}

TEST_F(CameraEvents, OtherDevicesAreNotSubscribedTo)
{
    settings->Add("Device", "other:7").Add("Name", MakeStringValue("x"));
    settings->Add("Device", "qx:").Add("Name", MakeStringValue("x"));
    settings->Add("Device", "qx:7a").Add("Name", MakeStringValue("x"));
    settings->Add("System", "Other").Add("EnableTapToSelect", MakeBoolValue(true));
    settings->Add("Device", "Gen6System").Add("EnableTapToSelect", MakeBoolValue(true));

    Report("Device", "other:7");
    Report("Device", "qx:");
    Report("Device", "qx:7a");
    Report("System", "Other");
    Report("Device", "Gen6System");
    Report("device", "qx:7");
    Report("System", "qx:7");
    Report("Device", "qx:99"); // reported, but not to be had

    EXPECT_EQ(Subscriptions(), 0U);
}

TEST_F(CameraEvents, DevicesThatWereThereBeforeAreNotSubscribedTo)
{
    EXPECT_EQ(Subscriptions(), 0U);

    Change("Name");

    EXPECT_THAT(heard, IsEmpty());
}

TEST_F(CameraEvents, MissingParameterLeavesTheOthersSubscribed)
{
    settings->Devices[{"Device", "qx:7"}]->Parameters.erase("Threshold");

    Report("Device", "qx:7");

    EXPECT_EQ(Subscriptions(), 5U);
    Change("ShutterDuration");
    EXPECT_EQ(heard.size(), 1U);
}

TEST_F(CameraEvents, SubscriptionDoesNotKeepAParameterAlive)
{
    Report("Device", "qx:7");
    auto& parameter = settings->Devices[{"Device", "qx:7"}]->Parameters["Name"];
    const std::weak_ptr<IParameter> weak = parameter;

    parameter.reset();

    EXPECT_TRUE(weak.expired());
}

TEST_F(CameraEvents, NotificationOfAParameterThatHasGoneIsNoEvent)
{
    // The list of functions outlives its parameter here, as that of a host may.
    struct VSharedListParameter : TestSupport::VFakeParameter
    {
        std::shared_ptr<NotificationSystem::VMultiCallback<void()>> list =
            std::make_shared<NotificationSystem::VMultiCallback<void()>>();
        KVR::IMultiCallback<void()>& GetChangedCallback() override { return *list; }
    };
    auto parameter = std::make_shared<VSharedListParameter>();
    const auto list = parameter->list;
    settings->Devices[{"Device", "qx:7"}]->Parameters = {{"Name", parameter}};
    Report("Device", "qx:7");

    settings->Devices[{"Device", "qx:7"}]->Parameters.clear();
    parameter.reset();
    (void)(*list)();

    EXPECT_THAT(heard, IsEmpty());
}

TEST_F(CameraEvents, NameOfACameraThatCannotBeFetchedHasAnEmptyType)
{
    Report("Device", "qx:7");
    const auto name = settings->Devices[{"Device", "qx:7"}]->Parameters["Name"];
    settings->Devices.clear();

    (void)name->Changed();

    ASSERT_EQ(heard.size(), 1U);
    EXPECT_EQ(heard[0].parameters[2], std::pair(std::wstring(L"CameraType"), std::wstring()));
}

TEST_F(CameraEvents, NameOfACameraWithoutATypeHasAnEmptyType)
{
    Report("Device", "qx:7");
    settings->Devices[{"Device", "qx:7"}]->Parameters.erase("DisplayType");

    Change("Name");

    ASSERT_EQ(heard.size(), 1U);
    EXPECT_EQ(heard[0].parameters[2], std::pair(std::wstring(L"CameraType"), std::wstring()));
}

TEST_F(CameraEvents, PaddedIdIsPrintedAndFetchedWithoutItsZeros)
{
    settings->Devices[{"Device", "qx:007"}] = settings->Devices[{"Device", "qx:7"}];
    Report("Device", "qx:007");

    Change("Name");

    ASSERT_EQ(heard.size(), 1U);
    EXPECT_EQ(heard[0].parameters[0].second, L"7");
    EXPECT_EQ(settings->LookedUp.back(), std::pair(std::string("Device"), std::string("qx:7")));
}

TEST_F(CameraEvents, ShortValuesReadAsZeroAndUnknownModesAsEmptyText)
{
    Report("Device", "qx:7");
    auto& parameters = settings->Devices[{"Device", "qx:7"}]->Parameters;

    parameters["UserId"]->Value.Bytes = {1, 2, 3};
    Change("UserId");
    parameters["UserId"]->Value = MakeUInt32Value(4294967295U);
    Change("UserId");
    parameters["GreyscaleMode"]->Value = MakeEnumValue(GreyscaleModeSchema(), 6);
    Change("GreyscaleMode");
    parameters["GreyscaleMode"]->Value.Bytes = {2};
    Change("GreyscaleMode");
    parameters["StrobeIntensity"]->Value = VDataValue();
    Change("StrobeIntensity");

    ASSERT_EQ(heard.size(), 5U);
    EXPECT_EQ(heard[0].parameters[1].second, L"0");
    EXPECT_EQ(heard[1].parameters[1].second, L"4294967295");
    EXPECT_EQ(heard[2].parameters[1], std::pair(std::wstring(L"GreyscaleMode"), std::wstring()));
    EXPECT_EQ(heard[3].parameters[1].second, L"Auto");
    EXPECT_EQ(heard[4].parameters[2], std::pair(std::wstring(L"SettingValue"), std::wstring()));
}

TEST_F(CameraEvents, ArePublishedOnTheThreadThatDeliversTheChange)
{
    Report("Device", "qx:7");

    std::thread other([this] { Change("Name"); });
    const std::thread::id id = other.get_id();
    other.join();

    ASSERT_EQ(heard.size(), 1U);
    EXPECT_EQ(heard[0].thread, id);
}

TEST_F(CameraEvents, LateNotificationsOfAProviderThatHasGoneDoNothing)
{
    Report("Device", "qx:7");
    selection->View->Selected = {VSelectionEntry("qx:7")};
    settingsEvents.reset();
    selectionEvents.reset();

    Change("Name");
    Report("Device", "qx:7");
    (void)selection->Changed();

    EXPECT_THAT(heard, IsEmpty());
    EXPECT_EQ(selection->Changed.Count(), 0U);
    EXPECT_EQ(settings->DeviceAdded.Count(), 0U);
}

TEST_F(CameraEvents, SelectionIsPublishedAsNumbers)
{
    selection->View->Selected = {VSelectionEntry("qx:2"), VSelectionEntry("group:1"),
                                 VSelectionEntry("qx:1")};

    (void)selection->Changed();

    ASSERT_EQ(heard.size(), 1U);
    EXPECT_EQ(heard[0].name, L"Event.Cameras.SelectionChanged");
    EXPECT_THAT(heard[0].parameters, ElementsAre(std::pair(L"SelectedCameraIds", L"2,1")));
    EXPECT_THAT(selection->SubscribedFilters, ElementsAre(ElementsAre(1)));
    EXPECT_THAT(selection->View->Filters, ElementsAre(ElementsAre(1)));
}

TEST_F(CameraEvents, ClearedSelectionIsNotPublishedDeliberately)
{
    (void)selection->Changed();

    EXPECT_THAT(heard, IsEmpty());
}

TEST_F(CameraEvents, SelectionOfNothingButOtherThingsIsPublishedAsEmptyText)
{
    selection->View->Selected = {VSelectionEntry("group:1")};

    (void)selection->Changed();

    ASSERT_EQ(heard.size(), 1U);
    EXPECT_THAT(heard[0].parameters, ElementsAre(std::pair(L"SelectedCameraIds", L"")));
}

TEST_F(CameraEvents, WithoutDispatcherOrSourcesNothingHappens)
{
    const auto silent = KVR::MakeShared<VEventProviderCameraSettings>(nullptr, settings);
    const auto silentSelection = KVR::MakeShared<VEventProviderCameraSelection>(nullptr, selection);
    const auto sourceless = KVR::MakeShared<VEventProviderCameraSettings>(&dispatcher, nullptr);
    const auto sourcelessSelection =
        KVR::MakeShared<VEventProviderCameraSelection>(&dispatcher, nullptr);
    settingsEvents.reset();
    selectionEvents.reset();
    selection->View->Selected = {VSelectionEntry("qx:2")};

    Report("Device", "qx:7");
    Change("Name");
    (void)selection->Changed();

    EXPECT_THAT(heard, IsEmpty());
}

} // namespace
