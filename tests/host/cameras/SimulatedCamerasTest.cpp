#include "CameraBench.h"
#include "QuorixDataStore/DataWriter.h"
#include "QuorixDataStoreTypes/GreyscaleMode.h"

#include <gmock/gmock.h>

#include <string>
#include <utility>
#include <vector>

using namespace QuorixHost;
using testing::ElementsAre;
using testing::IsEmpty;
using testing::Pair;

namespace {

class SimulatedCameras : public CameraTest::CameraBench
{
protected:
    void HearReports()
    {
        cameras->GetDeviceAddedCallback().Add([this](std::string deviceClass, std::string id) {
            reported.emplace_back(std::move(deviceClass), std::move(id));
        });
    }

    /// Returns every item below a path, with its flags.
    std::vector<std::string> Items(const std::string& path) const
    {
        std::vector<VDataToken> tokens;
        const VDataReader reader(*store);
        (void)reader.FindTokens(VDataPath(path), tokens);
        std::vector<std::string> items;
        for (const VDataToken& token : tokens) {
            std::uint32_t flags = 0;
            (void)reader.GetFlags(token, flags);
            items.push_back(token.GetPath().Text() + " " + std::to_string(flags));
        }
        return items;
    }

    std::vector<std::pair<std::string, std::string>> reported;
};

} // namespace

TEST_F(SimulatedCameras, LiveInTheStoreAndRequireVerification)
{
    cameras->AddCamera(5);

    EXPECT_THAT(Items("*"),
                ElementsAre("Device.qx:5.Hardware.DisplayType 2", "Device.qx:5.Settings.Name 2",
                            "Device.qx:5.Settings.ShutterDuration 2",
                            "Device.qx:5.Settings.Threshold 2", "Device.qx:5.Settings.UserId 2",
                            "System.Gen6System.Settings.EnableTapToSelect 2"));
    EXPECT_EQ(0.25, Number("Device.qx:5.Settings.Threshold"));
    EXPECT_EQ(0.25, Verified("Device.qx:5.Settings.Threshold"));
}

TEST_F(SimulatedCameras, AreFoundByClassIdAndName)
{
    cameras->AddCamera(2);

    ASSERT_NE(nullptr, cameras->GetDevice("Device", "qx:2"));
    EXPECT_NE(nullptr, cameras->GetDevice("System", "Gen6System"));
    EXPECT_EQ(nullptr, cameras->GetDevice("Device", "qx:1"));
    EXPECT_EQ(nullptr, cameras->GetDevice("System", "qx:2"));
    EXPECT_EQ(nullptr, cameras->GetDevice("Device", "Gen6System"));
    EXPECT_EQ(nullptr, cameras->GetDevice("", ""));

    const auto camera = cameras->GetDevice("Device", "qx:2");
    EXPECT_NE(nullptr, camera->GetParameter("Threshold"));
    EXPECT_EQ(camera->GetParameter("Threshold"), camera->FindParameter("Threshold"));
    EXPECT_EQ(nullptr, camera->GetParameter("ShutterDuration"));
    EXPECT_EQ(nullptr, camera->FindParameter("ShutterDuration"));
}

TEST_F(SimulatedCameras, ASettingThatIsHeldRefusesEveryWrite)
{
    cameras->AddCamera(4);

    EXPECT_FALSE(Camera(4, "Threshold")->SetValue(MakeDoubleValue(0.5)));

    EXPECT_EQ(0.25, Number("Device.qx:4.Settings.Threshold"));
    EXPECT_TRUE(Camera(4, "StrobeIntensity")->SetValue(MakeDoubleValue(0.75)));
}

TEST_F(SimulatedCameras, AValueOfAnotherTypeIsRefused)
{
    cameras->AddCamera(1);

    EXPECT_FALSE(Camera(1, "StrobeIntensity")->SetValue(MakeBoolValue(true)));
    EXPECT_FALSE(Camera(1, "StrobeIntensity")->SetValue(VDataValue()));
    EXPECT_FALSE(Camera(1, "GreyscaleMode")->SetValue(MakeUInt32Value(1)));

    EXPECT_EQ(0.5, Number("Device.qx:1.Settings.StrobeIntensity"));
}

