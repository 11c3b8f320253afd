#pragma once

#include "notification/IAsioPostalService.h"
#include "utils/Mutex.h"

#include <atomic>
#include <cstdint>
#include <memory>
#include <string>
#include <vector>

namespace boost {
class thread;
} // namespace boost

namespace NotificationSystem {

/// A postal service on an I/O service and threads of its own.
///
/// Owns: the I/O service, and its threads while it is started. Stopping lets the threads finish
/// what is queued and pending, so an owner first cancels its accepts, reads and waits. Threads:
/// Post and the getters [any]. Start, Stop and the destructor [any], also within a function that
/// runs on the service, but not there and elsewhere at once: the one that joins holds the mutex
/// until that function has ended.
/// Failure: an exception that leaves a function is logged at level 2 and ends the thread that ran
/// it, and nothing else. Construction and Start throw what Boost throws where there is no room for
/// another I/O service or thread.
class VAsioPostalService : public KVR::IAsioPostalService
{
public:
    /// Starts the service: it runs when this returns.
    ///
    /// @param threadNames  stem of the thread names: "X" with two threads gives "X0" and "X1"
    /// @param threadCount  0 leaves the service stopped; what is posted waits in the queue
    /// @param unused       every caller passes 0, and nothing reads it
    VAsioPostalService(std::string threadNames, std::uint32_t threadCount, std::int32_t unused);

    VAsioPostalService(const VAsioPostalService&) = delete;
    VAsioPostalService& operator=(const VAsioPostalService&) = delete;

    void Post(boost::function<void()> function, std::uintptr_t token) override;

    /// Stops, and never throws. Functions still queued in a service without threads are freed
    /// uncalled.
    ~VAsioPostalService() override;

    boost::asio::io_service& GetIOService() override;
    std::shared_ptr<boost::asio::io_service> GetIOServicePtr() override;

    /// Starts the threads, which begin with what was posted since the last stop.
    ///
    /// @return false, with nothing changed, if the service is started or `threadCount` is 0. If it
    /// throws, the service is stopped.
    bool Start(std::uint32_t threadCount);

    /// Lets the threads end once all that is queued and pending is done, and waits for each but the
    /// caller's own, which ends by itself after its function has returned and the queue is empty.
    ///
    /// @return false, with nothing changed, if the service is stopped
    bool Stop();

private:
    class VWork;

    void EndThreads() KVR_REQUIRES(mutex);

    // Released in reverse: the threads first, so that none can be met half destroyed. A thread that
    // is still running, because this object is destroyed by it, holds its own references.
    KVR::VMutex mutex;
    const std::string name;
    [[maybe_unused]] const std::int32_t option;
    const std::shared_ptr<boost::asio::io_service> ioService;
    std::shared_ptr<VWork> work KVR_GUARDED_BY(mutex); // present exactly while started
    std::vector<boost::thread> threads KVR_GUARDED_BY(mutex);
    // How often the service was started. A thread left over from an earlier start sees by it that
    // others have taken its place.
    const std::shared_ptr<std::atomic<std::uint32_t>> starts;
};

} // namespace NotificationSystem
