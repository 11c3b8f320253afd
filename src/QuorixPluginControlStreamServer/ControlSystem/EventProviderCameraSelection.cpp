#include "QuorixPluginControlStreamServer/ControlSystem/EventProviderCameraSelection.h"

#include "QuorixPluginControlStreamServer/ControlSystem/CameraNames.h"
#include "QuorixPluginInterface/ICameraSelectionSource.h"
#include "QuorixPluginInterface/ICameraSelectionView.h"
#include "notification/WeakBinding.h"

#include <boost/bind/bind.hpp>

#include <utility>

namespace {

constexpr wchar_t selectionChanged[] = L"Event.Cameras.SelectionChanged";

} // namespace

VEventProviderCameraSelection::VEventProviderCameraSelection(
    IControlSystem* dispatcher, std::shared_ptr<ICameraSelectionSource> cameraSelection)
    : VEventProvider(dispatcher), selectionSource(std::move(cameraSelection))
{
}

void VEventProviderCameraSelection::GetEventNames(std::vector<std::wstring>& names)
{
    names.emplace_back(selectionChanged);
}

void VEventProviderCameraSelection::OnCreated()
{
    if (!selectionSource) {
        return;
    }
    const std::weak_ptr<VEventProviderCameraSelection> self =
        std::static_pointer_cast<VEventProviderCameraSelection>(shared_from_this());
    selectionSource->GetSelectionChangedCallback(CameraNames::SelectionFilter())
        .Add(boost::bind(&VEventProviderCameraSelection::OnSelectionChanged,
                         boost::bind(&KVR::LockOrDeregister<VEventProviderCameraSelection>, self)));
}

void VEventProviderCameraSelection::OnSelectionChanged()
{
    const std::shared_ptr<ICameraSelectionView> view = selectionSource->GetView();
    if (!view) {
        return;
    }
    std::vector<VSelectionEntry> entries;
    view->GetSelection(CameraNames::SelectionFilter(), entries);
    // Deliberate: a device is not told when the last camera is deselected. Devices keep showing the
    // last selection until the next one.
    if (entries.empty()) {
        return;
    }

    ControlSystem::IParameters parameters;
    parameters.Set(L"SelectedCameraIds", CameraNames::SelectionText(entries));
    Publish(selectionChanged, parameters);
}
