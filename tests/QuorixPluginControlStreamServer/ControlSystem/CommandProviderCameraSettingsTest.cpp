#include "QuorixPluginControlStreamServer/ControlSystem/CommandProviderCameraSettings.h"

#include "QuorixDataStoreTypes/GreyscaleMode.h"
#include "io/Values.h"
#include "support/FakeCameras.h"
#include "support/LogCapture.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cmath>

using ControlSystem::IParameters;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

using Parameters = std::vector<std::pair<std::wstring, std::wstring>>;

/// A provider on two fake sources: camera 7 with all settings, camera 8 with none, the system
/// device.
class CameraCommands : public testing::Test
{
protected:
    CameraCommands()
    {
        VFakeDevice& camera = settings->Add("Device", "qx:7");
        camera.Add("StrobeIntensity", MakeDoubleValue(0.5));
        camera.Add("Threshold", MakeDoubleValue(0.25));
        camera.Add("ShutterDuration", MakeDoubleValue(0.01));
        camera.Add("GreyscaleMode", MakeEnumValue(GreyscaleModeSchema(), 2));
        settings->Add("Device", "qx:8");
        settings->Add("System", "Gen6System").Add("EnableTapToSelect", MakeBoolValue(false));
    }

    using VFakeDevice = TestSupport::VFakeDevice;
    using VFakeParameter = TestSupport::VFakeParameter;

    std::int32_t Run(const std::wstring& name, const Parameters& input)
    {
        IParameters parameters;
        for (const auto& [parameter, value] : input) {
            parameters.Set(parameter, value);
        }
        reply = IParameters();
        return provider.ExecuteCommand(name, parameters, reply).Code;
    }

    Parameters Reply() const { return {reply.begin(), reply.end()}; }

    VFakeParameter& Camera(const std::string& parameter)
    {
        return *settings->Devices[{"Device", "qx:7"}]->Parameters[parameter];
    }

    VFakeParameter& Tap()
    {
        return *settings->Devices[{"System", "Gen6System"}]->Parameters["EnableTapToSelect"];
    }

    std::vector<std::string> Logged() const { return log.Texts("CommandProviderCameraSettings"); }

    std::shared_ptr<TestSupport::VFakeCameraSettings> settings =
        std::make_shared<TestSupport::VFakeCameraSettings>();
    std::shared_ptr<TestSupport::VFakeCameraSelection> selection =
        std::make_shared<TestSupport::VFakeCameraSelection>();
    VCommandProviderCameraSettings provider{selection, settings};
    TestSupport::VLogLevel level{"CommandProviderCameraSettings", 6};
    TestSupport::VLogCapture log;
    IParameters reply;
};

TEST_F(CameraCommands, AreListedInTheirOrderBehindWhatIsThere)
{
    std::vector<std::wstring> names{L"Before"};

    provider.GetCommandNames(names);

    EXPECT_THAT(
        names,
        ElementsAre(L"Before", L"CameraSettings_EnableStrobes", L"CameraSettings_DisableStrobes",
                    L"CameraSettings_GetStrobeIntensity", L"CameraSettings_SetStrobeIntensity",
                    L"CameraSettings_GetCentroidThreshold", L"CameraSettings_SetCentroidThreshold",
                    L"CameraSettings_GetShutterDuration", L"CameraSettings_SetShutterDuration",
                    L"CameraSettings_GetGreyscaleMode", L"CameraSettings_SetGreyscaleMode",
                    L"CameraSettings_GetSelection", L"CameraSettings_SetSelection",
                    L"CameraSettings_ToggleTap", L"CameraSettings_GetTapEnabled"));
}

// What the information record of a command holds, in its order.
struct VInformationCase
{
    const char* name;
    std::wstring command;
    std::wstring description;
    Parameters input;
    Parameters reply;
};

const Parameters anyCamera = {{L"Param_CameraDeviceId", L"Unique device id for given camera"}};
const std::pair<std::wstring, std::wstring> givenCamera = anyCamera[0];
const std::pair<std::wstring, std::wstring> videoCamera = {
    L"Param_CameraDeviceId", L"Unique device id for given video camera"};
const std::pair<std::wstring, std::wstring> intensity = {
    L"Param_StrobeIntensity", L"Strobe Intensity value, between 0.0 and 1.0"};
const std::pair<std::wstring, std::wstring> centroid = {
    L"Param_CentroidThreshold", L"Centroid fitting threshold, between 0.0 and 1.0"};
