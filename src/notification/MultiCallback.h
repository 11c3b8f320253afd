#pragma once

#include "notification/GuardedCall.h"
#include "notification/IMultiCallback.h"
#include "utils/Mutex.h"

#include <boost/container/small_vector.hpp>

#include <algorithm>
#include <atomic>
#include <cstdint>
#include <memory>
#include <utility>
#include <vector>

namespace NotificationSystem {

template <typename Sig>
class VMultiCallback;

template <typename Sig>
class VMultiCallbackPostal;

/// A list of functions that is called in order of adding, on the caller's thread. A function goes
/// by itself at the first call after its weak target has gone.
///
/// Threads: every operation [any]. The mutex guards the list only: functions are called, copied and
/// destroyed without it, since each of these may come back here. A call runs the list as it stood
/// when the call began, also to its end where one of its functions destroys this object.
/// Failure: an exception of a function passes to whoever called, and those after it do not run.
template <typename R, typename... Args>
class VMultiCallback<R(Args...)> : public KVR::IMultiCallback<R(Args...)>
{
public:
    typedef R Sig(Args...);

    VMultiCallback() = default;
    VMultiCallback(const VMultiCallback&) = delete;
    VMultiCallback& operator=(const VMultiCallback&) = delete;

    ~VMultiCallback() override
    {
        for (const VEntry& entry : entries) {
            entry->InList = false;
        }
    }

    std::uint64_t Add(boost::function<Sig> function) override
    {
        return Append(std::make_shared<VStored>(std::move(function)));
    }

    std::size_t Remove(std::uint64_t handle) override { return Take(handle) ? 1 : 0; }

    std::size_t Clear() override { return TakeAll().size(); }

    std::size_t Count() const override
    {
        KVR::VMutexLock lock(mutex);
        return entries.size();
    }

    /// Calls every function. @return whether at least one of them had a live target
    bool operator()(Args... arguments)
    {
        if (count.load(std::memory_order_acquire) == 0) {
            return false; // most lists of most objects are empty: that costs no lock
        }
        const VSnapshot called = Entries(); // keeps the handles of removed ones unused
        std::vector<VEntry> dead;
        for (const VEntry& entry : called) {
            if (!KVR::GuardedCall(*entry, arguments...)) {
                dead.push_back(entry);
            }
        }
        for (const VEntry& entry : dead) {
            if (entry->InList) { // else there may be no list any more
                Remove(HandleOf(entry));
            }
        }
        return dead.size() < called.size();
    }

private:
    friend class VMultiCallbackPostal<Sig>;

    /// A function, which a running call keeps although its list may be gone.
    struct VStored : boost::function<Sig>
    {
        explicit VStored(boost::function<Sig> added) : boost::function<Sig>(std::move(added)) {}

        std::atomic<bool> InList{true}; // false once the list is destroyed
    };

    typedef std::shared_ptr<VStored> VEntry;
    typedef boost::container::small_vector<VEntry, 4> VSnapshot; // most lists are short

    static std::uint64_t HandleOf(const VEntry& entry)
    {
        return reinterpret_cast<std::uintptr_t>(entry.get());
    }

    VSnapshot Entries() const
    {
        KVR::VMutexLock lock(mutex);
        return VSnapshot(entries.begin(), entries.end());
    }

    std::uint64_t Append(VEntry entry)
    {
        const std::uint64_t handle = HandleOf(entry);
        KVR::VMutexLock lock(mutex);
        entries.push_back(std::move(entry));
        count.store(entries.size(), std::memory_order_release);
        return handle;
    }

    /// @return the entry taken out, or null; the caller lets go of it once it holds no lock
    VEntry Take(std::uint64_t handle)
    {
        KVR::VMutexLock lock(mutex);
        const auto found =
            std::find_if(entries.begin(), entries.end(),
                         [handle](const VEntry& entry) { return HandleOf(entry) == handle; });
        if (found == entries.end()) {
            return nullptr;
        }
        VEntry taken = std::move(*found);
        entries.erase(found);
        count.store(entries.size(), std::memory_order_release);
        return taken;
    }

    /// @return all entries, which the caller lets go of once it holds no lock
    std::vector<VEntry> TakeAll()
    {
        KVR::VMutexLock lock(mutex);
        count.store(0, std::memory_order_release);
        return std::exchange(entries, {});
    }

    mutable KVR::VMutex mutex;
    std::vector<VEntry> entries KVR_GUARDED_BY(mutex); // in order of adding
    std::atomic<std::size_t> count{0};                 // of entries; written with the mutex held
};

} // namespace NotificationSystem
