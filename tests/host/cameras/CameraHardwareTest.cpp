#include "CameraBench.h"
#include "DebugServices/ThreadName.h"
#include "QuorixDataStore/DataWriter.h"
#include "QuorixDataStoreTypes/GreyscaleMode.h"
#include "support/LogCapture.h"

#include <gmock/gmock.h>

#include <atomic>
#include <cmath>
#include <stdexcept>
#include <string>
#include <thread>
#include <vector>

using namespace QuorixHost;
using CameraTest::VCounter;
using testing::ElementsAre;
using testing::IsEmpty;

namespace {

const char* const strobePath = "Device.qx:1.Settings.StrobeIntensity";

/// Camera 1 with a listener to its strobe, which notes the value at each notification.
class CameraHardware : public CameraTest::CameraBench
{
protected:
    ~CameraHardware() override { hardware->Stop(); } // before what its notifications touch

    CameraHardware()
    {
        cameras->AddCamera(1);
        strobe = Camera(1, "StrobeIntensity");
        strobe->GetChangedCallback().Add([this] {
            double number = -1.0;
            (void)ReadValue(strobe->GetValue(), number);
            notified.push_back(number); // read by the test once the hardware is idle
            notifications.CountUp();
        });
    }

    std::shared_ptr<VSimulatedParameter> strobe;
    std::vector<double> notified;
    VCounter notifications;
};

} // namespace

TEST_F(CameraHardware, AProposalIsVisibleAtOnceAndConfirmedAfterTheDelay)
{
    EXPECT_TRUE(strobe->SetValue(MakeDoubleValue(0.75)));
    Drain();

    EXPECT_EQ(0.75, Number(strobePath));
    EXPECT_EQ(0.5, Verified(strobePath));
    EXPECT_THAT(notified, IsEmpty());
    EXPECT_THAT(timers.Delays(), ElementsAre(CameraTest::testDelay));

    Confirm();

    EXPECT_EQ(0.75, Number(strobePath));
    EXPECT_EQ(0.75, Verified(strobePath));
    EXPECT_THAT(notified, ElementsAre(0.75));
    EXPECT_FALSE(timers.IsHeld());
}

TEST_F(CameraHardware, ANumberIsClampedAndTheProposalFollows)
{
    strobe->SetValue(MakeDoubleValue(5.0));
    EXPECT_EQ(5.0, Number(strobePath));

    Confirm();

    EXPECT_EQ(1.0, Number(strobePath));
    EXPECT_EQ(1.0, Verified(strobePath));
    EXPECT_THAT(notified, ElementsAre(1.0));
}

TEST_F(CameraHardware, WhatIsClampedToTheVerifiedValueIsNoChange)
{
    strobe->SetValue(MakeDoubleValue(1.0));
    Confirm();
    strobe->SetValue(MakeDoubleValue(5.0));
    Confirm();

    EXPECT_EQ(1.0, Number(strobePath));
    EXPECT_THAT(notified, ElementsAre(1.0));
}

TEST_F(CameraHardware, NotANumberIsAnsweredByTheLastVerifiedValue)
{
    strobe->SetValue(MakeDoubleValue(std::nan("")));
    Confirm();

    EXPECT_EQ(0.5, Number(strobePath));
    EXPECT_EQ(0.5, Verified(strobePath));
    EXPECT_THAT(notified, IsEmpty());

    // The proposal has ended: another commit brings no reminder.
    Camera(1, "Name")->SetValue(MakeStringValue("X"));
    Confirm();
    EXPECT_EQ(2U, timers.Delays().size());
}

TEST_F(CameraHardware, ARawGreyscaleNumberIsConfirmed)
{
    Camera(1, "GreyscaleMode")->SetValue(MakeEnumValue(GreyscaleModeSchema(), 6));
    Confirm();

    EXPECT_EQ(6U, ReadUInt32OrZero(Camera(1, "GreyscaleMode")->GetValue()));
}

