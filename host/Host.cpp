#include "Host.h"

#include "ControlSystem.h"
#include "MainThreadPostalService.h"
#include "QuorixDataStore/DataStore.h"
#include "cameras/CameraHardware.h"
#include "cameras/CameraSelection.h"
#include "cameras/SimulatedCameras.h"
#include "notification/MakeShared.h"

namespace QuorixHost {
namespace {

// How long a camera's electronics take over a setting, in milliseconds.
constexpr std::uint32_t hardwareDelay = 20;

VCameraServices MakeCameraServices(std::uint32_t cameraCount)
{
    VCameraServices services;
    services.store = std::make_shared<VDataStore>();
    services.hardware = KVR::MakeShared<VCameraHardware>(services.store, hardwareDelay);
    services.cameras = std::make_shared<VSimulatedCameras>(services.store, services.hardware);
    services.selection = std::make_shared<VCameraSelection>();
    for (std::uint32_t number = 1; number <= cameraCount; ++number) {
        services.cameras->AddCamera(number);
    }
    return services;
}

} // namespace

VHost::VHost(std::uint32_t cameraCount)
    : cameras(MakeCameraServices(cameraCount)),
      controlSystem(std::make_shared<VControlSystem>()),
      postalService(std::make_shared<VMainThreadPostalService>())
{
}

VHost::~VHost()
{
    Close();
}

std::shared_ptr<IDataStore> VHost::GetStore()
{
    return cameras.store;
}

std::shared_ptr<ICameraSettingsSource> VHost::GetCameraSettingsSource()
{
    return cameras.cameras;
}

std::shared_ptr<KVR::IPostalService> VHost::GetPostalService()
{
    return postalService;
}

std::shared_ptr<ICameraSelectionSource> VHost::GetCameraSelectionSource()
{
    return cameras.selection;
}

std::shared_ptr<IControlSystem> VHost::GetControlSystem()
{
    return controlSystem;
}

void VHost::Close()
{
    cameras.hardware->Stop();
    postalService->Close();
}

} // namespace QuorixHost
