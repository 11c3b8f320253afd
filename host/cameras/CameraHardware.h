#pragma once

#include "notification/AsioDeadlineTimer.h"
#include "notification/Shared.h"
#include "utils/Mutex.h"

#include <boost/function.hpp>

#include <atomic>
#include <cstdint>
#include <memory>
#include <vector>

class IDataStore;
struct VDataListeners;

namespace NotificationSystem {
class VAsioPostalService;
} // namespace NotificationSystem

namespace QuorixHost {

class VSimulatedParameter;

/// The hardware's hearing of one parameter, which ends with this object.
class VHardwareWatch
{
public:
    VHardwareWatch(VDataListeners& listeners, std::uint64_t proposal, std::uint64_t verified);
    ~VHardwareWatch();

    VHardwareWatch(const VHardwareWatch&) = delete;
    VHardwareWatch& operator=(const VHardwareWatch&) = delete;

private:
    VDataListeners& listeners; // of a store that the owner of this object keeps
    const std::uint64_t proposal;
    const std::uint64_t verified;
};

/// What stands in for the cameras' electronics: it confirms what users ask for, a while later.
///
/// It hears of proposals from the store, waits, and then confirms all that wait in one write scope.
/// A parameter's changed notification is fired once its confirmed value is committed, with no view
/// open and no lock held. Made by KVR::MakeShared.
///
/// Owns: a thread, on which all this happens; a reference to the store. Parameters are held weakly:
/// what has gone with its device is neither confirmed nor notified.
/// Threads: every operation [any], but Stop, which is for the owner.
/// Failure: what a function of a notification throws is logged, and the hardware goes on.
class VCameraHardware : public KVR::VShared
{
public:
    /// @param delay      how long a proposal waits for its confirmation, in milliseconds; one that
    /// comes while others wait is confirmed with them
    /// @param makeTimer  makes the timer for it, so that tests let the time pass at will
    VCameraHardware(std::shared_ptr<IDataStore> store, std::uint32_t delay,
                    NotificationSystem::VDeadlineTimerFactory makeTimer =
                        &NotificationSystem::MakeDeadlineTimer);

    /// Stops.
    ~VCameraHardware() override;

    VCameraHardware(const VCameraHardware&) = delete;
    VCameraHardware& operator=(const VCameraHardware&) = delete;

    /// Begins to hear of a parameter. The calling thread must hold no reading view of the store.
    std::unique_ptr<VHardwareWatch> Watch(const std::shared_ptr<VSimulatedParameter>& parameter);

    /// Fires the parameter's changed notification `count` times in a row, behind what is to be done
    /// already, and does not wait for it. It ends early where the parameter goes, or at Stop.
    void NotifyRepeatedly(const std::shared_ptr<VSimulatedParameter>& parameter,
                          std::uint32_t count);

    /// Waits for the thread to do what it is at, and ends it. Proposals that wait then stay
    /// unconfirmed, and what comes later is ignored. A second call does nothing.
    void Stop();

private:
    using WeakParameter = std::weak_ptr<VSimulatedParameter>;

    void OnProposalPending(const std::shared_ptr<VSimulatedParameter>& parameter);
    void OnVerifiedChanged(const std::shared_ptr<VSimulatedParameter>& parameter);
    void Post(boost::function<void()> function);
    void StartWaiting();
    void ConfirmWaiting();
    std::vector<WeakParameter> TakeWaiting();
    void NotifyWhilePresent(const WeakParameter& watched, std::uint32_t count);
    std::weak_ptr<VCameraHardware> WeakSelf();

    const std::shared_ptr<IDataStore> store;
    const std::uint32_t delay;
    const NotificationSystem::VDeadlineTimerFactory makeTimer;
    std::atomic<bool> stopping{false};

    KVR::VMutex mutex;
    std::vector<WeakParameter> waiting KVR_GUARDED_BY(mutex); // for their confirmation

    std::shared_ptr<void> timer; // of the thread below alone; present while something waits
    // Last, so that its thread, which it waits for, finds everything else whole.
    const std::shared_ptr<NotificationSystem::VAsioPostalService> service;
};

} // namespace QuorixHost
