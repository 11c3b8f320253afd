#include "MainThreadPostalService.h"

#include "notification/GuardedCall.h"
#include "utils/LogStatement.h"

#include <cstddef>
#include <exception>
#include <utility>

namespace QuorixHost {
namespace {

/// Calls a posted function. No exception may pass through the event loop above.
void CallPosted(const boost::function<void()>& function)
{
    try {
        static_cast<void>(KVR::GuardedCall(function));
    } catch (const std::exception& exception) {
        KVR_LOG("Host", 2, "A posted function failed: %1%", exception.what());
    } catch (...) {
        KVR_LOG("Host", 2, "A posted function failed with an unknown exception");
    }
}

} // namespace

VMainThreadPostalService::VMainThreadPostalService()
    : wakeUp(std::make_unique<VMainThreadWakeUp>([this] { Deliver(); }))
{
}

VMainThreadPostalService::~VMainThreadPostalService() = default;

void VMainThreadPostalService::Post(boost::function<void()> function, std::uintptr_t /*token*/)
{
    const KVR::VMutexLock lock(mutex);
    if (wakeUp) {
        waiting.push_back(std::move(function));
        wakeUp->Wake();
    }
}

void VMainThreadPostalService::Close()
{
    // Both are freed after the lock: a function's destructor may post.
    std::deque<boost::function<void()>> dropped;
    std::unique_ptr<VMainThreadWakeUp> closed;
    const KVR::VMutexLock lock(mutex);
    dropped.swap(waiting);
    closed.swap(wakeUp);
}

void VMainThreadPostalService::Deliver()
{
    if (delivering) {
        return; // a loop inside a posted function: the delivery outside goes on with the queue
    }

    delivering = true;
    boost::function<void()> function;
    // Only those that wait now, so that functions which post themselves again leave the loop its
    // turns.
    for (std::size_t left = CountWaiting(); left > 0 && TakeFirst(function); --left) {
        CallPosted(function);
        function.clear();
    }
    delivering = false;
    WakeForTheRest();
}

std::size_t VMainThreadPostalService::CountWaiting()
{
    const KVR::VMutexLock lock(mutex);
    return waiting.size();
}

void VMainThreadPostalService::WakeForTheRest()
{
    const KVR::VMutexLock lock(mutex);
    if (wakeUp && !waiting.empty()) {
        wakeUp->Wake();
    }
}

bool VMainThreadPostalService::TakeFirst(boost::function<void()>& function)
{
    const KVR::VMutexLock lock(mutex);
    if (waiting.empty()) {
        return false;
    }
    function = std::move(waiting.front());
    waiting.pop_front();
    return true;
}

} // namespace QuorixHost