TEST_F(CameraHardware, OfSeveralProposalsTheLastIsConfirmedOnce)
{
    for (const double number : {0.6, 0.7, 0.8}) {
        strobe->SetValue(MakeDoubleValue(number));
    }
    Confirm();

    EXPECT_THAT(notified, ElementsAre(0.8));
    EXPECT_THAT(timers.Delays(), testing::SizeIs(1));
}

TEST_F(CameraHardware, AProposalThatIsTakenBackInTimeIsNoChange)
{
    strobe->SetValue(MakeDoubleValue(0.75));
    strobe->SetValue(MakeDoubleValue(0.5));
    Confirm();

    EXPECT_THAT(notified, IsEmpty());
    EXPECT_EQ(0.5, Verified(strobePath));
}

TEST_F(CameraHardware, AWriteOfTheSameValueIsNoChange)
{
    EXPECT_TRUE(strobe->SetValue(MakeDoubleValue(0.5)));
    Drain();

    EXPECT_THAT(timers.Delays(), IsEmpty());
    EXPECT_THAT(notified, IsEmpty());
}

TEST_F(CameraHardware, ProposalsThatWaitAreConfirmedTogether)
{
    int thresholds = 0;
    Camera(1, "Threshold")->GetChangedCallback().Add([&] { ++thresholds; });
    std::uint64_t before = 0;
    strobe->SetValue(MakeDoubleValue(0.75));
    Camera(1, "Threshold")->SetValue(MakeDoubleValue(0.5));
    {
        const VDataReader reader(*store);
        before = reader.GetCurrentChangeId();
    }

    Confirm();

    const VDataReader reader(*store);
    EXPECT_EQ(before + 1, reader.GetCurrentChangeId());
    EXPECT_THAT(notified, ElementsAre(0.75));
    EXPECT_EQ(1, thresholds);
    EXPECT_THAT(timers.Delays(), testing::SizeIs(1));
}

TEST_F(CameraHardware, AReminderOfTheStoreStartsNoSecondWait)
{
    strobe->SetValue(MakeDoubleValue(0.75));
    for (int i = 0; i < 5; ++i) {
        VDataWriter writer(*store);
        writer.SetValue(VDataToken(VDataPath("Other.Value")), MakeUInt32Value(i));
    }
    Confirm();

    EXPECT_THAT(timers.Delays(), testing::SizeIs(1));
    EXPECT_THAT(notified, ElementsAre(0.75));
}

TEST_F(CameraHardware, AProposalDuringTheConfirmationOfAnotherIsNotMissed)
{
    strobe->GetChangedCallback().Add([this] {
        if (notifications.Count() == 1) {
            strobe->SetValue(MakeDoubleValue(0.8));
        }
    });
    strobe->SetValue(MakeDoubleValue(0.75));
    Confirm();
    Confirm();

    EXPECT_THAT(notified, ElementsAre(0.75, 0.8));
    EXPECT_EQ(0.8, Verified(strobePath));
}

TEST_F(CameraHardware, NotifiesOnItsOwnThreadWithNoViewOpen)
{
    std::string thread;
    std::size_t locks = 1;
    strobe->GetChangedCallback().Add([&] {
        thread = DebugServices::GetThreadName();
        locks = store->GetLocks().size();
    });
    strobe->SetValue(MakeDoubleValue(0.75));
    Confirm();

    EXPECT_EQ("Camera Hardware0", thread);
    EXPECT_EQ(0U, locks);
}

TEST_F(CameraHardware, NotifiesOnItsOwnThreadAlsoWhenAReaderCommits)
{
    std::string thread;
    strobe->GetChangedCallback().Add([&] { thread = DebugServices::GetThreadName(); });
    VCounter reading, confirmed;
    std::thread reader;
    strobe->SetValue(MakeDoubleValue(0.75));
    {
        const VDataReader held(*store);
        ASSERT_TRUE(timers.Expire());
        // The hardware has written, and its changes wait for this reader to go.
        Drain();
        EXPECT_THAT(notified, IsEmpty());
    }
    Drain();

    EXPECT_THAT(notified, ElementsAre(0.75));
    EXPECT_EQ("Camera Hardware0", thread);
}