const std::pair<std::wstring, std::wstring> shutter = {
    L"Param_ShutterDuration", L"Video shutter duration, between 0.01 and 1.0"};
const std::pair<std::wstring, std::wstring> selected = {
    L"Param_CameraSelection", L"Comma separated list of device IDs for selected cameras"};
const std::pair<std::wstring, std::wstring> tapEnabled = {
    L"Param_TapEnabled", L"Whether the setting is enabled or disabled, 1 for on"};

// clang-format off
const VInformationCase informationCases[] = {
    {"DisableStrobes", L"CameraSettings_DisableStrobes", L"Turns off strobes for all cameras and disables the param in the GUI", {}, {}},
    {"EnableStrobes", L"CameraSettings_EnableStrobes", L"Restore previous strobe settings for all cameras to what it was prior to being disabled and enables GUI param again", {}, {}},
    {"GetStrobeIntensity", L"CameraSettings_GetStrobeIntensity", L"Returns current strobe intensity", {givenCamera}, {intensity}},
    {"SetStrobeIntensity", L"CameraSettings_SetStrobeIntensity", L"Sets current strobe intensity", {givenCamera, intensity}, {}},
    {"GetCentroidThreshold", L"CameraSettings_GetCentroidThreshold", L"Returns current centroid fitting threshold for the given camera", {givenCamera}, {centroid}},
    {"SetCentroidThreshold", L"CameraSettings_SetCentroidThreshold", L"Sets centroid fitting threshold for the given camera", {givenCamera, centroid}, {}},
    {"GetShutterDuration", L"CameraSettings_GetShutterDuration", L"Returns current shutter duration for the given video camera", {videoCamera}, {shutter}},
    {"SetShutterDuration", L"CameraSettings_SetShutterDuration", L"Sets shutter duration for the given video camera", {videoCamera, shutter}, {}},
    {"GetGreyscaleMode", L"CameraSettings_GetGreyscaleMode", L"Returns greyscale mode as a string. One of 'Auto', 'None', 'All', 'Only', 'Edges', 'No Edges'", {givenCamera}, {{L"Param_GreyscaleMode", L"Current greyscale mode (string)"}}},
    {"SetGreyscaleMode", L"CameraSettings_SetGreyscaleMode", L"Set greyscale mode from one of 'Auto', 'None', 'All', 'Only', 'Edges', 'No Edges'", {givenCamera, {L"Param_GreyscaleMode", L"Requested greyscale mode (string)"}}, {}},
    {"GetSelection", L"CameraSettings_GetSelection", L"Returns device ids of selected cameras", {}, {selected}},
    {"SetSelection", L"CameraSettings_SetSelection", L"Set selected cameras", {selected}, {}},
    {"ToggleTap", L"CameraSettings_ToggleTap", L"Toggle Tap-To-Select (Disabled/Enabled) for all cameras", {tapEnabled}, {}},
    {"GetTapEnabled", L"CameraSettings_GetTapEnabled", L"Returns the current global Tap-To-Select setting", {}, {tapEnabled}},
    {"UnknownNameIsCopiedDeliberately", L"CameraSettings_Fly", L"Command not found.", {}, {}},
    {"NamesAreCaseSensitive", L"camerasettings_toggletap", L"Command not found.", {}, {}},
};
// clang-format on

class CameraCommandInformation : public testing::TestWithParam<VInformationCase>
{
protected:
    static Parameters Pairs(const std::vector<ControlSystem::IParameterInformation>& information)
    {
        Parameters pairs;
        for (const auto& parameter : information) {
            pairs.emplace_back(parameter.Name, parameter.Description);
        }
        return pairs;
    }
};

TEST_P(CameraCommandInformation, DescribesTheCommand)
{
    VCommandProviderCameraSettings provider(nullptr, nullptr);

    const auto information = provider.GetCommandInformation(GetParam().command);

    EXPECT_EQ(information.Name, GetParam().command);
    EXPECT_EQ(information.Description, GetParam().description);
    EXPECT_EQ(Pairs(information.InputParameters), GetParam().input);
    EXPECT_EQ(Pairs(information.ReplyParameters), GetParam().reply);
}

INSTANTIATE_TEST_SUITE_P(All, CameraCommandInformation, testing::ValuesIn(informationCases),
                         [](const auto& test) { return std::string(test.param.name); });

