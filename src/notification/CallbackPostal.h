#pragma once

#include "notification/CallableSharedPtr.h"
#include "notification/Callback.h"
#include "notification/ICallbackPostal.h"
#include "utils/Mutex.h"

#include <boost/bind/bind.hpp>

#include <memory>
#include <utility>

namespace NotificationSystem {

template <typename Sig>
class VCallbackPostal;

/// Keeps one function and calls it on the caller's thread or by way of a postal service.
///
/// A posted call carries copies of its arguments, and calls what is stored when it is delivered.
/// Threads: every operation [any]. No function is called, copied or destroyed, no service posted to
/// or released under the mutex, since each of these may come back here.
/// Failure: an exception of a function that is called directly passes to whoever called.
template <typename R, typename... Args>
class VCallbackPostal<R(Args...)> : public KVR::ICallbackPostal<R(Args...)>
{
public:
    typedef R Sig(Args...);

    /// @param postalService  delivers what comes by `Set`; empty for the caller's thread
    explicit VCallbackPostal(std::shared_ptr<KVR::IPostalService> postalService = nullptr)
        : defaultService(std::move(postalService))
    {
    }

    VCallbackPostal(const VCallbackPostal&) = delete;
    VCallbackPostal& operator=(const VCallbackPostal&) = delete;

    void Set(boost::function<Sig> function) override
    {
        Store(std::make_shared<VStored>(std::move(function)), defaultService);
    }

    std::size_t Clear() override
    {
        std::shared_ptr<KVR::IPostalService> oldService; // both go after the lock
        std::shared_ptr<VInner> oldInner;
        {
            KVR::VMutexLock lock(mutex);
            oldService.swap(service);
            oldInner.swap(inner);
        }
        // Cleared and not only dropped: a posted call that is still on its way holds it too.
        return oldInner ? oldInner->Clear() : 0;
    }

    bool IsSet() const override
    {
        KVR::VMutexLock lock(mutex);
        return inner && inner->IsSet();
    }

    void SetOn(boost::function<Sig> function,
               std::shared_ptr<KVR::IPostalService> postalService) override
    {
        Store(std::make_shared<VStored>(std::move(function)), std::move(postalService));
    }

    void SetDirect(boost::function<Sig> function) override
    {
        Store(std::make_shared<VStored>(std::move(function)), nullptr);
    }

    /// Calls the function, or posts the call.
    ///
    /// @return false if there is none, or if its target is gone as far as this thread can tell
    bool operator()(Args... arguments)
    {
        std::shared_ptr<VInner> called;
        std::shared_ptr<KVR::IPostalService> calledService;
        if (!CopyIfSet(called, calledService)) {
            return false;
        }
        if (!calledService) {
            return (*called)(std::forward<Args>(arguments)...);
        }
        calledService->Post(
            boost::bind(VCallableSharedPtr<bool, VInner>(called), std::forward<Args>(arguments)...),
            0);
        return called->IsSet();
    }

private:
    typedef VCallback<Sig> VInner;
    typedef typename VInner::VStored VStored;

    void Store(std::shared_ptr<VStored> function, std::shared_ptr<KVR::IPostalService> newService)
    {
        std::shared_ptr<VStored> old; // goes after the lock, as the old service does

        KVR::VMutexLock lock(mutex);
        if (!inner) {
            inner = std::make_shared<VInner>();
        }
        service.swap(newService);
        old = inner->Replace(std::move(function));
    }

    bool CopyIfSet(std::shared_ptr<VInner>& called,
                   std::shared_ptr<KVR::IPostalService>& calledService)
    {
        std::shared_ptr<VInner> emptied;

        KVR::VMutexLock lock(mutex);
        if (inner && !inner->IsSet()) {
            emptied.swap(inner);
        }
        called = inner;
        calledService = service;
        return called != nullptr;
    }

    mutable KVR::VMutex mutex; // lock order: this one, then the inner callback's
    const std::shared_ptr<KVR::IPostalService> defaultService;
    std::shared_ptr<KVR::IPostalService> service KVR_GUARDED_BY(mutex);
    std::shared_ptr<VInner> inner KVR_GUARDED_BY(mutex); // made on first use
};

} // namespace NotificationSystem
