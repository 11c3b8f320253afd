#pragma once

#include "QuorixPluginInterface/SelectionEntry.h"

#include <cstdint>
#include <vector>

/// Reads and replaces the host's selection.
///
/// Threads: every operation may be called on any thread.
class ICameraSelectionView
{
public:
    virtual ~ICameraSelectionView() = default;

    /// Replaces `entries` with the selected ones that pass the filter. Cameras pass {1}.
    virtual void GetSelection(const std::vector<std::int32_t>& filter,
                              std::vector<VSelectionEntry>& entries) = 0;

    /// Replaces the selection; an empty one clears it.
    virtual void SetSelection(const std::vector<VSelectionEntry>& selection,
                              const std::vector<std::int32_t>& filter) = 0;
};
