#pragma once

#include "QuorixDataStore/DataListeners.h"
#include "QuorixDataStore/DataReader.h"
#include "QuorixDataStore/DataStore.h"
#include "QuorixDataStore/DataWriter.h"
#include "QuorixPluginControlStreamServer/Authorization/QuorixControlAuthorization.h"
#include "io/Values.h"
#include "notification/MakeShared.h"
#include "notification/Support.h"

#include <boost/bind/bind.hpp>
#include <gtest/gtest.h>

#include <atomic>
#include <cstdint>
#include <functional>
#include <memory>
#include <mutex>
#include <string>
#include <utility>
#include <vector>

// What the tests of the authorization share: an operator, a clock and timers that do as a test
// says.

namespace AuthorizationBench {

/// The operator's side, with the answer that a test gives.
///
/// Threads: any; `Answer` is set before the object is used.
class VScriptedGUI : public IQuorixControlAuthorizationGUI
{
public:
    using Question = std::pair<std::string, std::string>; ///< id and name

    /// What the operator does. It runs within Ask.
    std::function<EAskOutcome()> Answer = [] { return EAskOutcome::Cancelled; };

    EAskOutcome Ask(const std::string& deviceId, const std::string& deviceName) override
    {
        {
            const std::lock_guard<std::mutex> lock(mutex);
            questions.emplace_back(deviceId, deviceName);
        }
        return Answer();
    }

    void Cancel(const std::string& deviceId) override
    {
        const std::lock_guard<std::mutex> lock(mutex);
        cancelled.push_back(deviceId);
    }

    std::vector<Question> Questions() const
    {
        const std::lock_guard<std::mutex> lock(mutex);
        return questions;
    }

    std::vector<std::string> Cancelled() const
    {
        const std::lock_guard<std::mutex> lock(mutex);
        return cancelled;
    }

private:
    mutable std::mutex mutex; // guards the fields below
    std::vector<Question> questions;
    std::vector<std::string> cancelled;
};

/// Timers that fire when a test says so. Threads: one.
class VManualTimers
{
public:
    struct VTimer
    {
        std::shared_ptr<KVR::IAsioPostalService> Service;
        boost::function<void()> Function;
        std::uint32_t Milliseconds = 0;
    };

    NotificationSystem::VDeadlineTimerFactory Factory()
    {
        return boost::bind(&VManualTimers::Make, this, boost::placeholders::_1,
                           boost::placeholders::_2, boost::placeholders::_3);
    }

    /// Returns the youngest timer, empty where nobody holds it.
    std::shared_ptr<VTimer> Last() const { return made.empty() ? nullptr : made.back().lock(); }

    /// Lets the youngest timer expire. @return false where nobody holds it or it has expired before
    bool Fire()
    {
        const std::shared_ptr<VTimer> timer = Last();
        return timer && !timer->Function.empty() &&
               KVR::GuardedCall(std::exchange(timer->Function, boost::function<void()>()));
    }

    std::size_t CountMade() const { return made.size(); }

    /// Returns how many timers somebody holds.
    std::size_t CountHeld() const
    {
        std::size_t held = 0;
        for (const auto& timer : made) {
            held += timer.expired() ? 0 : 1;
        }
        return held;
    }

private:
    std::shared_ptr<void> Make(const std::shared_ptr<KVR::IAsioPostalService>& service,
                               boost::function<void()> function, std::uint32_t milliseconds)
    {
        auto timer = std::make_shared<VTimer>(VTimer{service, std::move(function), milliseconds});
        made.push_back(timer);
        return timer;
    }

    std::vector<std::weak_ptr<VTimer>> made;
};

/// A clock that stands still. Threads: any.
class VManualClock
{
public:
    VQuorixControlAuthorization::Clock Function() { return boost::bind(&VManualClock::Now, this); }

    std::int64_t Now() const { return now; }
    void Advance(std::int64_t milliseconds) { now += milliseconds; }

private:
    std::atomic<std::int64_t> now{1700000000000};
};

/// Reads and writes what lies in a store.
class VStoreView
{
public:
    explicit VStoreView(std::shared_ptr<IDataStore> viewed) : store(std::move(viewed)) {}

    bool Has(const VDataPath& path) const { return VDataReader(*store).HasValue(VDataToken(path)); }
    std::string Text(const VDataPath& path) const
    {
        return ReadString(VDataReader(*store).GetValue(VDataToken(path)));
    }
    bool Flag(const VDataPath& path) const
    {
        return ReadBool(VDataReader(*store).GetValue(VDataToken(path)));
    }
    void SetText(const VDataPath& path, const std::string& text) const
    {
        VDataWriter(*store).SetValue(VDataToken(path), MakeStringValue(text));
    }

    bool IsRecorded(const std::string& deviceId) const
    {
        return Has(VDataPath{"Control", deviceId, "Connected"});
    }
    bool IsConnected(const std::string& deviceId) const
    {
        return Flag(VDataPath{"Control", deviceId, "Connected"});
    }
    std::string NameOf(const std::string& deviceId) const
    {
        return Text(VDataPath{"Control", deviceId, "Name"});
    }

    /// Returns listeners of a path, which stay where they are.
    VDataListeners& Listeners(const VDataPath& path) const
    {
        return VDataWriter(*store).GetListeners(path);
    }

    std::string Allowed() const { return Text(AllowedPath()); }
    std::string Banned() const { return Text(BannedPath()); }
    void SetLists(const std::string& allowed, const std::string& banned) const
    {
        SetText(AllowedPath(), allowed);
        SetText(BannedPath(), banned);
    }

    // Spelled out: files of earlier runs hold these names.
    static VDataPath AllowedPath() { return VDataPath("Preferences.User.AllowedControls"); }
    static VDataPath BannedPath() { return VDataPath("Preferences.User.BannedControls"); }

private:
    const std::shared_ptr<IDataStore> store;
};

/// An authorization whose time, operator and postal service a test drives.
class VAuthorizationBench : public testing::Test
{
protected:
    /// Makes the authorization, as a start of the plug-in does.
    void Make()
    {
        manager = KVR::MakeShared<VQuorixControlAuthorization>(postal, store, timers.Factory(),
                                                               clock.Function());
        manager->GetAuthorizedCallback().Add([this](bool authorized) {
            outcomes.push_back(authorized);
            onOutcome();
        });
    }

    /// Makes it with an operator who answers so.
    void MakeWithOperator(EAskOutcome outcome)
    {
        Make();
        gui->Answer = [outcome] { return outcome; };
        manager->SetGUI(gui);
    }

    /// Makes it with stored lists.
    void MakeWithLists(const std::string& allowed, const std::string& banned)
    {
        view.SetLists(allowed, banned);
        Make();
    }

    /// Lets a device ask and all follow that follows.
    EAuthorizeAnswer Ask(const std::string& deviceId, const std::string& deviceName = "A device")
    {
        const EAuthorizeAnswer answer = manager->Authorize(deviceId, deviceName);
        postal->Deliver();
        return answer;
    }

    const std::shared_ptr<VDataStore> store = std::make_shared<VDataStore>();
    const VStoreView view{store};
    const std::shared_ptr<NotificationTest::VManualPostalService> postal =
        std::make_shared<NotificationTest::VManualPostalService>();
    VManualTimers timers;
    VManualClock clock;
    std::vector<bool> outcomes; // of the authorized notification
    std::function<void()> onOutcome = [] {};
    std::shared_ptr<VScriptedGUI> gui = std::make_shared<VScriptedGUI>();
    std::shared_ptr<VQuorixControlAuthorization> manager;
};

} // namespace AuthorizationBench
