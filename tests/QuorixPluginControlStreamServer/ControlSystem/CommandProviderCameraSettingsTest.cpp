#include "CameraCommands.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

using testing::ElementsAre;
using testing::IsEmpty;

namespace {

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
    ControlSystem::IParameters input;
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