TEST_F(SimulatedCameras, AreReportedBehindTheSystemByTheirNumbers)
{
    for (const std::uint32_t number : {10U, 2U, 1U}) {
        cameras->AddCamera(number);
    }
    HearReports();

    cameras->ReportDevices();

    EXPECT_THAT(reported, ElementsAre(Pair("System", "Gen6System"), Pair("Device", "qx:1"),
                                      Pair("Device", "qx:2"), Pair("Device", "qx:10")));
    EXPECT_THAT(cameras->CameraNumbers(), ElementsAre(1, 2, 10));
}

TEST_F(SimulatedCameras, ACameraIsReportedWhenItAppearsAndCanBeUsedByThen)
{
    std::vector<bool> usable;
    cameras->GetDeviceAddedCallback().Add(
        [&](const std::string& deviceClass, const std::string& id) {
            const auto device = cameras->GetDevice(deviceClass, id);
            usable.push_back(device &&
                             ReadString(device->GetParameter("Name")->GetValue()) == "Camera 3");
        });

    EXPECT_TRUE(cameras->AddCamera(3));

    EXPECT_THAT(usable, ElementsAre(true));
}

TEST_F(SimulatedCameras, ACameraThatExistsIsNotAddedAgain)
{
    cameras->AddCamera(1);
    Camera(1, "StrobeIntensity")->SetValue(MakeDoubleValue(0.75));
    HearReports();

    EXPECT_FALSE(cameras->AddCamera(1));

    EXPECT_THAT(reported, IsEmpty());
    EXPECT_EQ(0.75, Number("Device.qx:1.Settings.StrobeIntensity"));
    EXPECT_THAT(cameras->CameraNumbers(), ElementsAre(1));
}

TEST_F(SimulatedCameras, ACameraGoesWithItsParametersAndItsValues)
{
    cameras->AddCamera(1);
    cameras->AddCamera(11);
    const std::weak_ptr<VSimulatedParameter> parameter = Camera(1, "Threshold");

    EXPECT_TRUE(cameras->RemoveCamera(1));

    EXPECT_TRUE(parameter.expired());
    EXPECT_EQ(nullptr, cameras->GetDevice("Device", "qx:1"));
    EXPECT_THAT(Items("Device.qx:1.*"), IsEmpty());
    EXPECT_THAT(Items("Device.qx:11.*"), testing::SizeIs(7));
    EXPECT_THAT(cameras->CameraNumbers(), ElementsAre(11));
    EXPECT_FALSE(cameras->RemoveCamera(1));
}

TEST_F(SimulatedCameras, AParameterThatSomebodyStillHoldsIsDeadOnceItsCameraHasGone)
{
    cameras->AddCamera(1);
    const auto strobe = Camera(1, "StrobeIntensity");

    cameras->RemoveCamera(1);

    EXPECT_FALSE(strobe->SetValue(MakeDoubleValue(0.75)));
    EXPECT_TRUE(strobe->GetValue().Empty());
    EXPECT_THAT(Items("Device.*"), IsEmpty());
}

TEST_F(SimulatedCameras, ACameraThatComesBackHasItsFirstValuesAndNotifiesNobodyOfThem)
{
    cameras->AddCamera(1);
    Camera(1, "StrobeIntensity")->SetValue(MakeDoubleValue(0.75));
    Confirm();
    cameras->RemoveCamera(1);

    cameras->AddCamera(1);
    int notified = 0;
    Camera(1, "StrobeIntensity")->GetChangedCallback().Add([&] { ++notified; });
    Drain();

    EXPECT_EQ(0.5, Number("Device.qx:1.Settings.StrobeIntensity"));
    EXPECT_EQ(0, notified);
}

TEST_F(SimulatedCameras, ComingAndGoingLeavesNothingBehindInTheStore)
{
    for (int round = 0; round < 20; ++round) {
        cameras->AddCamera(1);
        cameras->RemoveCamera(1);
    }

    VDataWriter writer(*store);
    VDataListeners& listeners =
        writer.GetListeners(VDataPath("Device.qx:1.Settings.StrobeIntensity"));
    EXPECT_EQ(0U, listeners.OnProposalPending.Count());
    EXPECT_EQ(0U, listeners.OnVerifiedChanged.Count());
}
