#include "QuorixDataStoreTypes/DeviceSchemas.h"

#include "support/LogCapture.h"

#include <gtest/gtest.h>

#include <atomic>
#include <regex>
#include <string>
#include <thread>
#include <vector>

namespace {

const VDataPath device{"Camera", "X"};

TEST(DeviceSchemas, ClassRoots)
{
    EXPECT_EQ("ApplicationSettings", DeviceSchemas::ApplicationSettingsRoot().Text());
    EXPECT_EQ("Device", DeviceSchemas::DeviceRoot().Text());
    EXPECT_EQ("Subject", DeviceSchemas::SubjectRoot().Text());
    EXPECT_EQ("System", DeviceSchemas::SystemRoot().Text());
    EXPECT_EQ("Gen6System", DeviceSchemas::Gen6SystemRoot().Text());
    EXPECT_EQ("PavoSystem", DeviceSchemas::PavoSystemRoot().Text());
    EXPECT_EQ("VideoInput", DeviceSchemas::VideoInputRoot().Text());
    EXPECT_EQ("Host", DeviceSchemas::HostRoot().Text());
    EXPECT_EQ("Camera", DeviceSchemas::CameraRoot().Text());
    EXPECT_EQ("IMUHub", DeviceSchemas::IMUHubRoot().Text());
    EXPECT_EQ(&DeviceSchemas::HostRoot(), &DeviceSchemas::HostRoot()) << "built once and kept";
}

TEST(DeviceSchemas, DevicesOfEachClass)
{
    EXPECT_EQ("ApplicationSettings.X", DeviceSchemas::ApplicationSettingsDevice("X").Text());
    EXPECT_EQ("Device.X", DeviceSchemas::DeviceDevice("X").Text());
    EXPECT_EQ("Subject.X", DeviceSchemas::SubjectDevice("X").Text());
    EXPECT_EQ("System.X", DeviceSchemas::SystemDevice("X").Text());
    EXPECT_EQ("Gen6System.X", DeviceSchemas::Gen6SystemDevice("X").Text());
    EXPECT_EQ("PavoSystem.X", DeviceSchemas::PavoSystemDevice("X").Text());
    EXPECT_EQ("VideoInput.X", DeviceSchemas::VideoInputDevice("X").Text());
    EXPECT_EQ("Host.X", DeviceSchemas::HostDevice("X").Text());
    EXPECT_EQ("Camera.X", DeviceSchemas::CameraDevice("X").Text());
    EXPECT_EQ("IMUHub.X", DeviceSchemas::IMUHubDevice("X").Text());
}

TEST(DeviceSchemas, Sections)
{
    EXPECT_EQ("Camera.X.General", DeviceSchemas::GeneralSection(device).Text());
    EXPECT_EQ("Camera.X.Firmware", DeviceSchemas::FirmwareSection(device).Text());
    EXPECT_EQ("Camera.X.Hardware", DeviceSchemas::HardwareSection(device).Text());
    EXPECT_EQ("Camera.X.Timecode", DeviceSchemas::TimecodeSection(device).Text());
    EXPECT_EQ("Camera.X.Network", DeviceSchemas::NetworkSection(device).Text());
    EXPECT_EQ("Camera.X.Settings", DeviceSchemas::SettingsSection(device).Text());
    EXPECT_EQ("Camera.X.Warnings", DeviceSchemas::WarningsSection(device).Text());
    EXPECT_EQ("Camera.X.Calibration", DeviceSchemas::CalibrationSection(device).Text());
    EXPECT_EQ("Camera.X.MaskGrid", DeviceSchemas::MaskGridSection(device).Text());
    EXPECT_EQ("Camera.X.Progress", DeviceSchemas::ProgressSection(device).Text());
    EXPECT_EQ("Camera.X.Internal", DeviceSchemas::InternalSection(device).Text());
    EXPECT_EQ("Camera.X.PhysicalStatus", DeviceSchemas::PhysicalStatusSection(device).Text());
    EXPECT_EQ("Camera.X.PhysicalSensorData",
              DeviceSchemas::PhysicalSensorDataSection(device).Text());
    EXPECT_EQ("Camera.X.CalibrationDetails",
              DeviceSchemas::CalibrationDetailsSection(device).Text());
    EXPECT_EQ("Camera.X.Sensor", DeviceSchemas::SensorSection(device).Text());
}

TEST(DeviceSchemas, GenlockSectionHasBlanksInOneComponent)
{
    const VDataPath section = DeviceSchemas::GenlockAndTimecodeSection(device);

    EXPECT_EQ("Camera.X.Genlock and Timecode", section.Text());
    EXPECT_EQ(3u, section.Count());
    EXPECT_EQ("Genlock and Timecode", section.Last());
}

TEST(DeviceSchemas, AnalogueCardsAreNumberedWithoutASeparator)
{
    EXPECT_EQ("Camera.X.AnalogueCard3", DeviceSchemas::AnalogueCardSection(device, 3).Text());
    EXPECT_EQ("Camera.X.AnalogueCard0", DeviceSchemas::AnalogueCardSection(device, 0).Text());
    EXPECT_EQ("Camera.X.AnalogueCard4294967295",
              DeviceSchemas::AnalogueCardSection(device, 4294967295u).Text());
}

struct VValueCase
{
    VDataPath (*path)(const VDataPath&);
    VDataToken (*token)(const VDataPath&);
    const std::string& (*leaf)();
    const char* text;
};

TEST(DeviceSchemas, Values)
{
    using namespace DeviceSchemas;
    // clang-format off
    const VValueCase valueCases[] = {
        {CaptureDirectoryPath, CaptureDirectoryToken, CaptureDirectoryLeaf, "Settings.CaptureDirectory"},
        {ConnectedPath, ConnectedToken, ConnectedLeaf, "Settings.Connected"},
        {ConnectionCountPath, ConnectionCountToken, ConnectionCountLeaf, "Settings.ConnectionCount"},
        {DisplayTypePath, DisplayTypeToken, DisplayTypeLeaf, "Hardware.DisplayType"},
        {EnabledPath, EnabledToken, EnabledLeaf, "Settings.Enabled"},
        {NamePath, NameToken, NameLeaf, "Settings.Name"},
        {ProcessInRealtimePath, ProcessInRealtimeToken, ProcessInRealtimeLeaf, "Settings.ProcessInRealtime"},
        {TypePath, TypeToken, TypeLeaf, "Hardware.Type"},
        {UserIdPath, UserIdToken, UserIdLeaf, "Settings.UserId"},
        {VideoContainerPath, VideoContainerToken, VideoContainerLeaf, "Settings.VideoContainer"},
        {VideoPayloadPath, VideoPayloadToken, VideoPayloadLeaf, "Settings.VideoPayload"},
        {AudioPayloadPath, AudioPayloadToken, AudioPayloadLeaf, "Settings.AudioPayload"},
        {MasterPath, MasterToken, MasterLeaf, "Settings.Master"},
        {ContributingTimecodePath, ContributingTimecodeToken, ContributingTimecodeLeaf, "Settings.ContributingTimecode"},
        {ContributingAnaloguePath, ContributingAnalogueToken, ContributingAnalogueLeaf, "Settings.ContributingAnalogue"},
        {ContributingCentroidsPath, ContributingCentroidsToken, ContributingCentroidsLeaf, "Settings.ContributingCentroids"},
        {ContributingGreyscalePath, ContributingGreyscaleToken, ContributingGreyscaleLeaf, "Settings.ContributingGreyscale"},
        {ContributingVideoPath, ContributingVideoToken, ContributingVideoLeaf, "Settings.ContributingVideo"},
        {ContributionsPath, ContributionsToken, ContributionsLeaf, "Settings.Contributions"},
        {VideoModeEnabledPath, VideoModeEnabledToken, VideoModeEnabledLeaf, "Settings.VideoModeEnabled"},
        {TimeOffsetTicksPath, TimeOffsetTicksToken, TimeOffsetTicksLeaf, "Settings.TimeOffsetTicks"},
        {UseTimecodeForSyncPath, UseTimecodeForSyncToken, UseTimecodeForSyncLeaf, "Settings.UseTimecodeForSync"},
    };
    // clang-format on
    for (const VValueCase& value : valueCases) {
        const std::string text = value.text;
        EXPECT_EQ("Camera.X." + text, value.path(device).Text());
        EXPECT_EQ(4u, value.path(device).Count());
        EXPECT_EQ(value.path(device), value.token(device).GetPath());
        EXPECT_EQ(text.substr(text.find('.') + 1), value.leaf());
        EXPECT_EQ(&value.leaf(), &value.leaf());
    }
}

TEST(DeviceSchemas, TimeOffsetFramesUnderTimecodeIsKept)
{
    EXPECT_EQ("Camera.X.Timecode.TimeOffsetFrames",
              DeviceSchemas::TimeOffsetFramesPath(device).Text());
    EXPECT_EQ(DeviceSchemas::TimeOffsetFramesPath(device),
              DeviceSchemas::TimeOffsetFramesToken(device).GetPath());
}

TEST(DeviceSchemas, IdentifierWithADotStaysOneComponent)
{
    const VDataPath path = DeviceSchemas::CameraDevice("10.0.0.7");

    EXPECT_EQ(2u, path.Count());
    EXPECT_EQ("10.0.0.7", path.Last());
    EXPECT_EQ("Camera.10.0.0.7", path.Text());
}

/// The log's clock, which moves when told. It only ever goes on, as the lines are spaced for the
/// whole process.
class DeviceSchemasLog : public testing::Test
{
protected:
    DeviceSchemasLog()
    {
        DeviceSchemas::SetLogClock([] { return now.load(); });
        Advance(30);
    }
    ~DeviceSchemasLog() override { DeviceSchemas::SetLogClock(nullptr); }

