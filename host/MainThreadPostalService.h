#pragma once

#include "MainThreadWakeUp.h"
#include "notification/IPostalService.h"
#include "utils/Mutex.h"

#include <boost/function.hpp>

#include <cstddef>
#include <cstdint>
#include <deque>
#include <memory>

namespace QuorixHost {

/// Delivers posted functions on the main thread's event loop, first in, first out.
///
/// A function that spins a loop of its own, as an open dialog does, holds up those behind it: they
/// are never delivered inside another. Threads: Post [any]; made, closed and delivering [gui]; the
/// last reference may be dropped on any thread once the service is closed.
/// Failure: an exception of a posted function is logged, and the next one is delivered.
class VMainThreadPostalService : public KVR::IPostalService
{
public:
    VMainThreadPostalService();
    ~VMainThreadPostalService() override;

    /// Queues a function; after Close it is dropped. The token travels with nobody.
    void Post(boost::function<void()> function, std::uintptr_t token) override;

    /// Ends delivering, once the event loop has ended. What still waits is freed without being
    /// called.
    void Close();

private:
    void Deliver();
    std::size_t CountWaiting();
    void WakeForTheRest();
    bool TakeFirst(boost::function<void()>& function);

    KVR::VMutex mutex;
    std::deque<boost::function<void()>> waiting KVR_GUARDED_BY(mutex);
    std::unique_ptr<VMainThreadWakeUp> wakeUp KVR_GUARDED_BY(mutex); // empty once closed
    bool delivering = false;                                         // [gui] only
};

} // namespace QuorixHost
