#pragma once

#include "QuorixPluginInterface/ICameraSelectionSource.h"
#include "QuorixPluginInterface/ICameraSelectionView.h"

#include <memory>
#include <vector>

namespace QuorixHost {

/// The host's selection of cameras.
///
/// An entry need not name a camera that exists: one that goes and comes back is still selected. A
/// filter that holds 1 means cameras, and nothing else can be selected here.
/// Owns: the selection, together with the views that it has given out.
/// Threads: every operation [any]. The notification runs with no lock held, one at a time and in
/// the order of the changes: what is changed while one runs is notified behind it, on its thread.
/// Failure: what a function of the notification throws is logged.
class VCameraSelection : public ICameraSelectionSource
{
public:
    VCameraSelection();
    ~VCameraSelection() override;

    VCameraSelection(const VCameraSelection&) = delete;
    VCameraSelection& operator=(const VCameraSelection&) = delete;

    std::shared_ptr<ICameraSelectionView> GetView() override;

    /// A selection that is replaced by the same one is no change.
    KVR::IMultiCallback<void()>&
    GetSelectionChangedCallback(const std::vector<std::int32_t>& filter) override;

    /// The filter for cameras.
    static const std::vector<std::int32_t>& CameraFilter();

private:
    class VSelection;

    const std::shared_ptr<VSelection> view;
};

} // namespace QuorixHost