    static void Advance(std::int64_t seconds) { now += seconds * 1000000000; }

    /// Makes bad calls and returns the count that the one line of them tells.
    static std::uint64_t CountTold(int calls)
    {
        const TestSupport::VLogCapture log;
        for (int call = 0; call < calls; ++call) {
            DeviceSchemas::MakeDevicePath(VDataPath(), "");
        }
        EXPECT_EQ(1u, log.Messages().size());
        std::smatch parts;
        const std::string text = log.Messages().empty() ? "" : log.Messages()[0].Text;
        const std::regex line("Failed to create device schema: \\[\\] \\[\\] "
                              "\\(total log count = (\\d+)\\)");
        EXPECT_TRUE(std::regex_match(text, parts, line)) << text;
        return parts.empty() ? 0 : std::stoull(parts[1]);
    }

    static std::atomic<std::int64_t> now;
};

std::atomic<std::int64_t> DeviceSchemasLog::now{1};

TEST_F(DeviceSchemasLog, EmptyInputsGiveTheFallbackWordsAndOneLine)
{
    const TestSupport::VLogCapture log;

    EXPECT_EQ("InvalidDeviceClass.qx:000000",
              DeviceSchemas::MakeDevicePath(VDataPath(), "").Text());

    ASSERT_EQ(1u, log.Messages().size());
    EXPECT_EQ("DataStore", log.Messages()[0].Category);
    EXPECT_EQ(2, log.Messages()[0].Level);
}

TEST_F(DeviceSchemasLog, LineShowsTheInputsAsTheyWere)
{
    {
        const TestSupport::VLogCapture log;
        EXPECT_EQ("InvalidDeviceClass.X", DeviceSchemas::MakeDevicePath(VDataPath(), "X").Text());
        ASSERT_EQ(1u, log.Messages().size());
        EXPECT_EQ(0u, log.Messages()[0].Text.find("Failed to create device schema: [] [X] ("));
    }
    Advance(30);
    const TestSupport::VLogCapture log;
    EXPECT_EQ("Camera.qx:000000", DeviceSchemas::CameraDevice("").Text());
    ASSERT_EQ(1u, log.Messages().size());
    EXPECT_EQ(0u, log.Messages()[0].Text.find("Failed to create device schema: [Camera] [] ("));
}

TEST_F(DeviceSchemasLog, GoodInputsAreSilent)
{
    const TestSupport::VLogCapture log;

    DeviceSchemas::MakeDevicePath(VDataPath("Camera"), "X");

    EXPECT_TRUE(log.Messages().empty());
}

TEST_F(DeviceSchemasLog, ManyBadCallsGiveOneLineAndLaterTheRunningTotal)
{
    const std::uint64_t first = CountTold(100);
    Advance(29);
    {
        const TestSupport::VLogCapture log;
        DeviceSchemas::MakeDevicePath(VDataPath(), "");
        EXPECT_TRUE(log.Messages().empty());
    }
    Advance(1);

    EXPECT_EQ(first + 101, CountTold(1));
}

TEST_F(DeviceSchemasLog, SwitchedOffCategoryCountsNothingButSpacesTheLines)
{
    const std::uint64_t before = CountTold(1);
    Advance(30);
    {
        const TestSupport::VLogCapture log;
        const TestSupport::VLogLevel off("DataStore", 1);
        EXPECT_EQ("InvalidDeviceClass.qx:000000",
                  DeviceSchemas::MakeDevicePath(VDataPath(), "").Text());
        EXPECT_TRUE(log.Messages().empty());
    }
    {
        const TestSupport::VLogCapture log;
        DeviceSchemas::MakeDevicePath(VDataPath(), "");
        EXPECT_TRUE(log.Messages().empty()) << "the silent call has taken its turn";
    }
    Advance(30);

    EXPECT_EQ(before + 2, CountTold(1));
}

TEST_F(DeviceSchemasLog, BadCallsMayComeFromManyThreads)
{
    const TestSupport::VLogCapture log;
    std::vector<std::thread> threads;
    for (int thread = 0; thread < 4; ++thread) {
        threads.emplace_back([] {
            for (int call = 0; call < 200; ++call) {
                DeviceSchemas::MakeDevicePath(VDataPath(), "");
                DeviceSchemas::UserIdToken(DeviceSchemas::CameraDevice("X"));
            }
        });
    }
    for (std::thread& thread : threads) {
        thread.join();
    }

    EXPECT_GE(log.Messages().size(), 1u);
    EXPECT_LE(log.Messages().size(), 4u) << "threads that meet may each write the line";
}

} // namespace
