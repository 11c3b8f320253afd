#include "CameraCommands.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cmath>
#include <string>

// The commands that read and write a number of a camera.

using testing::ElementsAre;
using testing::IsEmpty;

namespace {

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

} // namespace
