#include "QuorixDataStore/StoreThread.h"

#include "DebugServices/ThreadName.h"
#include "utils/Mutex.h"

#include <map>
#include <utility>

namespace {

/// The names of the living threads. Never destroyed, since threads may end after `main`.
struct VThreadNames
{
    KVR::VMutex Mutex; // taken last: nothing else is taken under it
    std::map<std::uint64_t, std::string> Names KVR_GUARDED_BY(Mutex);
    std::uint64_t NextKey KVR_GUARDED_BY(Mutex) = 1;

    static VThreadNames& Instance()
    {
        static VThreadNames& names = *new VThreadNames;
        return names;
    }
};

/// Takes the thread's name off the list when the thread ends.
struct VThreadEnd
{
    std::uint64_t Key = 0;

    ~VThreadEnd()
    {
        VThreadNames& names = VThreadNames::Instance();
        const KVR::VMutexLock lock(names.Mutex);
        names.Names.erase(Key);
    }
};

} // namespace

namespace StoreThread {

std::uint64_t Register()
{
    std::string name = DebugServices::GetThreadName();
    VThreadNames& names = VThreadNames::Instance();
    {
        const KVR::VMutexLock lock(names.Mutex);
        threadKey = names.NextKey++;
        names.Names[threadKey] = std::move(name);
    }
    static thread_local VThreadEnd end;
    end.Key = threadKey;
    return threadKey;
}

void RefreshName()
{
    const std::uint64_t key = Key();
    std::string name = DebugServices::GetThreadName();
    VThreadNames& names = VThreadNames::Instance();
    const KVR::VMutexLock lock(names.Mutex);
    const auto found = names.Names.find(key);
    if (found != names.Names.end()) {
        found->second = std::move(name);
    }
}

std::string NameOf(std::uint64_t key)
{
    VThreadNames& names = VThreadNames::Instance();
    const KVR::VMutexLock lock(names.Mutex);
    const auto found = names.Names.find(key);
    return found != names.Names.end() ? found->second : "(a thread that has ended)";
}

} // namespace StoreThread
