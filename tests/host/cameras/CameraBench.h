#pragma once

#include "QuorixDataStore/DataReader.h"
#include "QuorixDataStore/DataStore.h"
#include "QuorixDataStore/DataVerifyReader.h"
#include "cameras/CameraHardware.h"
#include "cameras/CameraSelection.h"
#include "cameras/SimulatedCameras.h"
#include "io/Values.h"
#include "notification/IAsioPostalService.h"
#include "notification/MakeShared.h"

#include <gtest/gtest.h>

#include <chrono>
#include <condition_variable>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

namespace CameraTest {

/// Longer than anything takes, so that only a fault waits for it.
constexpr std::chrono::seconds limit{60};

/// Counts what happens on other threads. Threads: every operation [any].
class VCounter
{
public:
    void CountUp()
    {
        // Notified under the mutex: the waiting side may destroy the counter at once.
        const std::lock_guard<std::mutex> lock(mutex);
        ++count;
        changed.notify_all();
    }

    int Count() const
    {
        const std::lock_guard<std::mutex> lock(mutex);
        return count;
    }

    /// @return false when the count was not reached within the limit
    bool WaitFor(int wanted)
    {
        std::unique_lock<std::mutex> lock(mutex);
        return changed.wait_for(lock, limit, [&] { return count >= wanted; });
    }

private:
    mutable std::mutex mutex;
    std::condition_variable changed;
    int count = 0;
};

/// The hardware's timers, which run out when the test says so.
class VHandTimers
{
public:
    NotificationSystem::VDeadlineTimerFactory Factory()
    {
        return [this](const std::shared_ptr<KVR::IAsioPostalService>& service,
                      boost::function<void()> function, std::uint32_t milliseconds) {
            const std::lock_guard<std::mutex> lock(mutex);
            delays.push_back(milliseconds);
            present = std::make_shared<int>();
            expire = [service, function = std::move(function)] { service->Post(function, 0); };
            changed.notify_all();
            return std::shared_ptr<void>(present);
        };
    }

    /// Waits for a timer to be made, and lets it run out on the hardware's thread.
    bool Expire()
    {
        std::unique_lock<std::mutex> lock(mutex);
        if (!changed.wait_for(lock, limit, [this] { return !expire.empty(); })) {
            return false;
        }
        std::exchange(expire, boost::function<void()>())();
        return true;
    }

    /// The delay of each timer made so far.
    std::vector<std::uint32_t> Delays() const
    {
        const std::lock_guard<std::mutex> lock(mutex);
        return delays;
    }

    /// Whether somebody keeps the last timer.
    bool IsHeld() const
    {
        const std::lock_guard<std::mutex> lock(mutex);
        return present.use_count() > 1;
    }

private:
    mutable std::mutex mutex;
    std::condition_variable changed;
    std::vector<std::uint32_t> delays;
    std::shared_ptr<int> present;
    boost::function<void()> expire;
};

constexpr std::uint32_t testDelay = 25;

/// A store with cameras and hardware, whose time the test lets pass.
class CameraBench : public testing::Test
{
protected:
    using VSimulatedParameter = QuorixHost::VSimulatedParameter;
    using VSettingModel = QuorixHost::VSettingModel;

    ~CameraBench() override { hardware->Stop(); }

    /// Waits until the hardware has done all that it was given so far, and what came of that.
    void Drain()
    {
        for (int round = 0; round < 3; ++round) {
            VCounter done;
            const auto marker = std::make_shared<VSimulatedParameter>(store, VSettingModel());
            marker->GetChangedCallback().Add([&] { done.CountUp(); });
            hardware->NotifyRepeatedly(marker, 1);
            ASSERT_TRUE(done.WaitFor(1));
        }
    }

    /// Lets the hardware confirm what waits.
    void Confirm()
    {
        ASSERT_TRUE(timers.Expire());
        Drain();
    }

    std::shared_ptr<VSimulatedParameter> Camera(std::uint32_t number, const std::string& name)
    {
        const auto device = cameras->Find("Device", QuorixHost::CameraId(number));
        return device ? device->Find(name) : nullptr;
    }

    double Number(const std::string& path) const
    {
        double number = -1.0;
        const VDataReader reader(*store);
        (void)ReadValue(reader.GetValue(VDataToken(VDataPath(path))), number);
        return number;
    }

    double Verified(const std::string& path) const
    {
        double number = -1.0;
        VDataValue value;
        const VDataVerifyReader reader(*store);
        (void)reader.GetVerifiedValue(VDataToken(VDataPath(path)), value);
        (void)ReadValue(value, number);
        return number;
    }

    VHandTimers timers;
    const std::shared_ptr<VDataStore> store = std::make_shared<VDataStore>();
    const std::shared_ptr<QuorixHost::VCameraHardware> hardware =
        KVR::MakeShared<QuorixHost::VCameraHardware>(store, testDelay, timers.Factory());
    const std::shared_ptr<QuorixHost::VSimulatedCameras> cameras =
        std::make_shared<QuorixHost::VSimulatedCameras>(store, hardware);
};

} // namespace CameraTest
