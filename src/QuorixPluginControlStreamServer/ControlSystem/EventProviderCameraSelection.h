#pragma once

#include "QuorixPluginControlStreamServer/ControlSystem/EventProvider.h"
#include "notification/Shared.h"

#include <memory>
#include <string>
#include <vector>

class ICameraSelectionSource;

/// Turns each change of the camera selection into one event.
///
/// Made by KVR::MakeShared, which also subscribes it.
///
/// Owns: a shared reference to the source, which may be empty.
/// Threads: events are published on the thread that delivers a change.
class VEventProviderCameraSelection : public VEventProvider, public KVR::VShared
{
public:
    VEventProviderCameraSelection(IControlSystem* dispatcher,
                                  std::shared_ptr<ICameraSelectionSource> cameraSelection);

    void GetEventNames(std::vector<std::wstring>& names) override;

    void OnCreated() override;

private:
    void OnSelectionChanged();

    const std::shared_ptr<ICameraSelectionSource> selectionSource;
};
