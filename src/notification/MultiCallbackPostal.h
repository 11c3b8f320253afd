#pragma once

#include "notification/CallableSharedPtr.h"
#include "notification/IMultiCallbackPostal.h"
#include "notification/MultiCallback.h"
#include "utils/Mutex.h"

#include <boost/bind/bind.hpp>

#include <cstdint>
#include <iterator>
#include <map>
#include <memory>
#include <utility>
#include <vector>

namespace NotificationSystem {

template <typename Sig>
class VMultiCallbackPostal;

/// A list of functions, grouped by the postal service that delivers them.
///
/// A group runs in order of adding, on one thread. The direct group runs within the call, before
/// posted ones are even posted; a posted call carries copies of its arguments and reads its group
/// when it is delivered.
/// Threads: every operation [any]. No function is called, copied or destroyed, no service posted to
/// or released under the mutex, since each of these may come back here.
/// Failure: an exception of a direct function passes to whoever called; nothing is posted then.
template <typename R, typename... Args>
class VMultiCallbackPostal<R(Args...)> : public KVR::IMultiCallbackPostal<R(Args...)>
{
public:
    typedef R Sig(Args...);

    /// @param postalService  delivers what comes by `Add`; empty for the caller's thread
    explicit VMultiCallbackPostal(std::shared_ptr<KVR::IPostalService> postalService = nullptr)
        : defaultService(std::move(postalService))
    {
    }

    VMultiCallbackPostal(const VMultiCallbackPostal&) = delete;
    VMultiCallbackPostal& operator=(const VMultiCallbackPostal&) = delete;

    std::uint64_t Add(boost::function<Sig> function) override
    {
        return AddOn(std::move(function), defaultService);
    }

    std::size_t Remove(std::uint64_t handle) override
    {
        std::vector<typename VGroup::VEntry> removed; // goes after the lock, as the groups do
        std::vector<typename VGroups::node_type> erased;

        KVR::VMutexLock lock(mutex);
        for (const auto& [service, group] : groups) {
            if (typename VGroup::VEntry entry = group->Take(handle)) {
                removed.push_back(std::move(entry));
            }
        }
        erased = ExtractEmptyGroups();
        return removed.size();
    }

    std::size_t Clear() override
    {
        VGroups cleared;
        {
            KVR::VMutexLock lock(mutex);
            cleared.swap(groups);
        }
        std::size_t count = 0;
        for (const auto& [service, group] : cleared) {
            // Cleared and not only dropped: a posted call that is still on its way holds it too.
            count += group->Clear();
        }
        return count;
    }

    std::size_t Count() const override
    {
        KVR::VMutexLock lock(mutex);
        std::size_t count = 0;
        for (const auto& [service, group] : groups) {
            count += group->Count();
        }
        return count;
    }

    std::uint64_t AddOn(boost::function<Sig> function,
                        std::shared_ptr<KVR::IPostalService> postalService) override
    {
        auto entry = std::make_shared<typename VGroup::VStored>(std::move(function));

        // Filed in one hold of the mutex: a call would erase a group that is still empty.
        KVR::VMutexLock lock(mutex);
        std::shared_ptr<VGroup>& group = groups[postalService];
        if (!group) {
            group = std::make_shared<VGroup>();
        }
        return group->Append(std::move(entry));
    }

    std::uint64_t AddDirect(boost::function<Sig> function) override
    {
        return AddOn(std::move(function), nullptr);
    }

    /// Calls the direct group and posts the others, in the order of their services' addresses.
    ///
    /// @return whether a direct function had a live target or a posted group still has entries
    bool operator()(Args... arguments)
    {
        bool live = false;
        for (const auto& [service, group] : LiveGroups()) {
            if (!service) {
                live = (*group)(arguments...) || live;
                continue;
            }
            service->Post(boost::bind(VCallableSharedPtr<bool, VGroup>(group), arguments...), 0);
            live = group->Count() != 0 || live;
        }
        return live;
    }

private:
    typedef VMultiCallback<Sig> VGroup;
    // By the address of the service; the empty key, the first of all, is direct delivery.
    typedef std::map<std::shared_ptr<KVR::IPostalService>, std::shared_ptr<VGroup>> VGroups;

    VGroups LiveGroups()
    {
        std::vector<typename VGroups::node_type> erased; // goes after the lock

        KVR::VMutexLock lock(mutex);
        erased = ExtractEmptyGroups();
        return groups;
    }

    /// @return the groups without entries, which the caller lets go of once it holds no lock: a
    /// reference to a service may be the last one
    std::vector<typename VGroups::node_type> ExtractEmptyGroups() KVR_REQUIRES(mutex)
    {
        std::vector<typename VGroups::node_type> erased;
        for (auto group = groups.begin(); group != groups.end();) {
            const auto next = std::next(group);
            if (group->second->Count() == 0) {
                erased.push_back(groups.extract(group));
            }
            group = next;
        }
        return erased;
    }

    mutable KVR::VMutex mutex; // lock order: this one, then a group's
    const std::shared_ptr<KVR::IPostalService> defaultService;
    VGroups groups KVR_GUARDED_BY(mutex);
};

} // namespace NotificationSystem
