#include "window/StoreWatch.h"

#include "QuorixDataStore/DataListeners.h"
#include "QuorixDataStore/DataStore.h"
#include "QuorixDataStore/DataWriter.h"

#include <utility>

namespace QuorixHost {
namespace {

/// Returns the listeners that hear of every item.
VDataListeners& ListenersToAll(VDataStore& store)
{
    VDataWriter writer(store);
    return writer.GetListeners(VDataPath{"*"});
}

} // namespace

VStoreWatch::VStoreWatch(std::shared_ptr<VDataStore> watched, boost::function<void()> function)
    : store(std::move(watched)),
      changed(std::move(function)),
      listeners(ListenersToAll(*store)),
      handle(listeners.OnAnyChange.Add(changed.Waker()))
{
}

VStoreWatch::~VStoreWatch()
{
    listeners.OnAnyChange.Remove(handle);
}

} // namespace QuorixHost