TEST_F(CameraHardware, ACameraThatGoesMeanwhileIsNotConfirmed)
{
    const auto held = strobe;
    strobe->SetValue(MakeDoubleValue(0.75));

    cameras->RemoveCamera(1);
    Confirm();

    EXPECT_EQ(-1.0, Verified(strobePath)); // nothing came back
    EXPECT_THAT(notified, IsEmpty());
    cameras->AddCamera(2);
    Camera(2, "StrobeIntensity")->SetValue(MakeDoubleValue(0.75));
    Confirm();
    EXPECT_EQ(0.75, Verified("Device.qx:2.Settings.StrobeIntensity"));
}

TEST_F(CameraHardware, ACameraThatGoesAndComesBackMeanwhileKeepsItsFirstValue)
{
    strobe->SetValue(MakeDoubleValue(0.75));
    cameras->RemoveCamera(1);
    cameras->AddCamera(1);
    Confirm();

    EXPECT_EQ(0.5, Number(strobePath));
    EXPECT_EQ(0.5, Verified(strobePath));
    EXPECT_THAT(notified, IsEmpty());
}

TEST_F(CameraHardware, AListenerThatThrowsEndsNothing)
{
    const TestSupport::VLogCapture log;
    strobe->GetChangedCallback().Add([] { throw std::runtime_error("too bright"); });
    strobe->GetChangedCallback().Add([] { throw 7; });

    strobe->SetValue(MakeDoubleValue(0.75));
    Confirm();
    hardware->NotifyRepeatedly(strobe, 2);
    Drain();

    EXPECT_THAT(notified, ElementsAre(0.75, 0.75, 0.75));
    ASSERT_EQ(3U, log.Messages().size());
    EXPECT_EQ("The camera hardware failed: too bright", log.Messages()[0].Text);
    EXPECT_EQ("Host", log.Messages()[0].Category);
}

TEST_F(CameraHardware, ABurstOfNotificationsIsCompleteAndInOrder)
{
    strobe->SetValue(MakeDoubleValue(0.75));
    hardware->NotifyRepeatedly(strobe, 1000);
    Confirm();

    EXPECT_EQ(std::vector<double>(1001, 0.75), notified);
}

TEST_F(CameraHardware, ABurstEndsWhenItsParameterGoes)
{
    std::atomic<int> count{0};
    VCounter begun, removed;
    auto parameter = Camera(1, "Threshold");
    parameter->GetChangedCallback().Add([&] {
        if (++count == 1) {
            begun.CountUp();
            removed.WaitFor(1);
        }
    });
    hardware->NotifyRepeatedly(parameter, 1000000);
    ASSERT_TRUE(begun.WaitFor(1));

    parameter.reset();
    cameras->RemoveCamera(1);
    removed.CountUp();
    Drain();

    EXPECT_EQ(1, count);
}

TEST_F(CameraHardware, ABurstEndsAtStop)
{
    strobe->GetChangedCallback().Add([this] { notifications.WaitFor(1); });
    hardware->NotifyRepeatedly(strobe, 4000000000U);
    ASSERT_TRUE(notifications.WaitFor(1));

    hardware->Stop();

    EXPECT_LT(notified.size(), 4000000000U);
}

TEST_F(CameraHardware, StoppedItConfirmsNothingAndLetsGoOfItsTimer)
{
    strobe->SetValue(MakeDoubleValue(0.75));
    Drain();
    EXPECT_TRUE(timers.IsHeld());

    hardware->Stop();

    EXPECT_FALSE(timers.IsHeld());
    EXPECT_TRUE(strobe->SetValue(MakeDoubleValue(0.8)));
    EXPECT_EQ(0.8, Number(strobePath));
    EXPECT_EQ(0.5, Verified(strobePath));
    EXPECT_THAT(notified, IsEmpty());
    hardware->Stop(); // does nothing
}