TEST_F(CameraCommands, UnknownNameFailsWith2AndChangesNothing)
{
    EXPECT_EQ(Run(L"CameraSettings_ToggleTap2", {{L"Param_TapEnabled", L"1"}}), 2);
    EXPECT_EQ(Run(L"cameraSettings_ToggleTap", {{L"Param_TapEnabled", L"1"}}), 2);
    EXPECT_EQ(Run(L"CameraSettings_Toggle", {{L"Param_TapEnabled", L"1"}}), 2);
    EXPECT_EQ(Run(L"", {}), 2);

    EXPECT_THAT(Reply(), IsEmpty());
    EXPECT_THAT(settings->LookedUp, IsEmpty());
}

TEST_F(CameraCommands, StrobeSwitchesDoNothingDeliberately)
{
    EXPECT_EQ(Run(L"CameraSettings_DisableStrobes", {}), 1);
    EXPECT_EQ(Run(L"CameraSettings_EnableStrobes", {}), 1);

    EXPECT_THAT(Reply(), IsEmpty());
    EXPECT_THAT(settings->LookedUp, IsEmpty());
    EXPECT_EQ(Camera("StrobeIntensity").Value, MakeDoubleValue(0.5));
}

// The number commands differ in their names and messages alone.
struct VNumberCase
{
    const char* name;
    std::wstring getter;
    std::wstring setter;
    std::string parameter;
    std::wstring wireParameter;
    std::wstring stored;
    std::string missingOnRead;
    std::string missingOnWrite;
    std::string unreadable;
};

// clang-format off
const VNumberCase numberCases[] = {
    {"Strobe", L"CameraSettings_GetStrobeIntensity", L"CameraSettings_SetStrobeIntensity", "StrobeIntensity", L"Param_StrobeIntensity", L"0.5",
     "Camera does not support strobe intensity.", "Camera does not support strobe intensity.", "Invalid intensity value."},
    {"ThresholdIsCalledAnIntensityDeliberately", L"CameraSettings_GetCentroidThreshold", L"CameraSettings_SetCentroidThreshold", "Threshold", L"Param_CentroidThreshold", L"0.25",
     "Camera does not support threshold.", "Camera does not support threshold.", "Invalid intensity value."},
    {"ShutterHasLostItsVerbOnReadingDeliberately", L"CameraSettings_GetShutterDuration", L"CameraSettings_SetShutterDuration", "ShutterDuration", L"Param_ShutterDuration", L"0.01",
     "Camera does not shutter duration.", "Camera does not support shutter duration.", "Invalid shutter duration."},
};
// clang-format on

class CameraNumbers : public CameraCommands, public testing::WithParamInterface<VNumberCase>
{
};

TEST_P(CameraNumbers, AreReadAsText)
{
    EXPECT_EQ(Run(GetParam().getter, {{L"Param_CameraDeviceId", L"7"}}), 1);

    EXPECT_THAT(Reply(), ElementsAre(std::pair(GetParam().wireParameter, GetParam().stored)));
    EXPECT_THAT(Logged(), IsEmpty());
}

TEST_P(CameraNumbers, AreWrittenAsDouble)
{
    const Parameters input = {{L"Param_CameraDeviceId", L"7"}, {GetParam().wireParameter, L"0.75"}};

    EXPECT_EQ(Run(GetParam().setter, input), 1);

    EXPECT_THAT(Camera(GetParam().parameter).Written, ElementsAre(MakeDoubleValue(0.75)));
    EXPECT_THAT(Reply(), IsEmpty());
}

TEST_P(CameraNumbers, AreFoundThroughTheFirstLookUp)
{
    const Parameters input = {{L"Param_CameraDeviceId", L"7"}, {GetParam().wireParameter, L"0.75"}};

    Run(GetParam().getter, input);
    Run(GetParam().setter, input);

    const VFakeDevice& camera = *settings->Devices[{"Device", "qx:7"}];
    EXPECT_THAT(camera.Got, ElementsAre(GetParam().parameter, GetParam().parameter));
    EXPECT_THAT(camera.Found, IsEmpty());
}

TEST_P(CameraNumbers, AreNotTestedForTheirRange)
{
    const Parameters input = {{L"Param_CameraDeviceId", L"7"}, {GetParam().wireParameter, L"5.0"}};

    EXPECT_EQ(Run(GetParam().setter, input), 1);

    EXPECT_THAT(Camera(GetParam().parameter).Written, ElementsAre(MakeDoubleValue(5.0)));
}

