#include "cameras/CameraSelection.h"

#include "notification/MultiCallback.h"
#include "utils/LogStatement.h"
#include "utils/Mutex.h"

#include <algorithm>
#include <cstddef>
#include <exception>
#include <string>

namespace QuorixHost {
namespace {

constexpr std::int32_t cameras = 1;

bool MeansCameras(const std::vector<std::int32_t>& filter)
{
    return std::find(filter.begin(), filter.end(), cameras) != filter.end();
}

bool AreEqual(const VSelectionEntry& left, const VSelectionEntry& right)
{
    std::string leftId;
    std::string rightId;
    return left.GetDeviceId(leftId) == right.GetDeviceId(rightId) && leftId == rightId;
}

} // namespace

/// The selection, which is its own view.
class VCameraSelection::VSelection : public ICameraSelectionView
{
public:
    void GetSelection(const std::vector<std::int32_t>& filter,
                      std::vector<VSelectionEntry>& entries) override
    {
        entries.clear();
        if (MeansCameras(filter)) {
            const KVR::VMutexLock lock(mutex);
            entries = selected;
        }
    }

    void SetSelection(const std::vector<VSelectionEntry>& selection,
                      const std::vector<std::int32_t>& filter) override
    {
        if (!MeansCameras(filter)) {
            return;
        }
        {
            const KVR::VMutexLock lock(mutex);
            if (std::equal(selected.begin(), selected.end(), selection.begin(), selection.end(),
                           &AreEqual)) {
                return;
            }
            selected = selection;
            ++unnotified;
            if (notifying) {
                return; // whoever does it goes on with this one
            }
            notifying = true;
        }
        NotifyAll();
    }

    NotificationSystem::VMultiCallback<void()> Changed;
    NotificationSystem::VMultiCallback<void()> NeverChanged; // of what cannot be selected

private:
    void NotifyAll()
    {
        while (TakeUnnotified()) {
            try {
                Changed();
            } catch (const std::exception& exception) {
                KVR_LOG("Host", 2, "A listener to the selection failed: %1%", exception.what());
            } catch (...) {
                KVR_LOG("Host", 2, "A listener to the selection failed with an unknown exception");
            }
        }
    }

    bool TakeUnnotified()
    {
        const KVR::VMutexLock lock(mutex);
        notifying = unnotified > 0;
        unnotified -= notifying ? 1 : 0;
        return notifying;
    }

    KVR::VMutex mutex;
    std::vector<VSelectionEntry> selected KVR_GUARDED_BY(mutex);
    std::size_t unnotified KVR_GUARDED_BY(mutex) = 0; // changes
    bool notifying KVR_GUARDED_BY(mutex) = false;
};

VCameraSelection::VCameraSelection() : view(std::make_shared<VSelection>()) {}

VCameraSelection::~VCameraSelection() = default;

std::shared_ptr<ICameraSelectionView> VCameraSelection::GetView()
{
    return view;
}

KVR::IMultiCallback<void()>&
VCameraSelection::GetSelectionChangedCallback(const std::vector<std::int32_t>& filter)
{
    return MeansCameras(filter) ? view->Changed : view->NeverChanged;
}

const std::vector<std::int32_t>& VCameraSelection::CameraFilter()
{
    static const std::vector<std::int32_t> filter = {cameras};
    return filter;
}

} // namespace QuorixHost
