#include "cameras/CameraHardware.h"

#include "QuorixDataStore/DataListeners.h"
#include "QuorixDataStore/DataVerifyWriter.h"
#include "QuorixDataStore/DataWriter.h"
#include "cameras/SimulatedParameter.h"
#include "notification/AsioPostalService.h"
#include "notification/WeakBinding.h"
#include "utils/LogStatement.h"

#include <boost/bind/bind.hpp>

#include <exception>
#include <utility>

namespace QuorixHost {
namespace {

/// Runs one thing that the thread has to do. An exception would end the thread, and with it every
/// camera.
void RunGuarded(const boost::function<void()>& function)
{
    try {
        function();
    } catch (const KVR::VDeregisterWeakCallbackException&) {
        // What it was about has gone, so there is nothing to be done.
    } catch (const std::exception& exception) {
        KVR_LOG("Host", 2, "The camera hardware failed: %1%", exception.what());
    } catch (...) {
        KVR_LOG("Host", 2, "The camera hardware failed with an unknown exception");
    }
}

/// Writes what the hardware makes of a parameter's proposal, where it still has one.
void Confirm(IDataVerifyWriter& writer, const VSimulatedParameter& parameter)
{
    VDataValue proposed;
    VDataValue verified;
    // False where the parameter has gone with its device; a write would bring it back.
    if (!writer.GetProposedValue(parameter.Token(), proposed) ||
        !writer.GetVerifiedValue(parameter.Token(), verified)) {
        return;
    }
    const VDataValue confirmed = ConfirmedValue(parameter.Setting(), proposed, verified);
    // Neither records anything where the value is the same, and neither can be refused, since the
    // schema is the item's own.
    static_cast<void>(writer.SetProposedValue(parameter.Token(), confirmed));
    static_cast<void>(writer.SetVerifiedValue(parameter.Token(), confirmed));
}

} // namespace

VHardwareWatch::VHardwareWatch(VDataListeners& listeners, std::uint64_t proposal,
                               std::uint64_t verified)
    : listeners(listeners), proposal(proposal), verified(verified)
{
}

VHardwareWatch::~VHardwareWatch()
{
    listeners.OnProposalPending.Remove(proposal);
    listeners.OnVerifiedChanged.Remove(verified);
}

VCameraHardware::VCameraHardware(std::shared_ptr<IDataStore> store, std::uint32_t delay,
                                 NotificationSystem::VDeadlineTimerFactory makeTimer)
    : store(std::move(store)),
      delay(delay),
      makeTimer(std::move(makeTimer)),
      service(std::make_shared<NotificationSystem::VAsioPostalService>("Camera Hardware", 1, 0))
{
}

VCameraHardware::~VCameraHardware()
{
    Stop();
}

std::unique_ptr<VHardwareWatch>
VCameraHardware::Watch(const std::shared_ptr<VSimulatedParameter>& parameter)
{
    const WeakParameter watched = parameter;
    const auto bound =
        [&](void (VCameraHardware::*handler)(const std::shared_ptr<VSimulatedParameter>&)) {
            return boost::bind(handler,
                               boost::bind(&KVR::LockOrDeregister<VCameraHardware>, WeakSelf()),
                               boost::bind(&KVR::LockOrDeregister<VSimulatedParameter>, watched));
        };

    VDataWriter writer(*store);
    VDataListeners& listeners = writer.GetListeners(parameter->Token());
    const auto proposal =
        listeners.OnProposalPending.Add(bound(&VCameraHardware::OnProposalPending));
    const auto verified =
        listeners.OnVerifiedChanged.Add(bound(&VCameraHardware::OnVerifiedChanged));
    return std::make_unique<VHardwareWatch>(listeners, proposal, verified);
}

void VCameraHardware::NotifyRepeatedly(const std::shared_ptr<VSimulatedParameter>& parameter,
                                       std::uint32_t count)
{
    Post(boost::bind(&VCameraHardware::NotifyWhilePresent,
                     boost::bind(&KVR::LockOrDeregister<VCameraHardware>, WeakSelf()),
                     WeakParameter(parameter), count));
}

void VCameraHardware::Stop()
{
    if (stopping.exchange(true)) {
        return;
    }
    // The timer is the thread's own; left alone, it would hold up the end for its whole delay.
    // Without a reference to lock, this object is being destroyed, and the wait is short.
    if (const auto self = std::static_pointer_cast<VCameraHardware>(weak_from_this().lock())) {
        service->Post([self] { self->timer.reset(); }, 0);
    }
    service->Stop();
}

void VCameraHardware::OnProposalPending(const std::shared_ptr<VSimulatedParameter>& parameter)
{
    // The store reminds of every open proposal at each of its commits.
    if (parameter->SetQueued(true)) {
        return;
    }
    {
        const KVR::VMutexLock lock(mutex);
        waiting.push_back(parameter);
        if (waiting.size() > 1) {
            return; // the first one has brought the timer on its way
        }
    }
    Post(boost::bind(&VCameraHardware::StartWaiting,
                     boost::bind(&KVR::LockOrDeregister<VCameraHardware>, WeakSelf())));
}

void VCameraHardware::OnVerifiedChanged(const std::shared_ptr<VSimulatedParameter>& parameter)
{
    NotifyRepeatedly(parameter, 1);
}

void VCameraHardware::Post(boost::function<void()> function)
{
    service->Post(boost::bind(&RunGuarded, std::move(function)), 0);
}

void VCameraHardware::StartWaiting()
{
    if (!stopping) {
        timer = makeTimer(
            service,
            boost::bind(&RunGuarded,
                        boost::function<void()>(boost::bind(
                            &VCameraHardware::ConfirmWaiting,
                            boost::bind(&KVR::LockOrDeregister<VCameraHardware>, WeakSelf())))),
            delay);
    }
}

void VCameraHardware::ConfirmWaiting()
{
    timer.reset();
    std::vector<std::shared_ptr<VSimulatedParameter>> present;
    for (const WeakParameter& each : TakeWaiting()) {
        if (auto parameter = each.lock()) {
            parameter->SetQueued(false); // before its proposal is read: the next one is not missed
            present.push_back(std::move(parameter));
        }
    }

    VDataVerifyWriter writer(*store);
    for (const auto& parameter : present) {
        Confirm(writer, *parameter);
    }
}

std::vector<VCameraHardware::WeakParameter> VCameraHardware::TakeWaiting()
{
    const KVR::VMutexLock lock(mutex);
    return std::exchange(waiting, {});
}

void VCameraHardware::NotifyWhilePresent(const WeakParameter& watched, std::uint32_t count)
{
    for (; count > 0 && !stopping; --count) {
        const std::shared_ptr<VSimulatedParameter> parameter = watched.lock();
        if (!parameter) {
            return;
        }
        RunGuarded([&] { parameter->Notify(); });
    }
}

std::weak_ptr<VCameraHardware> VCameraHardware::WeakSelf()
{
    return std::static_pointer_cast<VCameraHardware>(shared_from_this());
}

} // namespace QuorixHost