TEST_P(CameraNumbers, WriteThatTheHostRefusesGives15)
{
    Camera(GetParam().parameter).Takes = false;
    const Parameters input = {{L"Param_CameraDeviceId", L"7"}, {GetParam().wireParameter, L"0.75"}};

    EXPECT_EQ(Run(GetParam().setter, input), 15);
}

TEST_P(CameraNumbers, TextThatIsNoNumberIsWrittenAsZeroAndNeverGives5)
{
    const Parameters input = {{L"Param_CameraDeviceId", L"7"}, {GetParam().wireParameter, L"bad"}};

    EXPECT_EQ(Run(GetParam().setter, input), 1);
    Camera(GetParam().parameter).Takes = false;
    EXPECT_EQ(Run(GetParam().setter, input), 15);

    EXPECT_THAT(Camera(GetParam().parameter).Written,
                ElementsAre(MakeDoubleValue(0.0), MakeDoubleValue(0.0)));
    EXPECT_THAT(Logged(), ElementsAre(GetParam().unreadable, GetParam().unreadable));
}

TEST_P(CameraNumbers, AbsentValueIsNoNumber)
{
    EXPECT_EQ(Run(GetParam().setter, {{L"Param_CameraDeviceId", L"7"}}), 1);

    EXPECT_THAT(Camera(GetParam().parameter).Written, ElementsAre(MakeDoubleValue(0.0)));
    EXPECT_THAT(Logged(), ElementsAre(GetParam().unreadable));
}

TEST_P(CameraNumbers, CameraWithoutTheSettingGives4)
{
    EXPECT_EQ(Run(GetParam().getter, {{L"Param_CameraDeviceId", L"8"}}), 4);
    EXPECT_THAT(Reply(), IsEmpty());
    EXPECT_EQ(Run(GetParam().setter,
                  {{L"Param_CameraDeviceId", L"8"}, {GetParam().wireParameter, L"0.5"}}),
              4);

    EXPECT_THAT(Logged(), ElementsAre(GetParam().missingOnRead, GetParam().missingOnWrite));
}

TEST_P(CameraNumbers, BadNumberForACameraWithoutTheSettingGives4AfterBothMessages)
{
    EXPECT_EQ(Run(GetParam().setter,
                  {{L"Param_CameraDeviceId", L"8"}, {GetParam().wireParameter, L"bad"}}),
              4);

    EXPECT_THAT(Logged(), ElementsAre(GetParam().unreadable, GetParam().missingOnWrite));
}

TEST_P(CameraNumbers, CameraIdThatIsNoNumberGives10BeforeAnyLookUp)
{
    for (const wchar_t* id : {L"", L"x", L"7x", L" 7", L"-1", L"4294967296", L"qx:7", L"0x7"}) {
        EXPECT_EQ(Run(GetParam().getter, {{L"Param_CameraDeviceId", id}}), 10);
        EXPECT_EQ(Run(GetParam().setter,
                      {{L"Param_CameraDeviceId", id}, {GetParam().wireParameter, L"1"}}),
                  10);
    }

    EXPECT_THAT(settings->LookedUp, IsEmpty());
    EXPECT_EQ(Logged(), std::vector<std::string>(16, "Invalid camera ID."));
}

TEST_P(CameraNumbers, UnknownCameraGives10)
{
    EXPECT_EQ(Run(GetParam().getter, {{L"Param_CameraDeviceId", L"9"}}), 10);
    EXPECT_EQ(Run(GetParam().setter, {{L"Param_CameraDeviceId", L"4294967295"}}), 10);

    EXPECT_THAT(Logged(),
                ElementsAre("Camera not found: qx:9.", "Camera not found: qx:4294967295."));
    EXPECT_THAT(settings->LookedUp,
                ElementsAre(std::pair("Device", "qx:9"), std::pair("Device", "qx:4294967295")));
}

TEST_P(CameraNumbers, ValueWithoutTextIsReadAsEmptyText)
{
    Camera(GetParam().parameter).Value.Bytes.pop_back();
    EXPECT_EQ(Run(GetParam().getter, {{L"Param_CameraDeviceId", L"7"}}), 1);
    EXPECT_THAT(Reply(), ElementsAre(std::pair(GetParam().wireParameter, L"")));

    Camera(GetParam().parameter).Value = VDataValue();
    EXPECT_EQ(Run(GetParam().getter, {{L"Param_CameraDeviceId", L"7"}}), 1);
    EXPECT_THAT(Reply(), ElementsAre(std::pair(GetParam().wireParameter, L"")));
}