TEST(CameraHardwareTimer, ConfirmsByItselfAfterARealDelay)
{
    const auto store = std::make_shared<VDataStore>();
    const auto hardware = KVR::MakeShared<VCameraHardware>(store, 1U);
    VSimulatedCameras cameras(store, hardware);
    cameras.AddCamera(1);
    const auto strobe = cameras.Find("Device", "qx:1")->Find("StrobeIntensity");
    VCounter notifications;
    strobe->GetChangedCallback().Add([&] { notifications.CountUp(); });

    strobe->SetValue(MakeDoubleValue(0.75));
    EXPECT_TRUE(notifications.WaitFor(1));
    strobe->SetValue(MakeDoubleValue(0.8));
    EXPECT_TRUE(notifications.WaitFor(2));
    hardware->Stop();
}

TEST(CameraHardwareTimer, ALongWaitHoldsUpNoStop)
{
    constexpr std::uint32_t aDay = 24 * 3600 * 1000;
    const auto store = std::make_shared<VDataStore>();
    const auto hardware = KVR::MakeShared<VCameraHardware>(store, aDay);
    VSimulatedCameras cameras(store, hardware);
    cameras.AddCamera(1);
    cameras.Find("Device", "qx:1")->Find("StrobeIntensity")->SetValue(MakeDoubleValue(0.75));

    hardware->Stop(); // would take a day
}

TEST(CameraHardwareTimer, ManyUsersAtOnceEndWithEverythingConfirmed)
{
    constexpr std::uint32_t cameraCount = 3;
    constexpr int rounds = 200;
    const auto store = std::make_shared<VDataStore>();
    const auto hardware = KVR::MakeShared<VCameraHardware>(store, 0U);
    VSimulatedCameras cameras(store, hardware);
    std::vector<std::shared_ptr<VSimulatedParameter>> strobes;
    std::atomic<int> notified{0};
    VCounter reached;
    for (std::uint32_t number = 1; number <= cameraCount; ++number) {
        cameras.AddCamera(number);
        strobes.push_back(cameras.Find("Device", CameraId(number))->Find("StrobeIntensity"));
        strobes.back()->GetChangedCallback().Add([&, strobe = strobes.back().get()] {
            ++notified;
            double intensity = 0.0;
            if (ReadValue(strobe->GetValue(), intensity) && intensity == 1.0) {
                reached.CountUp(); // the last value that each is set to
            }
        });
    }

    std::vector<std::thread> users;
    for (const auto& strobe : strobes) {
        users.emplace_back([&] {
            for (int i = 0; i < rounds; ++i) {
                EXPECT_TRUE(strobe->SetValue(MakeDoubleValue((i % 90) / 100.0)));
                EXPECT_FALSE(strobe->GetValue().Empty());
            }
            EXPECT_TRUE(strobe->SetValue(MakeDoubleValue(7.0)));
        });
    }
    for (int i = 0; i < rounds / 4; ++i) {
        EXPECT_TRUE(cameras.AddCamera(100));
        cameras.Find("Device", "qx:100")->Find("Threshold")->SetValue(MakeDoubleValue(1.0));
        EXPECT_TRUE(cameras.RemoveCamera(100));
    }
    for (std::thread& user : users) {
        user.join();
    }

    EXPECT_TRUE(reached.WaitFor(cameraCount));
    hardware->Stop();
    for (const auto& strobe : strobes) {
        double number = 0.0;
        EXPECT_TRUE(ReadValue(strobe->GetValue(), number));
        EXPECT_EQ(1.0, number);
    }
    EXPECT_LE(notified, static_cast<int>(cameraCount) * (rounds + 1));
}
