#pragma once

#include "utils/Mutex.h"

#include <algorithm>
#include <memory>
#include <string>
#include <utility>
#include <vector>

namespace QuorixHost {

/// The registered providers of one kind with the names that each lists, in order of registration.
///
/// Threads: every operation [any]. The list is replaced as a whole and never changed, so that a
/// look-up costs the copy of one pointer under the lock, and no provider is released under it.
template <typename TProvider>
class VProviderList
{
public:
    void Add(std::shared_ptr<TProvider> provider, std::vector<std::wstring> names)
    {
        const KVR::VMutexLock lock(mutex);
        auto changed = std::make_shared<std::vector<VEntry>>(*entries);
        changed->push_back({std::move(provider), std::move(names)});
        entries = std::move(changed);
    }

    /// Takes back the first registration of the provider; an unknown one changes nothing.
    void Remove(const std::shared_ptr<TProvider>& provider)
    {
        std::shared_ptr<const std::vector<VEntry>> replaced; // released after the lock
        const KVR::VMutexLock lock(mutex);
        auto changed = std::make_shared<std::vector<VEntry>>(*entries);
        const auto found = std::find_if(changed->begin(), changed->end(), [&](const VEntry& entry) {
            return entry.provider == provider;
        });
        if (found == changed->end()) {
            return;
        }
        changed->erase(found);
        replaced = std::exchange(entries, std::move(changed));
    }

    /// @return the first provider that lists the name, empty where none does
    std::shared_ptr<TProvider> Find(const std::wstring& name) const
    {
        const auto present = Present();
        for (const VEntry& entry : *present) {
            if (std::find(entry.names.begin(), entry.names.end(), name) != entry.names.end()) {
                return entry.provider;
            }
        }
        return nullptr;
    }

    /// @return the names of all providers, one provider's behind the other's
    std::vector<std::wstring> Names() const
    {
        std::vector<std::wstring> names;
        const auto present = Present();
        for (const VEntry& entry : *present) {
            names.insert(names.end(), entry.names.begin(), entry.names.end());
        }
        return names;
    }

private:
    struct VEntry
    {
        std::shared_ptr<TProvider> provider;
        std::vector<std::wstring> names;
    };

    std::shared_ptr<const std::vector<VEntry>> Present() const
    {
        const KVR::VMutexLock lock(mutex);
        return entries;
    }

    mutable KVR::VMutex mutex;
    std::shared_ptr<const std::vector<VEntry>>
        entries KVR_GUARDED_BY(mutex) = std::make_shared<std::vector<VEntry>>();
};

} // namespace QuorixHost