INSTANTIATE_TEST_SUITE_P(All, CameraNumbers, testing::ValuesIn(numberCases),
                         [](const auto& test) { return std::string(test.param.name); });

TEST_F(CameraCommands, NumbersMayBearOnePlusAndInfinities)
{
    const auto set = [this](const std::wstring& text) {
        return Run(L"CameraSettings_SetStrobeIntensity",
                   {{L"Param_CameraDeviceId", L"+7"}, {L"Param_StrobeIntensity", text}});
    };

    EXPECT_EQ(set(L"+0.5"), 1);
    EXPECT_EQ(set(L"inf"), 1);
    EXPECT_EQ(set(L"nan"), 1);

    const auto& written = Camera("StrobeIntensity").Written;
    EXPECT_EQ(written[0], MakeDoubleValue(0.5));
    EXPECT_EQ(written[1], MakeDoubleValue(HUGE_VAL));
    double number = 0;
    EXPECT_TRUE(ReadValue(written[2], number));
    EXPECT_TRUE(std::isnan(number));
    EXPECT_THAT(Logged(), IsEmpty());
}

TEST_F(CameraCommands, MessagesAreOfLevel6)
{
    Run(L"CameraSettings_GetStrobeIntensity", {});
    ASSERT_EQ(log.Messages().size(), 1U);
    EXPECT_EQ(log.Messages()[0].Level, 6);

    DebugServices::SetLogLevel("CommandProviderCameraSettings", 5);
    Run(L"CameraSettings_GetStrobeIntensity", {});
    EXPECT_EQ(log.Messages().size(), 1U);
}

// clang-format off
struct VModeCase { const char* name; std::int32_t number; std::wstring text; };
const VModeCase modeCases[] = {
    {"Auto", 0, L"Auto"}, {"None", 1, L"None"}, {"All", 2, L"All"},
    {"Only", 3, L"Only"}, {"Edges", 4, L"Edges"}, {"NoEdges", 5, L"No Edges"},
};
// clang-format on

class GreyscaleModes : public CameraCommands, public testing::WithParamInterface<VModeCase>
{
};

TEST_P(GreyscaleModes, ValidModeIsReadWithCode10Deliberately)
{
    Camera("GreyscaleMode").Value = MakeEnumValue(GreyscaleModeSchema(), GetParam().number);

    EXPECT_EQ(Run(L"CameraSettings_GetGreyscaleMode", {{L"Param_CameraDeviceId", L"7"}}), 10);

    EXPECT_THAT(Reply(), ElementsAre(std::pair(L"Param_GreyscaleMode", GetParam().text)));
    EXPECT_THAT(Logged(), IsEmpty());
}

TEST_P(GreyscaleModes, AreWrittenByTheirText)
{
    EXPECT_EQ(Run(L"CameraSettings_SetGreyscaleMode",
                  {{L"Param_CameraDeviceId", L"7"}, {L"Param_GreyscaleMode", GetParam().text}}),
              1);

    EXPECT_THAT(Camera("GreyscaleMode").Written,
                ElementsAre(MakeEnumValue(GreyscaleModeSchema(), GetParam().number)));
}

INSTANTIATE_TEST_SUITE_P(All, GreyscaleModes, testing::ValuesIn(modeCases),
                         [](const auto& test) { return std::string(test.param.name); });

TEST_F(CameraCommands, GreyscaleOutsideTheEnumerationGives46AndEmptyText)
{
    for (const std::int32_t stored : {6, -1}) {
        Camera("GreyscaleMode").Value = MakeEnumValue(GreyscaleModeSchema(), stored);
        EXPECT_EQ(Run(L"CameraSettings_GetGreyscaleMode", {{L"Param_CameraDeviceId", L"7"}}), 46);
        EXPECT_THAT(Reply(), ElementsAre(std::pair(L"Param_GreyscaleMode", L"")));
    }
}

