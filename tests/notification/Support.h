#pragma once

#include "notification/GuardedCall.h"
#include "notification/IPostalService.h"
#include "support/VirtualSlot.h"

#include <boost/function.hpp>
#include <gtest/gtest.h>

#include <chrono>
#include <condition_variable>
#include <cstdint>
#include <deque>
#include <functional>
#include <memory>
#include <mutex>
#include <utility>
#include <vector>

namespace NotificationTest {

/// What a test waits for. The limit is far beyond any delay, and ends a test that would hang.
class VLatch
{
public:
    explicit VLatch(int events = 1) : missing(events) {}

    void CountDown()
    {
        // Notified under the mutex: the waiting side may destroy the latch at once.
        const std::lock_guard<std::mutex> lock(mutex);
        --missing;
        reached.notify_all();
    }

    /// @return whether every event came
    bool Wait()
    {
        std::unique_lock<std::mutex> lock(mutex);
        return reached.wait_for(lock, std::chrono::seconds(60), [this] { return missing <= 0; });
    }

private:
    std::mutex mutex;
    std::condition_variable reached;
    int missing;
};

/// Runs an action when it is destroyed. Held by a stored function, it tells when that goes.
class VLastWord
{
public:
    explicit VLastWord(std::function<void()> word) : action(std::move(word)) {}
    ~VLastWord() { action(); }

    VLastWord(const VLastWord&) = delete;
    VLastWord& operator=(const VLastWord&) = delete;

private:
    const std::function<void()> action;
};

/// Runs an action when the thread that called it ends.
inline void AtEndOfThisThread(std::function<void()> action)
{
    thread_local std::vector<std::unique_ptr<VLastWord>> actions;
    actions.push_back(std::make_unique<VLastWord>(std::move(action)));
}

/// A postal service without a thread: delivers when it is told to.
class VManualPostalService : public KVR::IPostalService
{
public:
    explicit VManualPostalService(std::function<void()> atEnd = [] {}) : lastWord(std::move(atEnd))
    {
    }

    void Post(boost::function<void()> function, std::uintptr_t token) override
    {
        Queue.push_back(std::move(function));
        Tokens.push_back(token);
    }

    /// Delivers everything, also what is posted meanwhile. @return how many functions were called
    int Deliver()
    {
        int delivered = 0;
        for (; !Queue.empty(); ++delivered) {
            const boost::function<void()> function = std::move(Queue.front());
            Queue.pop_front();
            KVR::GuardedCall(function);
        }
        return delivered;
    }

    std::deque<boost::function<void()>> Queue;
    std::vector<std::uintptr_t> Tokens;

private:
    VLastWord lastWord;
};

/// A postal service that delivers within `Post`.
class VImmediatePostalService : public KVR::IPostalService
{
public:
    void Post(boost::function<void()> function, std::uintptr_t) override
    {
        KVR::GuardedCall(function);
    }
};

/// Waits until a service has done everything that was posted to it before. With several threads the
/// other ones may still be busy.
inline void PostAndWait(KVR::IPostalService& service)
{
    VLatch reached;
    service.Post([&reached] { reached.CountDown(); }, 0);
    ASSERT_TRUE(reached.Wait());
}

using TestSupport::destructorSlots;
using TestSupport::SlotOf;

} // namespace NotificationTest
