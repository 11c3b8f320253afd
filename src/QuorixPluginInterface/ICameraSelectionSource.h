#pragma once

#include "notification/IMultiCallback.h"

#include <cstdint>
#include <memory>
#include <vector>

class ICameraSelectionView;

/// The host's camera selection.
///
/// Threads: every operation may be called on any thread.
class ICameraSelectionSource
{
public:
    virtual ~ICameraSelectionSource() = default;

    virtual std::shared_ptr<ICameraSelectionView> GetView() = 0;

    /// Fires after each change of what passes the filter, on the thread that brought it.
    virtual KVR::IMultiCallback<void()>&
    GetSelectionChangedCallback(const std::vector<std::int32_t>& filter) = 0;
};