TEST_F(CameraCommands, GreyscaleWithFewerThanFourBytesReadsAsAuto)
{
    Camera("GreyscaleMode").Value.Bytes = {5, 0, 0};

    EXPECT_EQ(Run(L"CameraSettings_GetGreyscaleMode", {{L"Param_CameraDeviceId", L"7"}}), 10);

    EXPECT_THAT(Reply(), ElementsAre(std::pair(L"Param_GreyscaleMode", L"Auto")));
}

TEST_F(CameraCommands, UnknownGreyscaleTextSetsNoneDeliberately)
{
    for (const wchar_t* text : {L"no edges", L"NoEdges", L"auto", L"", L"Edges ", L"2"}) {
        EXPECT_EQ(Run(L"CameraSettings_SetGreyscaleMode",
                      {{L"Param_CameraDeviceId", L"7"}, {L"Param_GreyscaleMode", text}}),
                  1);
        EXPECT_EQ(Camera("GreyscaleMode").Value, MakeEnumValue(GreyscaleModeSchema(), 1));
    }
    EXPECT_THAT(Logged(), IsEmpty());
}

TEST_F(CameraCommands, GreyscaleSharesTheFailuresOfTheNumbers)
{
    const std::wstring commands[] = {L"CameraSettings_GetGreyscaleMode",
                                     L"CameraSettings_SetGreyscaleMode"};
    for (const std::wstring& command : commands) {
        EXPECT_EQ(Run(command, {}), 10);
        EXPECT_EQ(Run(command, {{L"Param_CameraDeviceId", L"9"}}), 10);
        EXPECT_EQ(Run(command, {{L"Param_CameraDeviceId", L"8"}}), 4);
    }
    Camera("GreyscaleMode").Takes = false;
    EXPECT_EQ(Run(L"CameraSettings_SetGreyscaleMode", {{L"Param_CameraDeviceId", L"7"}}), 15);

    EXPECT_THAT(Logged(),
                ElementsAre("Invalid camera ID.", "Camera not found: qx:9.",
                            "Camera does not support greyscale mode.", "Invalid camera ID.",
                            "Camera not found: qx:9.", "Camera does not support greyscale mode."));
}

TEST_F(CameraCommands, SelectionIsReadAsNumbersWithoutWhatIsNoCamera)
{
    selection->View->Selected = {VSelectionEntry("qx:3"),   VSelectionEntry(),
                                 VSelectionEntry("qx:007"), VSelectionEntry("other:1"),
                                 VSelectionEntry("qx:"),    VSelectionEntry("qx:+1"),
                                 VSelectionEntry("qx:1x"),  VSelectionEntry("qx:4294967295")};

    EXPECT_EQ(Run(L"CameraSettings_GetSelection", {}), 1);

    EXPECT_THAT(Reply(), ElementsAre(std::pair(L"Param_CameraSelection", L"3,7,4294967295")));
    EXPECT_THAT(selection->View->Filters, ElementsAre(ElementsAre(1)));
}

TEST_F(CameraCommands, EmptySelectionIsReadAsEmptyText)
{
    EXPECT_EQ(Run(L"CameraSettings_GetSelection", {}), 1);

    EXPECT_THAT(Reply(), ElementsAre(std::pair(L"Param_CameraSelection", L"")));
}

TEST_F(CameraCommands, SelectionIsReplacedByTheTokensThatAreNumbers)
{
    selection->View->Selected = {VSelectionEntry("qx:9")};

    EXPECT_EQ(Run(L"CameraSettings_SetSelection", {{L"Param_CameraSelection", L"1,2,word,3"}}), 1);

    EXPECT_THAT(selection->SelectedIds(), ElementsAre("qx:1", "qx:2", "qx:3"));
    EXPECT_THAT(selection->View->Filters, ElementsAre(ElementsAre(1)));
    EXPECT_THAT(Logged(), IsEmpty());
}

TEST_F(CameraCommands, SelectionTokensAreTrimmedQuotedAndTakenWhole)
{
    const std::wstring text = L" 2 ,\t\"3\"\r\n,1 2,-1,4294967296,,007,\"4,5\",2";

    EXPECT_EQ(Run(L"CameraSettings_SetSelection", {{L"Param_CameraSelection", text}}), 1);

    EXPECT_THAT(selection->SelectedIds(), ElementsAre("qx:2", "qx:3", "qx:7", "qx:2"));
}

TEST_F(CameraCommands, EmptySelectionClears)
{
    selection->View->Selected = {VSelectionEntry("qx:9")};

    EXPECT_EQ(Run(L"CameraSettings_SetSelection", {}), 1);

    EXPECT_THAT(selection->SelectedIds(), IsEmpty());
    EXPECT_EQ(selection->View->Replaced, 1);
}

