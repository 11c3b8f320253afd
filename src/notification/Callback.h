#pragma once

#include "notification/GuardedCall.h"
#include "notification/ICallback.h"
#include "utils/Mutex.h"

#include <memory>
#include <utility>

namespace NotificationSystem {

template <typename Sig>
class VCallback;

template <typename Sig>
class VCallbackPostal;

/// Keeps one function and calls it on the caller's thread. The function goes by itself at the first
/// call after its weak target has gone.
///
/// Threads: every operation [any]. The mutex guards the field only: functions are called, copied
/// and destroyed without it, since each of these may come back here. Failure: an exception of the
/// function passes to whoever called.
template <typename R, typename... Args>
class VCallback<R(Args...)> : public KVR::ICallback<R(Args...)>
{
public:
    typedef R Sig(Args...);

    VCallback() = default;
    VCallback(const VCallback&) = delete;
    VCallback& operator=(const VCallback&) = delete;

    void Set(boost::function<Sig> function) override
    {
        Replace(std::make_shared<VStored>(std::move(function)));
    }

    std::size_t Clear() override { return Replace(nullptr) ? 1 : 0; }

    bool IsSet() const override
    {
        KVR::VMutexLock lock(mutex);
        return stored != nullptr;
    }

    /// Calls the function. @return false if there is none, or if its target is gone
    bool operator()(Args... arguments)
    {
        const std::shared_ptr<VStored> called = Stored();
        if (!called) {
            return false;
        }
        if (!KVR::GuardedCall(*called, std::forward<Args>(arguments)...)) {
            ClearIfStill(called);
            return false;
        }
        return true;
    }

private:
    friend class VCallbackPostal<Sig>;

    typedef boost::function<Sig> VStored;

    std::shared_ptr<VStored> Stored() const
    {
        KVR::VMutexLock lock(mutex);
        return stored;
    }

    /// @return what was stored, which the caller lets go of once it holds no lock
    std::shared_ptr<VStored> Replace(std::shared_ptr<VStored> function)
    {
        KVR::VMutexLock lock(mutex);
        stored.swap(function);
        return function;
    }

    /// A function that was set while the dead one was being called stays.
    void ClearIfStill(const std::shared_ptr<VStored>& called)
    {
        KVR::VMutexLock lock(mutex);
        if (stored == called) {
            stored.reset(); // destroys nothing here, as the caller holds it too
        }
    }

    mutable KVR::VMutex mutex;
    std::shared_ptr<VStored> stored KVR_GUARDED_BY(mutex);
};

} // namespace NotificationSystem
