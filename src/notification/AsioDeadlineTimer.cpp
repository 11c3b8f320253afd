#include "notification/AsioDeadlineTimer.h"

#include "notification/GuardedCall.h"
#include "notification/MakeShared.h"

#include <boost/asio/deadline_timer.hpp>
#include <boost/asio/io_service.hpp>
#include <boost/date_time/posix_time/posix_time_types.hpp>

#include <utility>

namespace NotificationSystem {

/// The wait of a timer, and what it must not outlive.
struct VAsioDeadlineTimer::VWait
{
    // Whoever holds a weak timer may hold it longer than the service, so that it holds what its
    // wait needs. Empty for a strong one: the I/O service holds that, and not the other way.
    std::shared_ptr<boost::asio::io_service> IOService;
    boost::asio::deadline_timer Timer;
};

VAsioDeadlineTimer::VAsioDeadlineTimer(const std::shared_ptr<KVR::IAsioPostalService>& service,
                                       boost::function<void()> function, std::uint32_t delay,
                                       bool leftToOwner)
    : wait(new VWait{leftToOwner ? service->GetIOServicePtr() : nullptr,
                     boost::asio::deadline_timer(service->GetIOService())}),
      callback(std::move(function)),
      milliseconds(delay),
      weak(leftToOwner)
{
}

VAsioDeadlineTimer::~VAsioDeadlineTimer() = default;

void VAsioDeadlineTimer::OnCreated()
{
    const auto self = std::static_pointer_cast<VAsioDeadlineTimer>(shared_from_this());

    wait->Timer.expires_at(boost::posix_time::microsec_clock::universal_time() +
                           boost::posix_time::milliseconds(milliseconds));

    // Deliberate: neither handler looks at the error. A wait that was abandoned is told by the
    // timer being gone, and that alone.
    if (weak) {
        wait->Timer.async_wait(
            [target = std::weak_ptr<VAsioDeadlineTimer>(self)](const boost::system::error_code&) {
                if (const auto held = target.lock()) {
                    KVR::GuardedCall(held->callback);
                }
            });
    } else {
        wait->Timer.async_wait(
            [self](const boost::system::error_code&) { KVR::GuardedCall(self->callback); });
    }
}

std::shared_ptr<VAsioDeadlineTimer>
MakeDeadlineTimer(const std::shared_ptr<KVR::IAsioPostalService>& service,
                  boost::function<void()> function, std::uint32_t milliseconds)
{
    return KVR::MakeShared<VAsioDeadlineTimer>(service, std::move(function), milliseconds, true);
}

void StartDeadlineTimer(const std::shared_ptr<KVR::IAsioPostalService>& service,
                        boost::function<void()> function, std::uint32_t milliseconds)
{
    static_cast<void>(
        KVR::MakeShared<VAsioDeadlineTimer>(service, std::move(function), milliseconds, false));
}

} // namespace NotificationSystem