TEST_F(CameraCommands, ToggleTapSetsWhatItIsGivenDeliberately)
{
    for (int i = 0; i < 2; ++i) {
        EXPECT_EQ(Run(L"CameraSettings_ToggleTap", {{L"Param_TapEnabled", L"1"}}), 1);
        EXPECT_EQ(Tap().Value, MakeBoolValue(true));
    }

    for (const wchar_t* off : {L"0", L"true", L"01", L" 1", L""}) {
        Tap().Value = MakeBoolValue(true);
        EXPECT_EQ(Run(L"CameraSettings_ToggleTap", {{L"Param_TapEnabled", off}}), 1);
        EXPECT_EQ(Tap().Value, MakeBoolValue(false));
    }
    Tap().Value = MakeBoolValue(true);
    EXPECT_EQ(Run(L"CameraSettings_ToggleTap", {}), 1);
    EXPECT_EQ(Tap().Value, MakeBoolValue(false));
    EXPECT_THAT(Reply(), IsEmpty());
}

TEST_F(CameraCommands, TapAnswers1WhateverBecomesOfIt)
{
    Tap().Takes = false;
    EXPECT_EQ(Run(L"CameraSettings_ToggleTap", {{L"Param_TapEnabled", L"1"}}), 1);
    settings->Devices[{"System", "Gen6System"}]->Parameters.clear();
    EXPECT_EQ(Run(L"CameraSettings_ToggleTap", {{L"Param_TapEnabled", L"1"}}), 1);
    EXPECT_EQ(Run(L"CameraSettings_GetTapEnabled", {}), 1);
    EXPECT_THAT(Reply(), IsEmpty());
    settings->Devices.clear();
    EXPECT_EQ(Run(L"CameraSettings_ToggleTap", {{L"Param_TapEnabled", L"1"}}), 1);
    EXPECT_EQ(Run(L"CameraSettings_GetTapEnabled", {}), 1);
    EXPECT_THAT(Reply(), IsEmpty());
}

TEST_F(CameraCommands, TapIsSetThroughTheFirstLookUp)
{
    Run(L"CameraSettings_ToggleTap", {{L"Param_TapEnabled", L"1"}});

    const VFakeDevice& system = *settings->Devices[{"System", "Gen6System"}];
    EXPECT_THAT(system.Got, ElementsAre("EnableTapToSelect"));
    EXPECT_THAT(system.Found, IsEmpty());
}

TEST_F(CameraCommands, TapIsReadThroughTheSecondLookUp)
{
    EXPECT_EQ(Run(L"CameraSettings_GetTapEnabled", {}), 1);
    EXPECT_THAT(Reply(), ElementsAre(std::pair(L"Param_TapEnabled", L"0")));
    Tap().Value = MakeBoolValue(true);
    EXPECT_EQ(Run(L"CameraSettings_GetTapEnabled", {}), 1);
    EXPECT_THAT(Reply(), ElementsAre(std::pair(L"Param_TapEnabled", L"1")));

    const VFakeDevice& system = *settings->Devices[{"System", "Gen6System"}];
    EXPECT_THAT(system.Found, ElementsAre("EnableTapToSelect", "EnableTapToSelect"));
    EXPECT_THAT(system.Got, IsEmpty());
}

TEST_F(CameraCommands, HostWithoutSourcesIsAHostWithoutCameras)
{
    VCommandProviderCameraSettings withoutSources(nullptr, nullptr);
    IParameters input;
    input.Set(L"Param_CameraDeviceId", L"7");
    const auto run = [&](const std::wstring& name) {
        return withoutSources.ExecuteCommand(name, input, reply).Code;
    };

    EXPECT_EQ(run(L"CameraSettings_GetStrobeIntensity"), 10);
    EXPECT_EQ(run(L"CameraSettings_SetSelection"), 1);
    EXPECT_EQ(run(L"CameraSettings_ToggleTap"), 1);
    EXPECT_EQ(run(L"CameraSettings_GetTapEnabled"), 1);
    EXPECT_EQ(run(L"CameraSettings_GetSelection"), 1);
    EXPECT_THAT(Reply(), ElementsAre(std::pair(L"Param_CameraSelection", L"")));
}

} // namespace
