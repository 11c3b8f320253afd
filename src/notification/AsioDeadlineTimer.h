#pragma once

#include "notification/IAsioPostalService.h"
#include "notification/Shared.h"

#include <boost/function.hpp>

#include <cstdint>
#include <memory>

namespace NotificationSystem {

/// Calls a function once, on a thread of a postal service, after a time.
///
/// Counts on the system's time: when that is set, a wait becomes longer or shorter. There is no
/// repetition; whoever wants another expiry makes another timer.
/// Threads: made and released on any. Failure: an exception of the function ends the thread of the
/// service that ran it, as for any posted function.
class VAsioDeadlineTimer : public KVR::VShared
{
public:
    /// Called by `MakeDeadlineTimer` and `StartDeadlineTimer` only.
    ///
    /// @param service      never null
    /// @param delay        in milliseconds
    /// @param leftToOwner  whether its owner keeps the timer alive; otherwise the wait does
    VAsioDeadlineTimer(const std::shared_ptr<KVR::IAsioPostalService>& service,
                       boost::function<void()> function, std::uint32_t delay, bool leftToOwner);

    VAsioDeadlineTimer(const VAsioDeadlineTimer&) = delete;
    VAsioDeadlineTimer& operator=(const VAsioDeadlineTimer&) = delete;

    /// Abandons the wait.
    ~VAsioDeadlineTimer() override;

protected:
    /// Starts the wait.
    void OnCreated() override;

private:
    struct VWait;

    const std::unique_ptr<VWait> wait;
    const boost::function<void()> callback;
    const std::uint32_t milliseconds;
    const bool weak;
};

/// Makes a timer that lives as long as the caller holds it: dropping the last reference before the
/// expiry means that the function never runs. The reference may outlive the service. [any]
///
/// @param service   never null
/// @param function  bound weakly where its target may die first
std::shared_ptr<VAsioDeadlineTimer>
MakeDeadlineTimer(const std::shared_ptr<KVR::IAsioPostalService>& service,
                  boost::function<void()> function, std::uint32_t milliseconds);

/// Starts a timer that lives until it has fired, although nobody holds it. [any]
///
/// @param service  never null
void StartDeadlineTimer(const std::shared_ptr<KVR::IAsioPostalService>& service,
                        boost::function<void()> function, std::uint32_t milliseconds);

/// What makes weak timers, in the form in which a class takes it, so that its tests can fire at
/// will. The reference returned keeps the timer alive; `MakeDeadlineTimer` is one.
typedef boost::function<std::shared_ptr<void>(
    const std::shared_ptr<KVR::IAsioPostalService>& service, boost::function<void()> function,
    std::uint32_t milliseconds)>
    VDeadlineTimerFactory;

} // namespace NotificationSystem
