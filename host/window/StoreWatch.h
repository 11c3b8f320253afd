#pragma once

#include "window/GuiSignal.h"

#include <cstdint>
#include <memory>

class VDataStore;
struct VDataListeners;

namespace QuorixHost {

/// Has a function called on the event loop after anything in the store has changed.
///
/// Owns: its place among the store's listeners. Threads: [gui], on which no reading view of the
/// store may be open while this object is made.
class VStoreWatch
{
public:
    VStoreWatch(std::shared_ptr<VDataStore> store, boost::function<void()> function);
    ~VStoreWatch();

    VStoreWatch(const VStoreWatch&) = delete;
    VStoreWatch& operator=(const VStoreWatch&) = delete;

private:
    const std::shared_ptr<VDataStore> store;
    const VGuiSignal changed;
    VDataListeners& listeners; // of the store above
    const std::uint64_t handle;
};

} // namespace QuorixHost
