#pragma once

#include <gtest/gtest.h>

#include <chrono>
#include <condition_variable>
#include <functional>
#include <mutex>
#include <thread>
#include <utility>

namespace StoreTest {

constexpr std::chrono::seconds generousLimit{60};

/// A thread that does what it is told, one thing after the other.
class VWorkerThread
{
public:
    VWorkerThread() : thread([this] { Run(); }) {}

    ~VWorkerThread()
    {
        {
            const std::lock_guard<std::mutex> lock(mutex);
            stop = true;
        }
        changed.notify_all();
        thread.join();
    }

    VWorkerThread(const VWorkerThread&) = delete;
    VWorkerThread& operator=(const VWorkerThread&) = delete;

    /// Begins a task and returns at once.
    void Start(std::function<void()> next)
    {
        {
            const std::lock_guard<std::mutex> lock(mutex);
            task = std::move(next);
            busy = true;
        }
        changed.notify_all();
    }

    /// Waits for the task to end. @return false if that takes unreasonably long
    bool Finish()
    {
        std::unique_lock<std::mutex> lock(mutex);
        return changed.wait_for(lock, generousLimit, [this] { return !busy; });
    }

    /// Does a task and waits for its end.
    void Do(std::function<void()> next)
    {
        Start(std::move(next));
        ASSERT_TRUE(Finish());
    }

    bool Busy()
    {
        const std::lock_guard<std::mutex> lock(mutex);
        return busy;
    }

private:
    void Run()
    {
        std::unique_lock<std::mutex> lock(mutex);
        for (;;) {
            changed.wait(lock, [this] { return stop || task; });
            if (!task) {
                return;
            }
            const std::function<void()> current = std::exchange(task, nullptr);
            lock.unlock();
            current();
            lock.lock();
            busy = false;
            changed.notify_all();
        }
    }

    std::mutex mutex;
    std::condition_variable changed;
    std::function<void()> task;
    bool busy = false;
    bool stop = false;
    std::thread thread; // last: it uses the rest
};

/// Waits until a condition holds that another thread brings about without a signal.
inline bool Eventually(const std::function<bool()>& condition)
{
    const auto limit = std::chrono::steady_clock::now() + generousLimit;
    while (!condition()) {
        if (std::chrono::steady_clock::now() > limit) {
            return false;
        }
        std::this_thread::yield();
    }
    return true;
}

} // namespace StoreTest
