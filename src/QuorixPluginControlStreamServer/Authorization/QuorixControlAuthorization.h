#pragma once

#include "QuorixPluginControlStreamServer/Authorization/ControlDeviceRecord.h"
#include "QuorixPluginControlStreamServer/Authorization/IControlAuthorization.h"
#include "QuorixPluginControlStreamServer/Authorization/IQuorixControlAuthorizationGUI.h"
#include "notification/AsioDeadlineTimer.h"
#include "notification/MultiCallback.h"
#include "notification/Shared.h"
#include "utils/Mutex.h"

#include <boost/function.hpp>

#include <atomic>
#include <cstdint>
#include <memory>
#include <string>

class IDataStore;

namespace KVR {
class IPostalService;
} // namespace KVR

namespace NotificationSystem {
class VAsioPostalService;
} // namespace NotificationSystem

/// Decides by the two stored lists, or by the operator, and keeps the record of which device is
/// connected.
///
/// There is one holder at a time: one device id and one time of the last beat are all that is known
/// of a connection. Made by KVR::MakeShared.
///
/// Owns: the known devices, which are written to the store when the last reference goes and at no
/// other time; the thread of the heartbeat check.
/// Threads: the operations of IControlAuthorization and the four below [any]. What may take long
/// is posted to the host's postal service, where the operator is asked, so that it must deliver on
/// the GUI thread. Steps and checks hold this object for their length and none keeps it alive
/// before. Failure: what the store refuses is not looked at. A listener that throws while the last
/// reference goes is logged. Without a postal service every device is refused.
class VQuorixControlAuthorization : public IControlAuthorization, public KVR::VShared
{
public:
    using Clock = boost::function<std::int64_t()>; ///< milliseconds since the epoch

    /// Reads the two lists.
    ///
    /// @param postalService  of the host
    /// @param store          holds the lists and the record; without one nothing is kept
    /// @param timers         for tests
    /// @param clock          for tests; empty means the process's
    VQuorixControlAuthorization(
        std::shared_ptr<KVR::IPostalService> postalService, std::shared_ptr<IDataStore> store,
        NotificationSystem::VDeadlineTimerFactory timers = &NotificationSystem::MakeDeadlineTimer,
        Clock clock = Clock());

    /// Tells the listeners that the host goes away, then writes the two lists.
    ~VQuorixControlAuthorization() override;

    EAuthorizeAnswer Authorize(const std::string& deviceId, const std::string& deviceName) override;
    void CancelAuthorize(const std::string& deviceId) override;
    void Heartbeat() override;
    KVR::IMultiCallback<void(bool)>& GetAuthorizedCallback() override;
    KVR::IMultiCallback<void()>& GetDisconnectedCallback() override;
    std::string GetServerName() override;
    std::string GetCurrentDeviceId() override;
    bool IsRequestPending() override;

    /// Gives the operator's side; while there is none every device is accepted.
    void SetGUI(std::weak_ptr<IQuorixControlAuthorizationGUI> gui);

    /// Ends the check of the beats for good, and waits a while for one that is running: it holds
    /// this object, and would have to be the last to let go of it. Not for the check's own thread.
    void EndHeartbeatCheck();

    /// Returns a copy of the known devices.
    VControlDevices GetDevices();

    /// Replaces the known devices.
    void SetDevices(const VControlDevices& devices);

private:
    using Lock = KVR::VMutexLock;

    std::weak_ptr<VQuorixControlAuthorization> Self();
    VControlDevices ReadDevices() const;
    void WriteDevices(const std::string& allowed, const std::string& banned);

    // The steps of a request, on the postal service.
    void RequestStep(const std::string& deviceId, const std::string& deviceName);
    void ApplyOutcome(EAskOutcome outcome, const std::string& deviceId,
                      const std::string& deviceName, const std::string& plainName);
    void Remember(const std::string& deviceId, bool allowed, const std::string& plainName);
    void ConnectStep(const std::string& deviceId, const std::string& deviceName);

    void ScheduleCheck(const std::string& deviceId) KVR_REQUIRES(mutex);
    void CheckHeartbeat(const std::string& deviceId, std::uint64_t number);

    std::shared_ptr<IQuorixControlAuthorizationGUI> GUI();
    void SetCurrentDeviceId(const std::string& deviceId);

    // Released in reverse: the timer before the service that it waits on.
    KVR::VMutex mutex; // lock order: this one, then the store's within the heartbeat check
    VControlDevices devices KVR_GUARDED_BY(mutex);
    const std::shared_ptr<KVR::IPostalService> postalService;
    const std::shared_ptr<IDataStore> store;
    NotificationSystem::VMultiCallback<void(bool)> authorized;
    NotificationSystem::VMultiCallback<void()> disconnected;
    std::weak_ptr<IQuorixControlAuthorizationGUI> gui KVR_GUARDED_BY(mutex);
    std::string currentDeviceId KVR_GUARDED_BY(mutex);
    std::int64_t lastBeat KVR_GUARDED_BY(mutex) = 0; // by the clock below
    const NotificationSystem::VDeadlineTimerFactory makeTimer;
    const Clock clock;
    const std::shared_ptr<NotificationSystem::VAsioPostalService> heartbeatMonitor;
    std::shared_ptr<void> heartbeatTimer KVR_GUARDED_BY(mutex); // what keeps the next check alive
    std::uint64_t checkNumber KVR_GUARDED_BY(mutex) = 0;        // of the check that the timer runs
    bool checkEnded KVR_GUARDED_BY(mutex) = false;              // for good
    std::atomic<bool> requestPending{false}; // set under the mutex, cleared and read without it
};
