#pragma once

#include "support/RawClient.h"

#include <chrono>
#include <condition_variable>
#include <mutex>
#include <stdexcept>
#include <thread>
#include <utility>
#include <vector>

/// What arrives on other threads, in order, for a test to wait for.
template <typename T>
class VArrivals
{
public:
    void Add(T arrived)
    {
        const std::lock_guard<std::mutex> lock(mutex);
        all.push_back(std::move(arrived));
        added.notify_all();
    }

    /// Waits until there are at least so many, and returns all. Throws at the time limit.
    std::vector<T> Wait(std::size_t count)
    {
        std::unique_lock<std::mutex> lock(mutex);
        if (!added.wait_for(lock, TestSupport::VRawClient::Limit,
                            [&] { return all.size() >= count; })) {
            throw std::runtime_error("not enough has arrived within the time limit");
        }
        return all;
    }

    std::vector<T> All() const
    {
        const std::lock_guard<std::mutex> lock(mutex);
        return all;
    }

private:
    mutable std::mutex mutex;
    std::condition_variable added;
    std::vector<T> all;
};

/// A gate that threads wait at until it is opened.
class VLatch
{
public:
    void Open()
    {
        const std::lock_guard<std::mutex> lock(mutex);
        open = true;
        opened.notify_all();
    }

    /// Throws at the time limit.
    void Wait()
    {
        std::unique_lock<std::mutex> lock(mutex);
        if (!opened.wait_for(lock, TestSupport::VRawClient::Limit, [&] { return open; })) {
            throw std::runtime_error("a latch was not opened within the time limit");
        }
    }

private:
    std::mutex mutex;
    std::condition_variable opened;
    bool open = false;
};

/// Looks again and again, for what nobody tells, such as the end of a weak reference.
///
/// @return false at the time limit
template <typename Condition>
bool BecomesTrue(const Condition& condition)
{
    const auto deadline = std::chrono::steady_clock::now() + TestSupport::VRawClient::Limit;
    while (!condition()) {
        if (std::chrono::steady_clock::now() > deadline) {
            return false;
        }
        std::this_thread::yield();
    }
    return true;
}
